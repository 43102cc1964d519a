#include "SimGlobalState.h"

#include <iterator>

namespace {

constexpr const char* kSystWords[] = {"PROG", "RUNN", "HALT", "FIN", "SAB", "SYNC"};
constexpr const char* kPllWords[] = {"LOCK", "UNKN", "UCDR", "UDAT"};

template <std::size_t N>
int WordIndex(const char* const (&words)[N], const Dstring& word) {
  for (std::size_t i = 0; i < N; ++i) {
    if (word == words[i]) return static_cast<int>(i);
  }
  return -1;
}

}  // namespace

std::vector<Dstring> SimGlobalState::Advance(long long nowMs) {
  std::vector<Dstring> changed;
  if (mSyncUntil >= 0 && nowMs >= mSyncUntil) {
    mSyncUntil = -1;
    SetSyst(Syst::Runn, changed);
  }
  if (mRelockUntil >= 0 && nowMs >= mRelockUntil) {
    mRelockUntil = -1;
    SetPll(Pll::Lock, changed);
  }
  return changed;
}

std::vector<Dstring> SimGlobalState::SetRunning(bool on, long long nowMs) {
  std::vector<Dstring> changed;
  if (on == mRunning) return changed;
  mRunning = on;
  changed.push_back(kContHeader);
  if (!on) {
    mSyncUntil = -1;
    SetSyst(Syst::Prog, changed);
    return changed;
  }
  std::vector<Dstring> more = ForceSequence(nowMs);
  changed.insert(changed.end(), more.begin(), more.end());
  return changed;
}

std::vector<Dstring> SimGlobalState::ForceSequence(long long nowMs) {
  std::vector<Dstring> changed;
  if (!mRunning) return changed;
  mSyncUntil = nowMs + kSyncMs;
  SetSyst(Syst::Sync, changed);
  std::vector<Dstring> more = ClockChanged(nowMs);
  changed.insert(changed.end(), more.begin(), more.end());
  return changed;
}

std::vector<Dstring> SimGlobalState::ClockChanged(long long nowMs) {
  std::vector<Dstring> changed;
  mRelockUntil = nowMs + kRelockMs;
  SetPll(Pll::Unkn, changed);
  return changed;
}

std::vector<Dstring> SimGlobalState::SetConnected(bool on) {
  if (on == mConnected) return {};
  mConnected = on;
  return {kConnHeader};
}

bool SimGlobalState::ForceWord(const Dstring& which, const Dstring& word, std::vector<Dstring>& changed) {
  if (which == "SYST" && WordIndex(kSystWords, word) >= 0) {
    mSyncUntil = -1;
    SetSyst(static_cast<Syst>(WordIndex(kSystWords, word)), changed);
    return true;
  }
  if (which == "PLL" && WordIndex(kPllWords, word) >= 0) {
    mRelockUntil = -1;
    SetPll(static_cast<Pll>(WordIndex(kPllWords, word)), changed);
    return true;
  }
  return false;
}

const char* SimGlobalState::GetSystemWord() const {
  return kSystWords[static_cast<int>(mSyst)];
}

const char* SimGlobalState::GetPllWord() const {
  return kPllWords[static_cast<int>(mPll)];
}

void SimGlobalState::SetSyst(Syst s, std::vector<Dstring>& changed) {
  if (s == mSyst) return;
  mSyst = s;
  changed.push_back(kSystHeader);
}

void SimGlobalState::SetPll(Pll p, std::vector<Dstring>& changed) {
  if (p == mPll) return;
  mPll = p;
  changed.push_back(kPllHeader);
}
