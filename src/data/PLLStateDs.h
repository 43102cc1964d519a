#pragma once

#include "data/GlobalStateDs.h"

// 2 and 3 are never produced by a reply.
enum PLLStateEnum : int { kPllLock = 0, kPllUnlocked = 1, kPllUnknown = 4, kPllUnlockedCdr = 5, kPllUnlockedData = 6 };

// The PLL lock state ("<handle>:SGEN:GLOB:PLL:STAT?"); any reply outside the table is 1.
class PLLStateDs : public GlobalStateDs {
 public:
  PLLStateDs() : GlobalStateDs(":SGEN:GLOB:PLL:STAT") {}

  int UpdateFromFW(ConditionList& list) override;
  PLLStateEnum GetState() const { return mState; }
  static PLLStateEnum FromReply(const Dstring& word);

 private:
  PLLStateEnum mState = kPllUnknown;
};
