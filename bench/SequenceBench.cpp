// The sequence model against a plain byte scan of the same ~1 MB sequence expression: reading
// it into blocks and loops (parse and rebuild), writing it back, and the change analysis of a
// read after one edit. Each prints its time over the scan's, measured in the same run.
#include <benchmark/benchmark.h>

#include "ScanBaseline.h"
#include "SequenceText.h"

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <string>

#include "sequences/CSequence.h"
#include "sequences/CSequenceBlock.h"

namespace {

using sequence_text::Item;
using sequence_text::MakeBlocks;

// A sequence of at least `minimumSize` bytes; item `skip` is left out.
std::string MakeSequence(std::size_t minimumSize, int skip = -1) {
  std::string text = "(3.0,\"start\",(SEQ";
  std::size_t size = text.size();
  int blocks = 0;
  for (int i = 0; size < minimumSize; ++i) {
    std::string item = Item(i, blocks);
    size += item.size();
    if (i != skip) text += item;
  }
  return text + "))";
}

const std::string& Text() {
  static const std::string text = MakeSequence(1 << 20);
  return text;
}

template <typename Run>
void Measure(benchmark::State& state, const char* counter, Run run) {
  const std::string& text = Text();
  const double scan = ScanSeconds(text);
  double spent = 0;
  for (auto _ : state) {
    auto start = std::chrono::steady_clock::now();
    if (!run()) state.SkipWithError("the sequence was not handled");
    spent += std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
  }
  state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * text.size()));
  state.counters[counter] = spent / static_cast<double>(state.iterations()) / scan;
}

void BM_ScanSequence(benchmark::State& state) {
  const std::string& text = Text();
  for (auto _ : state) {
    std::size_t count = ScanStructure(text);
    benchmark::DoNotOptimize(count);
  }
  state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * text.size()));
}

void BM_ReadSequenceExpression(benchmark::State& state) {
  CSequence::SetNumLoopLevels(3);
  CSequence seq;
  Measure(state, "read_over_scan", [&] {
    ConditionList list;
    return seq.fromExpression(Text(), list) == 0;
  });
  state.counters["blocks"] = static_cast<double>(seq.GetNumBlocks());
}

void BM_WriteSequenceExpression(benchmark::State& state) {
  CSequence::SetNumLoopLevels(3);
  CSequence seq;
  ConditionList list;
  if (seq.fromExpression(Text(), list) != 0)
    return state.SkipWithError("the generated expression did not read");
  Measure(state, "write_over_scan", [&] {
    Dstring out;
    const bool ok = seq.asExpression(out, list) == 0 && out.size() == Text().size();
    benchmark::DoNotOptimize(out);
    return ok;
  });
}

// A read that finds one block gone: what the views are told after the usual one-block edit.
void BM_AnalyzeOneEdit(benchmark::State& state) {
  CSequence::SetNumLoopLevels(3);
  CSequence old, now;
  ConditionList list;
  if (old.fromExpression(Text(), list) != 0 || now.fromExpression(MakeSequence(1 << 20, 2002), list) != 0) {
    return state.SkipWithError("the generated expressions did not read");
  }
  Measure(state, "analyze_over_scan", [&] { return now.AnalyzeChanges(old.GetContent(), list) == 0; });
}

// One edit's round trip: write the model, read it back into a second model and analyse the
// difference. Measured at 10,000 and 20,000 blocks with three loop levels in the same run;
// the ratio of the two times shows whether the cost is linear (2.0). Each phase is timed.
struct Cycle {
  double write = 0;
  double read = 0;
  double analyze = 0;
  double Total() const { return write + read + analyze; }
};

bool RunCycle(const std::string& text, Cycle& cycle) {
  CSequence model;
  CSequence back;
  ConditionList list;
  if (model.fromExpression(text, list) != 0) return false;
  auto t0 = std::chrono::steady_clock::now();
  Dstring out;
  if (model.asExpression(out, list) != 0) return false;
  auto t1 = std::chrono::steady_clock::now();
  if (back.fromExpression(out, list) != 0) return false;
  auto t2 = std::chrono::steady_clock::now();
  if (back.AnalyzeChanges(model.GetContent(), list) != 0) return false;
  auto t3 = std::chrono::steady_clock::now();
  cycle.write += std::chrono::duration<double>(t1 - t0).count();
  cycle.read += std::chrono::duration<double>(t2 - t1).count();
  cycle.analyze += std::chrono::duration<double>(t3 - t2).count();
  return true;
}

void BM_SequenceCycle10kVs20k(benchmark::State& state) {
  CSequence::SetNumLoopLevels(3);
  static const std::string small = MakeBlocks(10000);
  static const std::string large = MakeBlocks(20000);
  Cycle s;
  Cycle l;
  for (auto _ : state) {
    if (!RunCycle(small, s) || !RunCycle(large, l)) return state.SkipWithError("the sequence was not handled");
  }
  const double n = static_cast<double>(state.iterations());
  state.counters["ms_10k"] = 1e3 * s.Total() / n;
  state.counters["ms_20k"] = 1e3 * l.Total() / n;
  state.counters["write_ratio"] = l.write / s.write;
  state.counters["read_ratio"] = l.read / s.read;
  state.counters["analyze_ratio"] = l.analyze / s.analyze;
  state.counters["ratio"] = l.Total() / s.Total();
}

}  // namespace

BENCHMARK(BM_SequenceCycle10kVs20k)->Unit(benchmark::kMillisecond)->MinTime(2.0);
BENCHMARK(BM_ScanSequence)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_ReadSequenceExpression)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_WriteSequenceExpression)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_AnalyzeOneEdit)->Unit(benchmark::kMillisecond);
