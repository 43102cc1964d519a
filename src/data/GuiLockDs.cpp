#include "data/GuiLockDs.h"

int GuiLockDs::Set(bool locked, ConditionList& list) {
  if (mLocked == locked) return 0;
  mLocked = locked;
  return Update(list, 0);
}
