#include "HostConnection.h"

#include <memory>

#include "core/uiapp.h"
#include "instrument/AppHandle.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "instrument/QenTcpInstrument.h"
#include "support/ConditionListLoader.h"

namespace {

// A server answers the handle request at once; anything slower is not one.
constexpr int kHandshakeMs = 2500;

// Until the handle is made, a peer that hangs up is not a server that died: it never was one.
class HandshakeScope {
 public:
  explicit HandshakeScope(QenTcpInstrument& instrument) : mInstrument(instrument) {
    mInstrument.SetReplyTimeoutMs(kHandshakeMs);
    mDeath = QenGuiInst::SetServerDeathHandler([](const Dstring&) {});
  }
  ~HandshakeScope() {
    mInstrument.SetReplyTimeoutMs(QenInstrument::GetDefaultReplyTimeoutMs());
    QenGuiInst::SetServerDeathHandler(std::move(mDeath));
  }
  HandshakeScope(const HandshakeScope&) = delete;
  HandshakeScope& operator=(const HandshakeScope&) = delete;

 private:
  QenTcpInstrument& mInstrument;
  QenGuiInst::ServerDeathHandler mDeath;
};

bool SpokeOtherProtocol(int status) {
  return status == QenStatus::kTimeOut || status == QenStatus::kProtocolError ||
         status == QenStatus::kServerTerminated || status == QenStatus::kFrameTooLarge;
}

}  // namespace

int HostConnection::Open(const std::string& host, unsigned short port, const std::string& resource, ConditionList& list) {
  const Dstring address(host + ":" + std::to_string(port));
  auto owned = std::make_unique<QenTcpInstrument>();
  QenTcpInstrument& instrument = *owned;
  if (int status = instrument.Connect(Dstring(host), port); status != QenStatus::kOk) {
    if (instrument.GetConnectFailure() == QenTcpInstrument::ConnectFailure::UnknownHost) {
      ConditionListLoader::ConditionToken(list, "GUI_INSTRUMENT_UNKNOWN_HOST", {Dstring(host)}, status);
    } else {
      ConditionListLoader::ConditionToken(list, "GUI_INSTRUMENT_CONNECT_FAILED", {address}, status);
    }
    return status;
  }
  QenGuiInst::SetInstrument(std::move(owned));
  uiapp::SetCurrentResource(Dstring(resource));
  Dstring handle = AppHandle::MakeFromResourceName(Dstring(resource));
  ConditionList handshake;
  int status = QenStatus::kOk;
  {
    const HandshakeScope scope(instrument);
    status = AppHandle::Create(&instrument, handle, Dstring(resource), handshake);
  }
  if (SpokeOtherProtocol(status)) {
    QenGuiInst::SetInstrument(nullptr);
    ConditionListLoader::ConditionToken(list, "GUI_INSTRUMENT_NOT_A_SERVER",
                                        {address, Dstring(std::to_string(QenTcpInstrument::kDefaultPort))}, status);
    return status;
  }
  list.Append(handshake);
  if (status != QenStatus::kOk) return status;
  QenGuiInst::SetAppHandle(handle);
  return QenStatus::kOk;
}
