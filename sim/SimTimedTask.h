#pragma once

#include <cstddef>

#include "SimCommandModule.h"

// A task the instrument carries out over some seconds, item after item (the modules of a self
// test, the ports of a deskew), under one command stem (":SYST:TEST"):
//   "<stem>:STAR"   starts it (-200 while the task is going on, or when StartRefusal says so)
//   "<stem>:STAT?"  "IDLE|RUNN|DONE|ABOR",<items done>,<items>
//   "<stem>:ABOR"   stops it; what the items not yet done are is the task's
//   "<stem>:PACE MS" (test control) the time one item takes (0 … 60000; 0 ends a task at once)
// Other commands under the stem go to RunTaskCommand.
class SimTimedTask : public SimCommandModule {
 public:
  SimTimedTask(const char* stem, double secondsPerItem) : mStem(stem), mSecondsPerItem(secondsPerItem) {}

  bool RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) override;
  void Advance(SimContext& context) override;

 protected:
  // The error a start is refused with now, or 0; by default a task cannot start while the
  // instrument runs.
  virtual int StartRefusal(SimContext& context) const;
  // Sets the items up; their number.
  virtual std::size_t Begin(SimContext& context) = 0;
  virtual void ItemDone(std::size_t item, SimContext& context) = 0;
  virtual void Aborted(std::size_t done, SimContext& context) = 0;
  // `what` is the command after the stem ("RES"); false when unknown.
  virtual bool RunTaskCommand(const Dstring& what, const SimCommand& cmd, SimContext& context) = 0;

 private:
  enum class State { Idle, Running, Done, Aborted };
  static const char* Word(State state);

  const char* mStem;
  double mSecondsPerItem;
  State mState = State::Idle;
  std::size_t mItems = 0;
  std::size_t mDone = 0;
  long long mStartMs = 0;
};
