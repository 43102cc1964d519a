#pragma once

#include "data/GlobalStateDs.h"

enum SysStateEnum : int { kSysProg = 0, kSysRunning = 1, kSysHalt = 2, kSysFinished = 3, kSysSab = 4, kSysSync = 5 };

// The system state ("<handle>:SGEN:GLOB:SYST:STAT?"). A reply outside the table leaves the
// value as it was.
class SystemStateDs : public GlobalStateDs {
 public:
  SystemStateDs() : GlobalStateDs(":SGEN:GLOB:SYST:STAT") {}

  int UpdateFromFW(ConditionList& list) override;
  SysStateEnum GetState() const { return mState; }
  // The value of a reply word; false for a word outside the table.
  static bool FromReply(const Dstring& word, SysStateEnum& state);

 private:
  SysStateEnum mState = kSysProg;
};
