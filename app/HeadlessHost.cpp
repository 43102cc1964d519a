#include "HeadlessHost.h"

#include <algorithm>
#include <atomic>
#include <chrono>
#include <ctime>
#include <iostream>
#include <functional>
#include <ostream>

#include "core/uiapp.h"
#include "data/BerSvr.h"
#include "data/ConnectDs.h"
#include "data/DataPortOneLockDs.h"
#include "data/DirtyFlagDs.h"
#include "data/Dte.h"
#include "data/GuiLockDs.h"
#include "data/PLLStateDs.h"
#include "data/QenParamDs.h"
#include "data/RunStopDs.h"
#include "data/SystemStateDs.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "support/MeasTimer.h"
#include "toolkit/HeadlessToolkit.h"

namespace {

std::atomic<bool> gStopRequested{false};

const char* SystemWord(SysStateEnum s) {
  static const char* const kWords[] = {"PROG", "RUNN", "HALT", "FIN", "SAB", "SYNC"};
  return s >= 0 && s <= 5 ? kWords[s] : "?";
}

const char* PllWord(PLLStateEnum s) {
  switch (s) {
    case kPllLock: return "LOCK";
    case kPllUnknown: return "UNKN";
    case kPllUnlockedCdr: return "UCDR";
    case kPllUnlockedData: return "UDAT";
    default: return "UNLOCKED";
  }
}

const char* PortLockWord(DataPortOneLockEnum s) {
  static const char* const kWords[] = {"not lockable", "FREE", "DMUX", "unknown"};
  return s >= 0 && s <= 3 ? kWords[s] : "?";
}

// The wall clock in UTC to the millisecond, as 2026-01-31T12:00:00.250Z.
Dstring Timestamp() {
  const auto now = std::chrono::system_clock::now();
  const std::time_t seconds = std::chrono::system_clock::to_time_t(now);
  const auto ms = std::chrono::duration_cast<std::chrono::milliseconds>(now.time_since_epoch()).count() % 1000;
  std::tm utc{};
  gmtime_r(&seconds, &utc);
  char text[32];
  std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%S", &utc);
  return Dstring::Format("%s.%03dZ", text, static_cast<int>(ms));
}

}  // namespace

// One line per change: a view that prints what its text function makes of the source, and
// only when that text differs from the last one printed.
class HeadlessHost::Printer : public QenDsView {
 public:
  Printer(std::ostream& out, std::function<Dstring(QenDs*, ConditionList&)> text) : mOut(out), mText(std::move(text)) {}
  int NfyViewDataUpdated(QenDs* source, ConditionList& list) override {
    Dstring text = mText(source, list);
    if (!text.empty() && text != mLast) {
      const Dstring stamp = Timestamp();
      for (std::size_t begin = 0, end = 0; begin <= text.size(); begin = end + 1) {
        end = std::min(text.find('\n', begin), text.size());
        mOut << stamp << ' ' << text.substr(begin, end - begin) << '\n';
      }
      mOut << std::flush;
    }
    mLast = text;
    return 0;
  }

 private:
  std::ostream& mOut;
  std::function<Dstring(QenDs*, ConditionList&)> mText;
  Dstring mLast;
};

HeadlessHost::HeadlessHost(std::ostream& out, HeadlessToolkit& toolkit, DstringList watch, double seconds)
    : mOut(out), mToolkit(toolkit), mWatch(std::move(watch)), mSeconds(seconds) {}

HeadlessHost::~HeadlessHost() = default;

void HeadlessHost::RequestStop() { gStopRequested = true; }

void HeadlessHost::Watch(std::vector<QenDs*> sources, std::unique_ptr<Printer> printer, ConditionList& list) {
  for (QenDs* source : sources) {
    source->RegisterView(printer.get(), list);
    mWatched.emplace_back(source, printer.get());
  }
  printer->NfyViewDataUpdated(sources.front(), list);
  mPrinters.push_back(std::move(printer));
}

