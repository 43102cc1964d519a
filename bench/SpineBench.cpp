// The exchange engine and the poll against their baselines, measured in the same run:
// a refresh of many sources against one query per source, an idle poll tick against one raw
// call, the repository at 1,000 and 10,000 sources, and one notification pass over many views.
#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdio>
#include <memory>
#include <vector>

#include "core/uiapp.h"
#include "data/BerSvr.h"
#include "data/DirtyFlagDs.h"
#include "data/Dte.h"
#include "data/QenDs.h"
#include "data/QenDsView.h"
#include "data/QenParamDs.h"
#include "instrument/QenGuiInst.h"
#include "ManyParamsRig.h"

namespace {


void BM_RefreshManySourcesVsOneQueryEach(benchmark::State& state) {
  ManyParamsRig& rig = ManyParamsRig::Get();
  if (!rig.Ok()) return state.SkipWithError("qensim did not start");
  std::vector<QenParamDs*> sources;
  for (int i = 0; i < ManyParamsRig::kManyParams; ++i) sources.push_back(Dte::AllocDsByName(Header(i), 0));
  double joined = 0, single = 0;
  long joinedCalls = 0, singleCalls = 0;
  for (auto _ : state) {
    ConditionList list;
    long before = rig.Calls();
    auto t0 = std::chrono::steady_clock::now();
    if (Dte::Update(list) != 0) return state.SkipWithError("refresh failed");
    joined += Seconds(t0);
    joinedCalls += rig.Calls() - before;
    before = rig.Calls();
    t0 = std::chrono::steady_clock::now();
    for (auto* s : sources) {
      Dstring reply;
      if (QenGuiInst::Call(s->GetProgramHeader() + "?", reply, list) != 0) return state.SkipWithError("read failed");
    }
    single += Seconds(t0);
    singleCalls += rig.Calls() - before;
  }
  for (auto* s : sources) Dte::FreeDs(s);
  const double n = static_cast<double>(state.iterations());
  state.counters["sources"] = ManyParamsRig::kManyParams;
  state.counters["joined_ms"] = 1e3 * joined / n;
  state.counters["one_each_ms"] = 1e3 * single / n;
  state.counters["joined_round_trips"] = static_cast<double>(joinedCalls) / n;
  state.counters["one_each_round_trips"] = static_cast<double>(singleCalls) / n;
  state.counters["ratio"] = joined / single;
}

void BM_IdlePollTickVsOneRawCall(benchmark::State& state) {
  ManyParamsRig& rig = ManyParamsRig::Get();
  if (!rig.Ok()) return state.SkipWithError("qensim did not start");
  const Dstring dfl = QenGuiInst::GetAppHandle() + ":DFL?";
  double tick = 0, raw = 0;
  long calls = 0;
  for (auto _ : state) {
    long before = rig.Calls();
    auto t0 = std::chrono::steady_clock::now();
    uiapp::AsyncAlarmProc(nullptr);
    tick += Seconds(t0);
    calls += rig.Calls() - before;
    Dstring reply;
    t0 = std::chrono::steady_clock::now();
    QenGuiInst::GetInstrument()->Call(dfl, reply);
    raw += Seconds(t0);
  }
  uiapp::EndPolling();
  const double n = static_cast<double>(state.iterations());
  state.counters["round_trips_per_tick"] = static_cast<double>(calls) / n;
  state.counters["tick_us"] = 1e6 * tick / n;
  state.counters["raw_us"] = 1e6 * raw / n;
  state.counters["ratio"] = tick / raw;
}

// Poll ticks of a running instrument with 64 analyser ports, with the error rate service set
// up (as the bit error rate window and the status bar have it) and without: the round trips
// each tick costs, and the difference (at most one: all ports are read in one joined query).
void BM_BerPollTick64PortsVsWithout(benchmark::State& state) {
  ManyParamsRig& rig = ManyParamsRig::Get();
  if (!rig.Ok()) return state.SkipWithError("qensim did not start");
  ConditionList list;
  Dstring reply;
  QenGuiInst::Call(":TEST:STAT SYST,RUNN", reply, list);
  uiapp::GetDirtyFlagDs()->ForceUpdate();
  uiapp::AsyncAlarmProc(nullptr);
  uiapp::SyncTimeOut();
  if (uiapp::GetBerSvr()->Init(list) != 0 || uiapp::GetBerSvr()->GetResults().size() != ManyParamsRig::kAnalyserPorts) {
    return state.SkipWithError("the error rate service did not find the 64 ports");
  }
  long with = 0, without = 0;
  double withSeconds = 0, withoutSeconds = 0;
  for (auto _ : state) {
    long before = rig.Calls();
    auto t0 = std::chrono::steady_clock::now();
    uiapp::AsyncAlarmProc(nullptr);
    withSeconds += Seconds(t0);
    with += rig.Calls() - before;
    uiapp::GetBerSvr()->End();
    before = rig.Calls();
    t0 = std::chrono::steady_clock::now();
    uiapp::AsyncAlarmProc(nullptr);
    withoutSeconds += Seconds(t0);
    without += rig.Calls() - before;
    uiapp::GetBerSvr()->Init(list);
  }
  uiapp::GetBerSvr()->End();
  uiapp::EndPolling();
  QenGuiInst::Call(":TEST:STAT SYST,PROG", reply, list);
  const double n = static_cast<double>(state.iterations());
  state.counters["ports"] = ManyParamsRig::kAnalyserPorts;
  state.counters["round_trips_with"] = static_cast<double>(with) / n;
  state.counters["round_trips_without"] = static_cast<double>(without) / n;
  state.counters["added_round_trips"] = static_cast<double>(with - without) / n;
  state.counters["ratio"] = withSeconds / withoutSeconds;
}

// Lookups by name among `state.range(0)` live sources; per-lookup time should not grow with it.
void BM_RepositoryLookup(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  Dte::Init();
  std::vector<QenParamDs*> sources;
  for (int i = 0; i < count; ++i) sources.push_back(Dte::AllocDsByName(Dstring::Format(":_B:CGR1:P%d", i), 0));
  int i = 0;
  for (auto _ : state) {
    const Dstring name = Dstring::Format(":_B:CGR1:P%d", (i++ * 7919) % count);
    QenParamDs* found = Dte::GetDsByName(name);
    QenParamDs* again = Dte::AllocDsByName(name, 0);
    benchmark::DoNotOptimize(found);
    Dte::FreeDs(again);
  }
  for (auto* s : sources) Dte::FreeDs(s);
  Dte::End();
}

class NullView : public QenDsView {
 public:
  int NfyViewDataUpdated(QenDs*, ConditionList&) override { return ++mTold, 0; }
  long mTold = 0;
};

// One pass over `state.range(0)` views against calling the same views in a plain loop.
void BM_NotifyManyViews(benchmark::State& state) {
  const auto count = static_cast<std::size_t>(state.range(0));
  auto* source = new QenDs;
  std::vector<NullView> views(count);
  ConditionList list;
  for (auto& v : views) source->RegisterView(&v, list);
  double pass = 0, plain = 0;
  for (auto _ : state) {
    auto t0 = std::chrono::steady_clock::now();
    source->Update(list, 0);
    pass += Seconds(t0);
    t0 = std::chrono::steady_clock::now();
    for (auto& v : views) v.NfyViewDataUpdated(source, list);
    plain += Seconds(t0);
  }
  for (auto& v : views) source->UnregisterView(&v, list);
  source->Release();
  state.counters["ns_per_view"] = 1e9 * pass / static_cast<double>(state.iterations() * count);
  state.counters["ratio"] = pass / plain;
}

}  // namespace

BENCHMARK(BM_RefreshManySourcesVsOneQueryEach)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_IdlePollTickVsOneRawCall)->UseRealTime()->MinTime(1.0);
BENCHMARK(BM_BerPollTick64PortsVsWithout)->UseRealTime()->MinTime(1.0);
BENCHMARK(BM_RepositoryLookup)->Arg(1000)->Arg(10000);
BENCHMARK(BM_NotifyManyViews)->Arg(1000)->Arg(10000);
