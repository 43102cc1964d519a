// A panel of 1,000 parameter fields refreshed after the server reports "ALL", against the same
// joined queries sent raw plus 1,000 plain line edits given the same texts, both repainted.
#include <benchmark/benchmark.h>

#include <QApplication>
#include <QGridLayout>
#include <QLineEdit>
#include <memory>
#include <vector>

#include "BenchApp.h"
#include "ManyParamsRig.h"
#include "data/Dte.h"
#include "instrument/QenGuiInst.h"
#include "params/ui/BoundControl.h"
#include "params/ui/ParSpinBox.h"
#include "params/ui/QenParEd.h"

namespace {

constexpr int kColumns = 20;

// `count` widgets in a grid of kColumns, shown offscreen.
template <class T>
std::unique_ptr<QWidget> Panel(std::vector<T*>& widgets, int count = ManyParamsRig::kManyParams) {
  auto panel = std::make_unique<QWidget>();
  auto* grid = new QGridLayout(panel.get());
  for (int i = 0; i < count; ++i) {
    widgets.push_back(new T(panel.get()));
    grid->addWidget(widgets.back(), i / kColumns, i % kColumns);
  }
  panel->resize(kColumns * 140, (count + kColumns - 1) / kColumns * 26);
  panel->show();
  return panel;
}

void BM_ParEdPanelRefreshVsJoinedQueriesAndLineEdits(benchmark::State& state) {
  BenchApp();
  ManyParamsRig& rig = ManyParamsRig::Get();
  if (!rig.Ok()) return state.SkipWithError("qensim did not start");
  std::vector<QenParEd*> fields;
  auto bound = Panel(fields);
  for (std::size_t i = 0; i < fields.size(); ++i) {
    fields[i]->setProperty("DsCmdName", QStringLiteral(":BENCH:G%1:P%2").arg(i / ManyParamsRig::kGroupSize).arg(i % ManyParamsRig::kGroupSize));
  }
  ConditionList list;
  for (QenParEd* field : fields) field->NfyInit();
  BoundControl::SetDsBaseNameAll(bound.get(), ":" + QenGuiInst::GetAppHandle(), list);
  if (fields.back()->Editor()->Text() != QString::number(ManyParamsRig::kManyParams - 1)) {
    return state.SkipWithError("the fields did not bind");
  }
  std::vector<QLineEdit*> edits;
  auto plain = Panel(edits);
  QCoreApplication::processEvents();

  double refresh = 0, baseline = 0;
  long calls = 0;
  for (auto _ : state) {
    const long before = rig.Calls();
    rig.Counter().mRecording = true;
    rig.Counter().mRecorded.clear();
    auto t0 = std::chrono::steady_clock::now();
    if (Dte::Update(list) != 0) return state.SkipWithError("refresh failed");
    bound->repaint();
    refresh += Seconds(t0);
    rig.Counter().mRecording = false;
    calls += rig.Calls() - before;

    const DstringList queries = rig.Counter().mRecorded;
    t0 = std::chrono::steady_clock::now();
    for (const Dstring& query : queries) {
      Dstring reply;
      QenGuiInst::GetInstrument()->Call(query, reply);
    }
    for (std::size_t i = 0; i < edits.size(); ++i) edits[i]->setText(fields[i]->Editor()->Text());
    plain->repaint();
    baseline += Seconds(t0);
  }
  const double n = static_cast<double>(state.iterations());
  state.counters["fields"] = ManyParamsRig::kManyParams;
  state.counters["round_trips"] = static_cast<double>(calls) / n;
  state.counters["refresh_ms"] = 1e3 * refresh / n;
  state.counters["baseline_ms"] = 1e3 * baseline / n;
  state.counters["ratio"] = refresh / baseline;
  bound.reset();
}

// A panel of one port's 50 fields moved between two ports, as the parameter editor moves it,
// against reading the same 100 sources (values and attributes) in one joined query.
void BM_PanelSwitchBetweenPortsVsOneJoinedRead(benchmark::State& state) {
  BenchApp();
  ManyParamsRig& rig = ManyParamsRig::Get();
  if (!rig.Ok()) return state.SkipWithError("qensim did not start");
  std::vector<QenParEd*> fields;
  auto panel = Panel(fields, ManyParamsRig::kGroupSize);
  for (std::size_t i = 0; i < fields.size(); ++i) {
    fields[i]->setProperty("DsCmdName", QStringLiteral(":P%1").arg(i));
    fields[i]->NfyInit();
  }
  const Dstring base = ":" + QenGuiInst::GetAppHandle() + ":BENCH:G";
  Dstring joined;
  for (int i = 0; i < ManyParamsRig::kGroupSize; ++i) {
    const Dstring h = Dstring::Format("%s9:P%d", base.c_str(), i);
    joined += Dstring::Format("%s%s?;%s? CLAS;%s:ATTR?;%s:ATTR? CLAS", i ? ";" : "", h.c_str(), h.c_str(), h.c_str(), h.c_str());
  }
  ConditionList list;
  double moving = 0, raw = 0;
  long calls = 0;
  int port = 0;
  for (auto _ : state) {
    const long before = rig.Calls();
    auto t0 = std::chrono::steady_clock::now();
    BoundControl::SetDsBaseNameAll(panel.get(), base + Dstring::Format("%d", port), list);
    panel->repaint();
    moving += Seconds(t0);
    calls += rig.Calls() - before;
    port = 1 - port;
    t0 = std::chrono::steady_clock::now();
    Dstring reply;
    QenGuiInst::GetInstrument()->Call(joined, reply);
    raw += Seconds(t0);
  }
  BoundControl::SetDsBaseNameAll(panel.get(), "", list);
  const double n = static_cast<double>(state.iterations());
  state.counters["controls"] = ManyParamsRig::kGroupSize;
  state.counters["round_trips_per_switch"] = static_cast<double>(calls) / n;
  state.counters["switch_ms"] = 1e3 * moving / n;
  state.counters["joined_read_ms"] = 1e3 * raw / n;
  state.counters["ratio"] = moving / raw;
}

}  // namespace

BENCHMARK(BM_PanelSwitchBetweenPortsVsOneJoinedRead)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(1.0);
BENCHMARK(BM_ParEdPanelRefreshVsJoinedQueriesAndLineEdits)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
