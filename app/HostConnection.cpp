#include "HostConnection.h"

#include <memory>

#include "core/uiapp.h"
#include "instrument/AppHandle.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "instrument/QenTcpInstrument.h"
#include "support/ConditionListLoader.h"

int HostConnection::Open(const std::string& host, unsigned short port, const std::string& resource, ConditionList& list) {
  auto instrument = std::make_unique<QenTcpInstrument>();
  if (int status = instrument->Connect(Dstring(host), port); status != QenStatus::kOk) {
    ConditionListLoader::ConditionToken(list, "GUI_INSTRUMENT_CONNECT_FAILED",
                                        {Dstring(host + ":" + std::to_string(port)), QenInstrument::GetErrMessage(status)},
                                        status);
    return status;
  }
  QenGuiInst::SetInstrument(std::move(instrument));
  uiapp::SetCurrentResource(Dstring(resource));
  Dstring handle = AppHandle::MakeFromResourceName(Dstring(resource));
  if (int status = AppHandle::Create(QenGuiInst::GetInstrument(), handle, Dstring(resource), list); status != QenStatus::kOk) {
    return status;
  }
  QenGuiInst::SetAppHandle(handle);
  return QenStatus::kOk;
}
