#include "data/PLLStateDs.h"

#include "support/FWBlocker.h"

namespace {

struct Word {
  const char* reply;
  PLLStateEnum state;
};

constexpr Word kWords[] = {{"LOCK", kPllLock}, {"UNKN", kPllUnknown}, {"UCDR", kPllUnlockedCdr}, {"UDAT", kPllUnlockedData}};

}  // namespace

PLLStateEnum PLLStateDs::FromReply(const Dstring& word) {
  for (const auto& w : kWords) {
    if (word == w.reply) return w.state;
  }
  return kPllUnlocked;
}

int PLLStateDs::UpdateFromFW(ConditionList& list) {
  FWBlocker guard("PLLStateDs::UpdateFromFW", list);
  if (int status = guard.Block()) return status;
  Dstring reply;
  if (int status = Query(reply, list)) return status;
  return Change(mState, FromReply(reply), list);
}
