#include "HeadlessHost.h"

#include <atomic>
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

}  // namespace

// One line per change: a view that prints what its text function makes of the source, and
// only when that text differs from the last one printed.
class HeadlessHost::Printer : public QenDsView {
 public:
  Printer(std::ostream& out, std::function<Dstring(QenDs*, ConditionList&)> text) : mOut(out), mText(std::move(text)) {}
  int NfyViewDataUpdated(QenDs* source, ConditionList& list) override {
    Dstring line = mText(source, list);
    if (!line.empty() && line != mLast) mOut << line << std::endl;
    mLast = line;
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

void HeadlessHost::Watch(QenDs* source, std::unique_ptr<Printer> printer, unsigned tell, ConditionList& list) {
  source->RegisterView(printer.get(), list);
  if (tell) printer->NfyViewDataUpdated(source, list);
  mPrinters.push_back(std::move(printer));
  mWatched.push_back(source);
}

int HeadlessHost::Run() {
  ConditionList list;
  // Read every state first, so that the first lines show the instrument as it is.
  uiapp::GetDirtyFlagDs()->ForceUpdate();
  uiapp::SyncTimeOut();
  // The host shows the error counts, so it sets the service up as a BER window would.
  uiapp::GetBerSvr()->Init(list);
  auto state = [&](QenDs* source, std::function<Dstring()> text) {
    Watch(source, std::make_unique<Printer>(mOut, [text](QenDs*, ConditionList&) { return text(); }), 1, list);
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
  state(uiapp::GetBerSvr(), [] {
    Dstring text;
    for (const auto& r : uiapp::GetBerSvr()->GetResults()) {
      text.AppendPrintf("%sber %s compared=%llu errors=%llu ratio=%g", text.empty() ? "" : "\n", r.port.c_str(),
                        r.compared, r.errors, r.ratio);
    }
    return text;
  });
  for (const auto& header : mWatch) {
    QenParamDs* source = Dte::AllocDsByName(":" + QenGuiInst::GetAppHandle() + header, 0);
    auto printer = std::make_unique<Printer>(mOut, [header](QenDs* s, ConditionList& l) {
      Dstring value;
      if (static_cast<QenParamDs*>(s)->QueryStrValue(value, l) != 0) return Dstring();
      return Dstring(header + " = " + value);
    });
    Watch(source, std::move(printer), 1, list);
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

  for (std::size_t i = 0; i < mWatched.size(); ++i) mWatched[i]->UnregisterView(mPrinters[i].get(), list);
  for (QenParamDs* source : mParams) Dte::FreeDs(source);
  mWatched.clear();
  mParams.clear();
  return 0;
}
