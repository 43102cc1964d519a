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

  // The next `count` replies to `header` become `text`; a count of 0 keeps it for every reply
  // until the header is armed again.
  void ArmMalformed(const Dstring& header, const Dstring& text, int count) { mMalformed[header] = {text, count}; }
  // The armed replacement for a reply to `header`, counted off; false when there is none.
  bool TakeMalformed(const Dstring& header, Dstring& text) {
    auto it = mMalformed.find(header);
    if (it == mMalformed.end()) return false;
    text = it->second.text;
    if (it->second.count != 0 && --it->second.count == 0) mMalformed.erase(it);
    return true;
  }

 private:
  SimErrorQueue mErrors;
  int mDelayMs = 0;
  int mDelayCount = 0;
  struct Replacement {
    Dstring text;
    int count;
  };
  std::map<Dstring, Replacement> mMalformed;
};
