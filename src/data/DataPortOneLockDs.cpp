#include "data/DataPortOneLockDs.h"

#include "instrument/QenGuiInst.h"
#include "support/ConditionListLoader.h"
#include "support/FWBlocker.h"

namespace {

constexpr const char* kLockableModels[] = {"\"K2268A\"", "\"K2268B\"", "\"K2269A\"", "\"K2269B\""};

bool IsLockable(const Dstring& model) {
  for (const char* m : kLockableModels) {
    if (model == m) return true;
  }
  return false;
}

DataPortOneLockEnum FromReply(const Dstring& word) {
  if (word == "FREE") return kDataPortFree;
  if (word == "DMUX") return kDataPortDemux;
  return kDataPortUnknown;
}

}  // namespace

int DataPortOneLockDs::Search(const Dstring& cmd, unsigned long& number, ConditionList& list) {
  Dstring reply;
  if (int status = QenGuiInst::Call(cmd, reply, list)) return status;
  if (!reply.ToULong(number)) {
    ConditionListLoader::ConditionToken(list, "GUI_STATE_BAD_REPLY", {cmd, reply}, 1);
    return 1;
  }
  return 0;
}

int DataPortOneLockDs::UpdateFromFW(ConditionList& list) {
  FWBlocker guard("DataPortOneLockDs::UpdateFromFW", list);
  if (int status = guard.Block()) return status;
  const Dstring appHandle = QenGuiInst::GetAppHandle();
  const char* handle = appHandle.c_str();
  unsigned long group = 0;
  unsigned long module = 0;
  if (int status = Search(Dstring::Format(":SR:%s:CGR@:MOD1:CONN1:PULS:DEL", handle), group, list)) return status;
  if (int status = Search(Dstring::Format(":SR:%s:CGR%lu:MOD@:CONN1:PULS:DEL", handle, group), module, list)) {
    return status;
  }
  Dstring model;
  if (int status = QenGuiInst::Call(Dstring::Format(":%s:CGR%lu:MOD%lu:TYPE?", handle, group, module), model, list)) {
    return status;
  }
  if (!IsLockable(model.Trimmed())) {
    mFoundCmdPath.clear();
    SetSetting("");
    return Change(mState, kDataPortNotLockable, list);
  }
  mFoundCmdPath = Dstring::Format(":CGR%lu:MOD%lu:UCAS", group, module);
  SetSetting(mFoundCmdPath);
  Dstring word;
  if (int status = QenGuiInst::Call(Dstring::Format(":%s:CGR%lu:MOD%lu:UCAS?", handle, group, module), word, list)) {
    return status;
  }
  return Change(mState, FromReply(word.Trimmed()), list);
}
