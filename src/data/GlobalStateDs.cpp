#include "data/GlobalStateDs.h"

#include "instrument/QenGuiInst.h"

namespace {

Dstring Canonical(const Dstring& header) {
  return header.StartsWith(":") ? Dstring(header.substr(1)).ToUpper() : header.ToUpper();
}

}  // namespace

int GlobalStateDs::Match(const Dstring& name) {
  if (mSetting.empty()) return 0;
  const Dstring wanted = Canonical(mSetting);
  const Dstring given = Canonical(name);
  return given == wanted || given == Canonical(QenGuiInst::GetAppHandle() + mSetting);
}

int GlobalStateDs::Query(Dstring& reply, ConditionList& list) {
  int status = QenGuiInst::Call(QenGuiInst::GetAppHandle() + mSetting + "?", reply, list);
  reply = reply.Trimmed();
  return status;
}

int GlobalStateDs::Send(const char* word, ConditionList& list) {
  Dstring reply;
  return QenGuiInst::Call(QenGuiInst::GetAppHandle() + mSetting + " " + word, reply, list);
}
