// Start-up of the window host against a running qensim (connect, start-up order, first poll,
// first paint, exit: `qengui --screenshot`) against a plain Qt program that paints one empty
// main window and exits, both offscreen, in the same run.
#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <string>

#include "ManyParamsRig.h"
#include "instrument/QenSimProcess.h"

namespace {

std::filesystem::path Beside(const char* relative) {
  return std::filesystem::path(QenSimProcess::FindBesideExecutable().c_str()).parent_path().parent_path() / relative;
}

int Run(const std::string& command) { return std::system(("QT_QPA_PLATFORM=offscreen " + command + " >/dev/null 2>&1").c_str()); }

void BM_ScreenshotStartupVsPlainQtWindow(benchmark::State& state) {
  QenSimProcess sim;
  if (!sim.Start(QenSimProcess::FindBesideExecutable(), {"--quiet"})) return state.SkipWithError("qensim did not start");
  const std::string png = (std::filesystem::temp_directory_path() / "qen-bench-startup.png").string();
  const std::string qengui = Beside("app/qengui").string() + " 127.0.0.1:" + std::to_string(sim.Port()) +
                             " --log-dir " + std::filesystem::temp_directory_path().string() + " --screenshot " + png;
  const std::string plain = Beside("bench/qen_plain_window").string() + " " + png;
  double gui = 0, baseline = 0;
  for (auto _ : state) {
    auto t0 = std::chrono::steady_clock::now();
    if (Run(qengui) != 0) return state.SkipWithError("qengui --screenshot failed");
    gui += Seconds(t0);
    t0 = std::chrono::steady_clock::now();
    if (Run(plain) != 0) return state.SkipWithError("the plain window failed");
    baseline += Seconds(t0);
  }
  const double n = static_cast<double>(state.iterations());
  state.counters["qengui_ms"] = 1e3 * gui / n;
  state.counters["plain_qt_ms"] = 1e3 * baseline / n;
  state.counters["ratio"] = gui / baseline;
}

}  // namespace

BENCHMARK(BM_ScreenshotStartupVsPlainQtWindow)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(5);
