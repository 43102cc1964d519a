#pragma once

#include "data/QenDs.h"

// Whether another client holds the instrument, as the poll last found it. Lock and UnLock
// tell the views when the state changes, so that windows can disable and enable themselves.
class GuiLockDs : public QenDs {
 public:
  int Lock(ConditionList& list) { return Set(true, list); }
  int UnLock(ConditionList& list) { return Set(false, list); }
  bool IsLocked() const { return mLocked; }

 private:
  int Set(bool locked, ConditionList& list);

  bool mLocked = false;
};
