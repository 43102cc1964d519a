#include "ManyParamsRig.h"

#include <filesystem>
#include <fstream>
#include <string>

#include <unistd.h>

#include "core/uiapp.h"
#include "instrument/AppHandle.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenTcpInstrument.h"
#include "support/QenEnvironment.h"

ManyParamsRig& ManyParamsRig::Get() {
  static ManyParamsRig rig;
  return rig;
}

ManyParamsRig::ManyParamsRig() {
  mDir = std::filesystem::temp_directory_path() / ("qen-bench-" + std::to_string(getpid()));
  std::filesystem::create_directories(mDir);
  QenEnvironment::SetLogDirectory(Dstring(mDir.string()));
  const auto config = mDir / "many.qsc";
  std::ofstream out(config);
  out << "unit V -3 0 0 0.1\n";
  for (int i = 0; i < kManyParams; ++i) {
    out << "param :BENCH:G" << i / kGroupSize << ":P" << i % kGroupSize << " double " << i << " unit=V min=-1E9 max=1E9\n";
  }
  // A rack of kAnalyserPorts analyser ports (16 clock groups of two modules of two), for the
  // error rate service.
  out << "model K2270A analyser\n"
         "template group\nparam {group}:FREQ double 1E9 min=1E6 max=1E10\nend\n"
         "template module\nparam {module}:TYPE string \"{model}\" readonly\nend\n"
         "template port type=PDAT kind=analyser\nparam {port}:VOLT:THR double 0.5 min=-2 max=3\n"
         "param {port}:BER string \"0,0,0\" readonly\nend\n";
  for (int g = 1; g <= kAnalyserPorts / 4; ++g) {
    out << "group " << g << "\n";
    for (int m = 1; m <= 2; ++m) out << "module " << m << " K2270A\nport 1 PDAT\nport 2 PDAT\n";
  }
  out.close();
  mSim.Start(QenSimProcess::FindBesideExecutable(),
             {"--quiet", "--test-control", "--config", config.string(), "--data-dir", (mDir / "data").string()});
  ConditionList list;
  uiapp::Init(list);
  auto tcp = std::make_unique<QenTcpInstrument>();
  tcp->Connect("127.0.0.1", mSim.Port());
  auto counting = std::make_unique<CountingInstrument>(std::move(tcp));
  mCounter = counting.get();
  QenGuiInst::SetInstrument(std::move(counting));
  Dstring handle = "_BENCH";
  AppHandle::Create(QenGuiInst::GetInstrument(), handle, "BENCH", list);
  QenGuiInst::SetAppHandle(handle);
}

ManyParamsRig::~ManyParamsRig() {
  mSim.Stop();
  std::error_code error;
  std::filesystem::remove_all(mDir, error);
}

bool ManyParamsRig::Ok() const { return mSim.Port() != 0 && !QenGuiInst::GetAppHandle().empty(); }

double Seconds(std::chrono::steady_clock::time_point since) {
  return std::chrono::duration<double>(std::chrono::steady_clock::now() - since).count();
}

Dstring Header(int i) {
  return Dstring::Format(":%s:BENCH:G%d:P%d", QenGuiInst::GetAppHandle().c_str(), i / ManyParamsRig::kGroupSize,
                         i % ManyParamsRig::kGroupSize);
}
