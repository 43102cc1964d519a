#pragma once

#include <chrono>
#include <filesystem>
#include <memory>

#include "instrument/QenInstrument.h"
#include "instrument/QenSimProcess.h"
#include "support/DstringList.h"

// Counts the round trips that pass through it, and keeps their texts when asked.
class CountingInstrument : public QenInstrument {
 public:
  explicit CountingInstrument(std::unique_ptr<QenInstrument> inner) : mInner(std::move(inner)) {}
  int Connect(const Dstring& host, unsigned short port) override { return mInner->Connect(host, port); }
  int Disconnect() override { return mInner->Disconnect(); }
  bool IsConnected() const override { return mInner->IsConnected(); }
  void SetCallWaiter(CallWaiter* waiter) override { mInner->SetCallWaiter(waiter); }
  int Call(const Dstring& cmd, Dstring& reply) override {
    ++mCalls;
    if (mRecording) mRecorded.push_back(cmd);
    return mInner->Call(cmd, reply);
  }
  long mCalls = 0;
  bool mRecording = false;
  DstringList mRecorded;

 private:
  std::unique_ptr<QenInstrument> mInner;
};

// qensim with a configuration of kManyParams numeric parameters in volts, in groups of
// kGroupSize as the parameters of a port are (":BENCH:G<g>:P<i>"), a rack of kAnalyserPorts
// analyser ports and a data directory of its own for segments, and the application started
// against it through a counting connection. One per program: every benchmark that needs the
// instrument uses this one, so none replaces another's connection.
class ManyParamsRig {
 public:
  static constexpr int kManyParams = 1000;
  static constexpr int kGroupSize = 50;
  static constexpr int kAnalyserPorts = 64;

  static ManyParamsRig& Get();
  bool Ok() const;
  long Calls() const { return mCounter->mCalls; }
  CountingInstrument& Counter() { return *mCounter; }
  unsigned short Port() const { return mSim.Port(); }

 private:
  ManyParamsRig();
  ~ManyParamsRig();

  std::filesystem::path mDir;
  QenSimProcess mSim;
  CountingInstrument* mCounter = nullptr;
};

double Seconds(std::chrono::steady_clock::time_point since);
// The program header of parameter `i` under the application's handle.
Dstring Header(int i);
