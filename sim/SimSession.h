#pragma once

#include <map>

#include "SimErrorQueue.h"
#include "support/Dstring.h"

// What the command processor keeps per connection: the queue of errors that name no known
// handle, and the faults test control has armed for it.
class SimSession {
 public:
  SimErrorQueue& Errors() { return mErrors; }

  void ArmDelay(int ms, int count) {
    mDelayMs = ms;
    mDelayCount = count;
  }
  // The delay of the next reply, counting it off.
  int TakeDelay() {
    if (mDelayCount == 0) return 0;
    --mDelayCount;
    return mDelayMs;
  }

  void ArmMalformed(const Dstring& header, const Dstring& text) { mMalformed[header] = text; }
  // The armed replacement for a reply to `header`, used up; false when there is none.
  bool TakeMalformed(const Dstring& header, Dstring& text) {
    auto it = mMalformed.find(header);
    if (it == mMalformed.end()) return false;
    text = it->second;
    mMalformed.erase(it);
    return true;
  }

 private:
  SimErrorQueue mErrors;
  int mDelayMs = 0;
  int mDelayCount = 0;
  std::map<Dstring, Dstring> mMalformed;
};
