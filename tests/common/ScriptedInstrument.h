#pragma once

#include <deque>
#include <functional>

#include "instrument/QenInstrument.h"
#include "support/DstringList.h"

// An in-process instrument for unit tests: answers a script of expected commands in order
// (an unexpected command fails the test), or a handler when no step is left. Records every
// command it was sent.
class ScriptedInstrument : public QenInstrument {
 public:
  using Handler = std::function<int(const Dstring& cmd, Dstring& reply)>;

  void Expect(const Dstring& cmd, const Dstring& reply, int status = 0);
  void SetHandler(Handler handler) { mHandler = std::move(handler); }

  const DstringList& Sent() const { return mSent; }
  bool AllConsumed() const { return mSteps.empty(); }

  int Connect(const Dstring&, unsigned short) override;
  int Disconnect() override;
  bool IsConnected() const override { return mConnected; }
  int Call(const Dstring& cmd, Dstring& reply) override;

 private:
  struct Step {
    Dstring cmd;
    Dstring reply;
    int status;
  };
  std::deque<Step> mSteps;
  Handler mHandler;
  DstringList mSent;
  bool mConnected = true;
};
