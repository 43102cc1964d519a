#pragma once

#include "support/Dstring.h"

// Runs while a call waits for its reply, every few milliseconds, so that the host can let its
// own events run instead of freezing. `waitedMs` is how long `cmd` has been waiting. Returning
// true abandons the call: the connection is closed and the call ends with kAbandoned.
class CallWaiter {
 public:
  virtual ~CallWaiter() = default;
  virtual bool Wait(const Dstring& cmd, long long waitedMs) = 0;
  // The call that was waited for has its answer, or has failed.
  virtual void WaitEnded() {}
};