int HeadlessHost::CheckWatched() {
  for (const auto& header : mWatch) {
    Dstring reply;
    ConditionList list;
    // While another client holds the instrument nothing can be read: the header is not wrong.
    const int status = QenGuiInst::Call(":" + QenGuiInst::GetAppHandle() + header + "?", reply, list);
    if (status == QenStatus::kOk || status == QenStatus::kLocked) continue;
    std::cerr << "qengui: --watch " << header << ": the instrument cannot read it";
    for (const auto& c : list) std::cerr << " (" << c.GetCode() << ": " << c.GetMessage() << ")";
    std::cerr << std::endl;
    return kBadWatchExitCode;
  }
  return 0;
}

int HeadlessHost::Run() {
  if (int code = CheckWatched(); code != 0) return code;
  ConditionList list;
  // Read every state first, so that the first lines show the instrument as it is.
  uiapp::GetDirtyFlagDs()->ForceUpdate();
  uiapp::SyncTimeOut();
  // The host shows the error counts, so it sets the service up as a BER window would.
  uiapp::GetBerSvr()->Init(list);
  auto state = [&](QenDs* source, std::function<Dstring()> text) {
    Watch({source}, std::make_unique<Printer>(mOut, [text](QenDs*, ConditionList&) { return text(); }), list);
  };
  state(uiapp::GetRunStopDs(), [] { return Dstring::Format("run: %s", uiapp::GetRunStopDs()->IsRunning() ? "ON" : "OFF"); });
  state(uiapp::GetSystemStateDs(), [] { return Dstring::Format("system: %s", SystemWord(uiapp::GetSystemState())); });
  state(uiapp::GetPLLStateDs(), [] { return Dstring::Format("pll: %s", PllWord(uiapp::GetPLLState())); });
  state(uiapp::GetDataPortOneLockStateDs(),
        [] { return Dstring::Format("data port 1 lock: %s", PortLockWord(uiapp::GetDataPortOneLockState())); });
  state(uiapp::GetConnectDs(), [] { return Dstring::Format("connected: %s", uiapp::IsConnected() ? "ON" : "OFF"); });
  state(uiapp::GetGuiLockDs(), [] {
    return Dstring::Format("locked by another client: %s", uiapp::GetGuiLockDs()->IsLocked() ? "yes" : "no");
  });
  // The counts are not read while another client holds the instrument: they would show as zeros.
  auto counts = [] {
    if (uiapp::GetBerSvr()->GetResults().empty()) return Dstring();
    if (uiapp::GetGuiLockDs()->IsLocked()) return Dstring("ber: not counted while another client holds the instrument");
    Dstring text;
    for (const auto& r : uiapp::GetBerSvr()->GetResults()) {
      text.AppendPrintf("%sber %s compared=%llu errors=%llu ratio=%g", text.empty() ? "" : "\n", r.port.c_str(),
                        r.compared, r.errors, r.ratio);
    }
    return text;
  };
  Watch({uiapp::GetBerSvr(), uiapp::GetGuiLockDs()},
        std::make_unique<Printer>(mOut, [counts](QenDs*, ConditionList&) { return counts(); }), list);
  for (const auto& header : mWatch) {
    QenParamDs* source = Dte::AllocDsByName(":" + QenGuiInst::GetAppHandle() + header, 0);
    auto printer = std::make_unique<Printer>(mOut, [header](QenDs* s, ConditionList& l) {
      Dstring value;
      if (static_cast<QenParamDs*>(s)->QueryStrValue(value, l) != 0) return Dstring();
      return Dstring(header + " = " + value);
    });
    Watch({source}, std::move(printer), list);
    mParams.push_back(source);
  }
  MeasTimer clock;
  mToolkit.SetAfterEvent([&] {
    if (gStopRequested || (mSeconds > 0 && clock.Get() >= mSeconds)) uiapp::MainLoopExit();
  });
  uiapp::StartPolling();
  uiapp::MainLoop();
  uiapp::EndPolling();
  mToolkit.SetAfterEvent(nullptr);

  for (auto& [source, printer] : mWatched) source->UnregisterView(printer, list);
  for (QenParamDs* source : mParams) Dte::FreeDs(source);
  mWatched.clear();
  mParams.clear();
  return 0;
}
