#include "instrument/AppHandle.h"

#include <cctype>

#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"

Dstring AppHandle::MakeFromResourceName(const Dstring& resource) {
  Dstring handle = "_" + resource;
  const std::size_t n = handle.size();
  const bool endsInDigit = n > 0 && std::isdigit(static_cast<unsigned char>(handle[n - 1]));
  if (n > 12) handle.resize(12);
  if (endsInDigit) {
    if (n == 12) handle.resize(11);
    handle += 'X';
  }
  return handle;
}

int AppHandle::Create(QenInstrument* instrument, Dstring& handle, const Dstring& resource, ConditionList& list) {
  if (int status = CommandText::CheckArgument(handle + resource, list); status != QenStatus::kOk) return status;
  Dstring reply;
  const Dstring cmd = Dstring::Format(":QEN:INST:HAND:CRE? %s,\"PSX\",\"%s\"", handle.c_str(), resource.c_str());
  int status = QenGuiInst::Call(instrument, cmd, reply, list);
  if (status == QenStatus::kOk) handle = reply.Trimmed();
  return status;
}

int AppHandle::Destroy(QenInstrument* instrument, const Dstring& handle, ConditionList& list) {
  Dstring reply;
  return QenGuiInst::Call(instrument, Dstring::Format(":QEN:INST:HAND:DEST %s", handle.c_str()), reply, list);
}
