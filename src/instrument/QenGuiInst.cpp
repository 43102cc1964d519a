#include "instrument/QenGuiInst.h"

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <optional>
#include <utility>
#include <vector>

#include "instrument/QenStatus.h"
#include "support/Condition.h"
#include "support/FWBlocker.h"
#include "support/LgsDebug.h"
#include "support/QenEnvironment.h"
#include "toolkit/Toolkit.h"

std::unique_ptr<QenInstrument> QenGuiInst::mInstrument;
Dstring QenGuiInst::mAppHandle;
std::FILE* QenGuiInst::errorlog = nullptr;
bool QenGuiInst::mLocked = false;
CallWaiter* QenGuiInst::mWaiter = nullptr;
int QenGuiInst::mWaitDepth = 0;

namespace {

struct HeldProc {
  QenGuiInst::Proc proc;
  void* client;
  bool operator==(const HeldProc&) const = default;
};

std::vector<HeldProc>& HeldProcs() {
  static std::vector<HeldProc> held;
  return held;
}

// A call on the application's connection while events run: the waiter is told when it ends,
// and what was held off meanwhile runs after the outermost wait.
class WaitedCall {
 public:
  WaitedCall(QenInstrument* instrument, CallWaiter* waiter, int& depth)
      : mInstrument(instrument), mWaiter(waiter), mDepth(depth) {
    ++mDepth;
    mInstrument->SetCallWaiter(mWaiter);
  }
  ~WaitedCall() {
    // The connection may have been replaced while events ran.
    if (mInstrument == QenGuiInst::GetInstrument()) mInstrument->SetCallWaiter(nullptr);
    --mDepth;
    mWaiter->WaitEnded();
    for (const HeldProc& held : std::exchange(HeldProcs(), {})) Toolkit::Get().CallDeferred(held.proc, held.client);
  }
  WaitedCall(const WaitedCall&) = delete;
  WaitedCall& operator=(const WaitedCall&) = delete;

 private:
  QenInstrument* mInstrument;
  CallWaiter* mWaiter;
  int& mDepth;
  FWBlocker::WaitScope mScope;
};

// A server that keeps answering with errors must not keep the caller here for ever.
constexpr int kMaxErrorReads = 256;

QenGuiInst::ErrorListenerProc& ErrorListener() {
  static QenGuiInst::ErrorListenerProc listener;
  return listener;
}

QenGuiInst::RefusalDescriber& Describer() {
  static QenGuiInst::RefusalDescriber describer;
  return describer;
}

QenGuiInst::BeforeExitProc& BeforeExit() {
  static QenGuiInst::BeforeExitProc proc;
  return proc;
}

QenGuiInst::ServerDeathHandler& DeathHandler() {
  static QenGuiInst::ServerDeathHandler handler = [](const Dstring& message) {
    Toolkit::Get().Alert(message, ToolkitPort::Icon::Critical);
    QenGuiInst::RunBeforeServerDeathExit();
    std::exit(0);
  };
  return handler;
}

class GuiInstLockProbe : public FWBlocker::LockProbe {
 public:
  bool IsInstrumentLocked() override { return QenGuiInst::IsInstrumentLocked(); }
};

GuiInstLockProbe gLockProbe;

// The leading signed decimal integer of an error-queue entry; false when there is none.
bool LeadingCode(const Dstring& text, long& code) {
  const char* begin = text.c_str();
  char* end = nullptr;
  code = std::strtol(begin, &end, 10);
  return end != begin;
}

}  // namespace

void QenGuiInst::Init() {
  mInstrument.reset();
  mAppHandle.clear();
  mLocked = false;
  FWBlocker::SetLockProbe(&gLockProbe);
  Dstring path = QenEnvironment::GetLogDirectory() + "/qengui.log";
  errorlog = std::fopen(path.c_str(), "w");
  if (!errorlog) std::fprintf(stderr, "Unable to create logfile\n");
}

void QenGuiInst::End() {
  FWBlocker::SetLockProbe(nullptr);
  if (errorlog) std::fclose(errorlog);
  errorlog = nullptr;
  mInstrument.reset();
  mAppHandle.clear();
}

void QenGuiInst::SetInstrument(std::unique_ptr<QenInstrument> instrument) {
  if (mInstrument) mInstrument->Disconnect();
  mInstrument = std::move(instrument);
}

void QenGuiInst::SetCallWaiter(CallWaiter* waiter) { mWaiter = waiter; }

void QenGuiInst::RunAfterWait(Proc proc, void* client) {
  if (mWaitDepth == 0) {
    Toolkit::Get().CallDeferred(proc, client);
    return;
  }
  const HeldProc held{proc, client};
  auto& procs = HeldProcs();
  if (std::find(procs.begin(), procs.end(), held) == procs.end()) procs.push_back(held);
}

