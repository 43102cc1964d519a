#pragma once

#include "data/GlobalStateDs.h"

// What the module driving data port 1 reports of its lock: only the K2268A, K2268B, K2269A
// and K2269B have the setting; any other module gives kDataPortNotLockable.
enum DataPortOneLockEnum : int { kDataPortNotLockable = 0, kDataPortFree = 1, kDataPortDemux = 2, kDataPortUnknown = 3 };

// The lock state of data port 1. The module is found with the searching queries ("SR", "@"
// standing for the number searched), its model read, and for the lockable models its
// ":CGR<n>:MOD<m>:UCAS" setting read and followed.
class DataPortOneLockDs : public GlobalStateDs {
 public:
  DataPortOneLockDs() : GlobalStateDs("") {}

  int UpdateFromFW(ConditionList& list) override;
  DataPortOneLockEnum GetState() const { return mState; }
  // The header of the setting found, as ":CGR1:MOD1:UCAS"; empty before the first search.
  const Dstring& getFoundCmdPath() const { return mFoundCmdPath; }

 private:
  int Search(const Dstring& cmd, unsigned long& number, ConditionList& list);

  DataPortOneLockEnum mState = kDataPortNotLockable;
  Dstring mFoundCmdPath;
};
