#include <csignal>
#include <iostream>
#include <memory>
#include <string>
#include <vector>

#include "ConsoleHost.h"
#include "GuiHost.h"
#include "HeadlessHost.h"
#include "HostConnection.h"
#include "HostOptions.h"
#include "InterruptWaiter.h"
#include "core/uiapp.h"
#include "instrument/AppHandle.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenSimProcess.h"
#include "instrument/QenStatus.h"
#include "support/QenEnvironment.h"
#include "toolkit/HeadlessToolkit.h"
#include "toolkit/Toolkit.h"

namespace {

HeadlessToolkit* gToolkit = nullptr;

void PrintConditions(const ConditionList& list) {
  for (const auto& c : list) std::cerr << "qengui: " << c.GetCode() << ": " << c.GetMessage() << "\n";
}

void OnStopSignal(int) {
  InterruptWaiter::Interrupt();
  HeadlessHost::RequestStop();
  if (gToolkit) gToolkit->Interrupt();
}

// Without SA_RESTART, so that a read of the console's input ends at Ctrl+C too.
void CatchStopSignals() {
  struct sigaction action {};
  action.sa_handler = OnStopSignal;
  sigemptyset(&action.sa_mask);
  sigaction(SIGINT, &action, nullptr);
  sigaction(SIGTERM, &action, nullptr);
}

int RunConsole(const HostOptions& options) {
  ConditionList list;
  CatchStopSignals();
  InterruptWaiter waiter;
  QenGuiInst::Init();
  QenGuiInst::SetCallWaiter(&waiter);
  if (HostConnection::Open(options.host, options.port, options.resource, list) != QenStatus::kOk) {
    PrintConditions(list);
    QenGuiInst::SetCallWaiter(nullptr);
    QenGuiInst::End();
    return 1;
  }
  ConsoleHost console(std::cin, std::cout);
  int code = console.Run();
  AppHandle::Destroy(QenGuiInst::GetInstrument(), QenGuiInst::GetAppHandle(), list);
  QenGuiInst::DisconnectFromServer(list);
  QenGuiInst::SetCallWaiter(nullptr);
  QenGuiInst::End();
  return code;
}

// The application's own start and end order, around the headless main loop.
int RunHeadless(const HostOptions& options) {
  HeadlessToolkit toolkit;
  gToolkit = &toolkit;
  Toolkit::Install(&toolkit);
  CatchStopSignals();
  InterruptWaiter waiter;
  ConditionList list;
  uiapp::RegisterConstants();
  uiapp::RegisterEvents();
  uiapp::RegisterVerbs();
  uiapp::RegisterWindows();
  uiapp::Init(list);
  QenGuiInst::SetCallWaiter(&waiter);
  int code = 1;
  if (HostConnection::Open(options.host, options.port, options.resource, list) == QenStatus::kOk) {
    // A headless host only looks: it never loads or starts a setting.
    uiapp::RegistrationFinished(uiapp::StartUse::kOnlyLook);
    HeadlessHost host(std::cout, toolkit, DstringList(options.watch.begin(), options.watch.end()), options.seconds);
    code = host.Run();
  } else {
    PrintConditions(list);
  }
  QenGuiInst::SetCallWaiter(nullptr);
  uiapp::End(list);
  uiapp::UnregisterWindows();
  Toolkit::Install(nullptr);
  gToolkit = nullptr;
  return code;
}

}  // namespace

int main(int argc, char** argv) {
  HostOptions options;
  ConditionList list;
  if (HostOptions::Parse(std::vector<std::string>(argv + 1, argv + argc), options, list) != 0) {
    PrintConditions(list);
    std::cerr << HostOptions::Usage();
    return 2;
  }
  if (options.mode == HostOptions::Mode::Help) {
    std::cout << HostOptions::Usage();
    return 0;
  }
  if (options.logDir) QenEnvironment::SetLogDirectory(Dstring(*options.logDir));
  if (options.paramSet) QenEnvironment::SetConfigParamSet(*options.paramSet);
  if (options.replyTimeout) QenInstrument::SetDefaultReplyTimeoutMs(static_cast<int>(*options.replyTimeout * 1000.0));

  QenSimProcess sim;
  if (options.simulate) {
    if (!sim.Start(QenSimProcess::FindBesideExecutable(), {"--quiet"})) {
      std::cerr << "qengui: the simulator qensim could not be started\n";
      return 1;
    }
    options.host = "127.0.0.1";
    options.port = sim.Port();
    std::cout << "Started qensim on 127.0.0.1:" << options.port << std::endl;
  }
  switch (options.mode) {
    case HostOptions::Mode::Headless: return RunHeadless(options);
    case HostOptions::Mode::Console: return RunConsole(options);
    default: return GuiHost::Run(argc, argv, options, sim);
  }
}