int QenGuiInst::IsConnectedToServer() { return mInstrument ? 1 : 0; }

int QenGuiInst::DisconnectFromServer(ConditionList&) {
  if (!mInstrument) return QenStatus::kOk;
  // The waiting call still runs inside the connection: close it, and let the call end.
  if (mWaitDepth > 0) return mInstrument->Disconnect();
  int status = mInstrument->Disconnect();
  mInstrument.reset();
  return status;
}

Dstring QenGuiInst::GetHandleFromCommand(const Dstring& cmd) {
  std::string_view rest(cmd);
  if (rest.starts_with(':')) rest.remove_prefix(1);
  auto colon = rest.find(':');
  Dstring first = Dstring(rest.substr(0, colon)).ToUpper();
  if (first != "L" && first != "VC" && first != "RC" && first != "SR") return first;
  if (colon == std::string_view::npos) return {};
  rest.remove_prefix(colon + 1);
  return Dstring(rest.substr(0, rest.find(':')));
}

int QenGuiInst::Call(const Dstring& cmd, Dstring& reply, ConditionList& list) {
  return Call(mInstrument.get(), cmd, reply, list);
}

int QenGuiInst::Call(QenInstrument* instrument, const Dstring& cmd, Dstring& reply, ConditionList& list) {
  LgsDebug trace("QenGuiInst::Call ", "qenguiinst,traffic");
  if (trace.IsOn()) {
    std::time_t now = std::time(nullptr);
    char stamp[32];
    std::strftime(stamp, sizeof stamp, "%H:%M:%S", std::localtime(&now));
    trace.Printf("%s\nCommand : %s\n", stamp, cmd.c_str());
  }
  std::optional<WaitedCall> waited;
  if (instrument && mWaiter && instrument == mInstrument.get() && mWaitDepth == 0) {
    waited.emplace(instrument, mWaiter, mWaitDepth);
  }
  int status = instrument ? instrument->Call(cmd, reply) : QenStatus::kNotConnected;
  if (instrument == mInstrument.get() && (status == QenStatus::kLocked || status >= QenStatus::kOk)) {
    mLocked = status == QenStatus::kLocked;
  }
  trace.Printf("Response: %s\n", reply.c_str());
  trace.Printf("Error   : %i\n\n", status);
  if (status == QenStatus::kServerTerminated) {
    trace.Printf("Error   : Server has terminated. Shutdown.\n");
    Log("Server has terminated. Shutdown.\n");
    DeathHandler()(kServerDeathMessage);
    return status;
  }
  if (status != QenStatus::kOk && status != QenStatus::kLocked) {
    ConditionList errors;
    GetErrors(instrument, GetHandleFromCommand(cmd), status, errors);
    for (Condition condition : errors) {
      condition.SetCommand(cmd);
      if (ErrorListener()) ErrorListener()(cmd, condition);
      list.Add(condition);
    }
  }
  return status;
}

namespace {

void AddEntry(const Dstring& text, ConditionList& list) {
  Condition condition;
  if (QenGuiInst::ParseErrorMsg(text, condition) == 0) {
    list.Add(condition);
  } else {
    list.Add(0, text);
    list.Add(0, "Unable to parse error message");
  }
}

}  // namespace

void QenGuiInst::GetErrors(QenInstrument* instrument, const Dstring& handle, int& status, ConditionList& list) {
  LgsDebug trace("QenGuiInst::GetErrors ", "qenguiinst,traffic");
  if (status < 0 || !instrument) {
    Dstring message = QenInstrument::GetErrMessage(instrument ? status : QenStatus::kNotConnected);
    trace.Printf("Error   : %s\n", message.c_str());
    AddEntry(message, list);
    return;
  }
  const Dstring query = Dstring::Format(":%s:SYST:ERR?", handle.c_str());
  for (int reads = 0; reads < kMaxErrorReads; ++reads) {
    Dstring reply;
    int queryStatus = instrument->Call(query, reply);
    if (queryStatus == QenStatus::kLocked) {
      trace.Printf("Error   : Locked\n");
      Log("Locked\n");
      status = QenStatus::kLocked;
      return;
    }
    if (queryStatus != QenStatus::kOk) {
      AddEntry(QenInstrument::GetErrMessage(QenStatus::kCommError), list);
      return;
    }
    long code = 0;
    if (LeadingCode(reply, code) && code == 0) return;
    trace.Printf("Error   : %s\n", reply.c_str());
    Log(reply + "\n");
    AddEntry(reply, list);
  }
}

