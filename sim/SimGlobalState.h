#pragma once

#include <vector>

#include "support/Dstring.h"

// The instrument-wide run, system, PLL and connection states. Timed changes (the sync phase
// after a start, the PLL relock after a clock change) are worked out from the time passed in,
// whenever the state is looked at. Every operation returns the headers whose state changed.
class SimGlobalState {
 public:
  static constexpr long long kSyncMs = 500;
  static constexpr long long kRelockMs = 300;

  static constexpr const char* kContHeader = ":SGEN:GLOB:INIT:CONT";
  static constexpr const char* kSystHeader = ":SGEN:GLOB:SYST:STAT";
  static constexpr const char* kPllHeader = ":SGEN:GLOB:PLL:STAT";
  static constexpr const char* kConnHeader = ":SGEN:GLOB:CONN";

  // The timed changes that are due at `nowMs`.
  std::vector<Dstring> Advance(long long nowMs);
  std::vector<Dstring> SetRunning(bool on, long long nowMs);
  // Forcing the sequence restarts a running instrument: it synchronises again.
  std::vector<Dstring> ForceSequence(long long nowMs);
  std::vector<Dstring> ClockChanged(long long nowMs);
  std::vector<Dstring> SetConnected(bool on);
  // Sets a state word from outside ("SYST" or "PLL"); false when either word is unknown.
  bool ForceWord(const Dstring& which, const Dstring& word, std::vector<Dstring>& changed);

  bool IsRunning() const { return mRunning; }
  bool IsConnected() const { return mConnected; }
  const char* GetSystemWord() const;
  const char* GetPllWord() const;

 private:
  enum class Syst { Prog, Runn, Halt, Fin, Sab, Sync };
  enum class Pll { Lock, Unkn, Ucdr, Udat };

  void SetSyst(Syst s, std::vector<Dstring>& changed);
  void SetPll(Pll p, std::vector<Dstring>& changed);

  bool mRunning = false;
  bool mConnected = false;
  Syst mSyst = Syst::Prog;
  Pll mPll = Pll::Lock;
  long long mSyncUntil = -1;    // when SYNC becomes RUNN; -1 when nothing is due
  long long mRelockUntil = -1;  // when UNKN becomes LOCK
};
