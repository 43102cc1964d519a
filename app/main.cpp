#include <csignal>
#include <iostream>
#include <memory>
#include <string>
#include <vector>

#include "ConsoleHost.h"
#include "HostOptions.h"
#include "instrument/AppHandle.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenSimProcess.h"
#include "instrument/QenStatus.h"
#include "instrument/QenTcpInstrument.h"
#include "support/QenEnvironment.h"

namespace {

void PrintConditions(const ConditionList& list) {
  for (const auto& c : list) std::cerr << "qengui: " << c.GetCode() << ": " << c.GetMessage() << "\n";
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

  QenSimProcess sim;
  if (options.simulate) {
    if (!sim.Start(QenSimProcess::FindBesideExecutable(), {"--quiet"})) {
      std::cerr << "qengui: the simulator qensim could not be started\n";
      return 1;
    }
    options.host = "127.0.0.1";
    options.port = sim.Port();
    std::cout << "Started qensim on 127.0.0.1:" << options.port << "\n";
  }

  QenGuiInst::Init();
  auto instrument = std::make_unique<QenTcpInstrument>();
  if (int status = instrument->Connect(Dstring(options.host), options.port); status != QenStatus::kOk) {
    std::cerr << "qengui: cannot connect to " << options.host << ":" << options.port << ": "
              << QenInstrument::GetErrMessage(status) << "\n";
    QenGuiInst::End();
    return 1;
  }
  QenGuiInst::SetInstrument(std::move(instrument));
  Dstring handle = AppHandle::MakeFromResourceName(Dstring(options.resource));
  if (AppHandle::Create(QenGuiInst::GetInstrument(), handle, Dstring(options.resource), list) != QenStatus::kOk) {
    PrintConditions(list);
    QenGuiInst::End();
    return 1;
  }
  QenGuiInst::SetAppHandle(handle);

  ConsoleHost console(std::cin, std::cout);
  int code = console.Run();

  AppHandle::Destroy(QenGuiInst::GetInstrument(), handle, list);
  QenGuiInst::DisconnectFromServer(list);
  QenGuiInst::End();
  return code;
}