int QenGuiInst::ClearErrorQueue(QenInstrument* instrument, const Dstring& handle) {
  if (!instrument) return QenStatus::kNotConnected;
  const Dstring query = Dstring::Format(":%s:SYST:ERR?", handle.c_str());
  int status = QenStatus::kOk;
  for (int reads = 0; reads < kMaxErrorReads; ++reads) {
    Dstring reply;
    status = instrument->Call(query, reply);
    long code = 0;
    if (status != QenStatus::kOk || (LeadingCode(reply, code) && code == 0)) break;
  }
  return status;
}

int QenGuiInst::ParseErrorMsg(const Dstring& text, long& code, long& position, Dstring& message) {
  std::size_t i = text.find_first_not_of(" \t");
  if (i == Dstring::npos) return 1;
  std::size_t digits = i + ((text[i] == '-' || text[i] == '+') ? 1 : 0);
  std::size_t end = digits;
  while (end < text.size() && std::isdigit(static_cast<unsigned char>(text[end]))) ++end;
  if (end == digits || end - digits > 9) return 1;
  std::size_t quote = text.find_first_not_of(" \t", end + 1);
  if (end >= text.size() || text[end] != ',' || quote == Dstring::npos || text[quote] != '"') return 1;
  Dstring body;
  std::size_t k = quote + 1;
  for (;; ++k) {
    if (k >= text.size()) return 1;
    if (text[k] != '"') {
      body += text[k];
    } else if (k + 1 < text.size() && text[k + 1] == '"') {
      body += '"';
      ++k;
    } else {
      break;
    }
  }
  if (text.find_first_not_of(" \t\r\n", k + 1) != Dstring::npos) return 1;
  code = std::strtol(text.c_str() + i, nullptr, 10);
  position = static_cast<long>(quote + 1);
  message = std::move(body);
  return 0;
}

int QenGuiInst::ParseErrorMsg(const Dstring& text, Condition& condition) {
  long code = 0;
  long position = 0;
  Dstring message;
  if (ParseErrorMsg(text, code, position, message) != 0) return 1;
  condition = Condition(code, message);
  return 0;
}

void QenGuiInst::FormatErrorStr(Dstring& message, int code) {
  message = message.Trimmed();
  if (message.empty()) message = Dstring::Format("Error %d", code);
  if (!message.EndsWith(".") && !message.EndsWith("!") && !message.EndsWith("?")) message += '.';
}

bool QenGuiInst::IsInstrumentLocked() {
  if (!mLocked || !mInstrument) return false;
  Dstring reply;
  int status = mInstrument->Call(Dstring::Format("%s:SGEN:GLOB:INIT:CONT?", mAppHandle.c_str()), reply);
  if (status != QenStatus::kLocked) mLocked = false;
  return mLocked;
}

Dstring QenGuiInst::ErrorDlgText(const ConditionList& list) {
  Dstring text;
  Dstring described;
  for (const auto& condition : list) {
    Dstring message = condition.GetMessage();
    FormatErrorStr(message, static_cast<int>(condition.GetCode()));
    if (!text.empty()) text += "\n----------\n";
    // A command that brought several errors is described once, before the first.
    if (Describer() && !condition.GetCommand().empty() && condition.GetCommand() != described) {
      described = condition.GetCommand();
      if (const Dstring what = Describer()(condition); !what.empty()) text += what + "\n\n";
    }
    text.AppendPrintf("ERROR %li\n\n%s", condition.GetCode(), message.c_str());
  }
  return text;
}

void QenGuiInst::SetRefusalDescriber(RefusalDescriber describer) { Describer() = std::move(describer); }

int QenGuiInst::ShowErrorDlg(ConditionList& list, int) {
  if (list.IsEmpty()) return 0;
  Toolkit::Get().Alert(ErrorDlgText(list), ToolkitPort::Icon::Critical);
  return 0;
}

QenGuiInst::ServerDeathHandler QenGuiInst::SetServerDeathHandler(ServerDeathHandler handler) {
  return std::exchange(DeathHandler(), std::move(handler));
}

void QenGuiInst::SetBeforeServerDeathExit(BeforeExitProc proc) {
  BeforeExit() = std::move(proc);
}

void QenGuiInst::RunBeforeServerDeathExit() {
  if (BeforeExit()) BeforeExit()();
}

void QenGuiInst::SetErrorListener(ErrorListenerProc listener) { ErrorListener() = std::move(listener); }

void QenGuiInst::Log(const Dstring& text) {
  if (!errorlog) return;
  std::fputs(text.c_str(), errorlog);
  std::fflush(errorlog);
}
