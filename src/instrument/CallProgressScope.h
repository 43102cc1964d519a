#pragma once

#include "instrument/CallProgress.h"
#include "instrument/QenGuiInst.h"

// Lets `progress` follow the calls on the application's connection while the scope lives.
class CallProgressScope {
 public:
  explicit CallProgressScope(CallProgress* progress) : mInstrument(QenGuiInst::GetInstrument()) {
    if (mInstrument) mInstrument->SetCallProgress(progress);
  }
  ~CallProgressScope() {
    // A connection made anew meanwhile never knew the follower.
    if (mInstrument && mInstrument == QenGuiInst::GetInstrument()) mInstrument->SetCallProgress(nullptr);
  }
  CallProgressScope(const CallProgressScope&) = delete;
  CallProgressScope& operator=(const CallProgressScope&) = delete;

 private:
  QenInstrument* mInstrument;
};
