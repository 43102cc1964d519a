#include "data/SystemStateDs.h"

#include "support/FWBlocker.h"

namespace {

struct Word {
  const char* reply;
  SysStateEnum state;
};

constexpr Word kWords[] = {{"PROG", kSysProg}, {"RUNN", kSysRunning}, {"HALT", kSysHalt},
                           {"FIN", kSysFinished}, {"SAB", kSysSab},     {"SYNC", kSysSync}};

}  // namespace

bool SystemStateDs::FromReply(const Dstring& word, SysStateEnum& state) {
  for (const auto& w : kWords) {
    if (word == w.reply) {
      state = w.state;
      return true;
    }
  }
  return false;
}

int SystemStateDs::UpdateFromFW(ConditionList& list) {
  FWBlocker guard("SystemStateDs::UpdateFromFW", list);
  if (int status = guard.Block()) return status;
  Dstring reply;
  if (int status = Query(reply, list)) return status;
  SysStateEnum state = mState;
  if (!FromReply(reply, state)) return 0;
  return Change(mState, state, list);
}
