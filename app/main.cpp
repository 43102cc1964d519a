#include <csignal>
#include <cstdlib>
#include <iostream>
#include <memory>
#include <string>
#include <unistd.h>
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

// The window needs a display, or a platform chosen explicitly (offscreen, vnc, ...).
bool HasDisplay() {
  for (const char* name : {"QT_QPA_PLATFORM", "DISPLAY", "WAYLAND_DISPLAY"}) {
    const char* value = std::getenv(name);
    if (value != nullptr && *value != '\0') return true;
  }
  return false;
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
  // A script reads the death from the exit code: the command it sent did not run.
  QenGuiInst::SetServerDeathHandler([](const Dstring& message) {
    std::cerr << "qengui: " << message << std::endl;
    QenGuiInst::RunBeforeServerDeathExit();
    std::exit(1);
  });
  if (HostConnection::Open(options.host, options.port, options.resource, list) != QenStatus::kOk) {
    PrintConditions(list);
    QenGuiInst::SetCallWaiter(nullptr);
    QenGuiInst::End();
    return 1;
  }
  ConsoleHost console(std::cin, std::cout, isatty(STDIN_FILENO) != 0);
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
  if (options.mode == HostOptions::Mode::Version) {
    std::cout << "qengui " << QENGUI_VERSION << "\n";
    return 0;
  }
  if (options.mode == HostOptions::Mode::Gui && options.screenshot.empty() && !HasDisplay()) {
    std::cerr << "qengui: there is no display to show the window on (neither DISPLAY nor WAYLAND_DISPLAY is set);\n"
                 "use --console, --headless or --screenshot FILE, or set QT_QPA_PLATFORM\n";
    return 2;
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
    // On the error stream: the console's output holds one line per input line and no more.
    std::cerr << "Started qensim on 127.0.0.1:" << options.port << std::endl;
  }
  switch (options.mode) {
    case HostOptions::Mode::Headless: return RunHeadless(options);
    case HostOptions::Mode::Console: return RunConsole(options);
    default: return GuiHost::Run(argc, argv, options, sim);
  }
}
