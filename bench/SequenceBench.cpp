// The sequence model against a plain byte scan of the same ~1 MB sequence expression: reading
// it into blocks and loops (parse and rebuild), writing it back, and the change analysis of a
// read after one edit. Each prints its time over the scan's, measured in the same run.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <string>

#include "sequences/CSequence.h"
#include "sequences/CSequenceBlock.h"

namespace {

std::string Block(int i) {
  std::string ports;
  for (int p = 0; p < 10; ++p)
    ports += p % 3 == 0 ? ",\"seg" + std::to_string(i % 97) + "\",0,0" : ",PAUSE0,0,0";
  return "(BLOCK," + std::to_string(i % 7) + "," + std::to_string(1024 + 64 * (i % 50)) + ",0,\"\",()" +
         ports + ")";
}

// A long sequence of the second generation: runs of blocks, one-block loops and two-block loops
// inside endless top-level loops, with labels. Item `skip` (a plain block) is left out.
std::string MakeSequence(std::size_t minimumSize, int skip = -1) {
  std::string text = "(3.0,\"start\",(SEQ";
  std::size_t size = text.size();
  for (int i = 0; size < minimumSize; ++i) {
    std::string item = i == 0 ? "," : ",\"l" + std::to_string(i) + "\",";
    if (i % 5 == 0) {
      item += "(LOOP3,0,INF,\"\",(SEQ," + Block(i) + ",\"\",(LOOP1,1,4,\"\",(SEQ," + Block(i + 1) + ",\"\"," +
              Block(i + 2) + "))))";
    } else if (i % 5 == 1) {
      item += "(LOOP2,0," + std::to_string(i % 100 + 1) + ",\"\"," + Block(i) + ")";
    } else {
      item += Block(i);
    }
    size += item.size();
    if (i != skip) text += item;
  }
  return text + "))";
}

const std::string& Text() {
  static const std::string text = MakeSequence(1 << 20);
  return text;
}

std::size_t Scan(const std::string& text) {
  std::size_t count = 0;
  for (char c : text) count += (c == ',') + (c == '(') + (c == ')');
  return count;
}

// The fastest of several scans, so the ratio is measured against the baseline of this run.
double ScanSeconds(const std::string& text) {
  double best = 1e9;
  for (int i = 0; i < 20; ++i) {
    auto start = std::chrono::steady_clock::now();
    std::size_t count = Scan(text);
    benchmark::DoNotOptimize(count);
    best = std::min(best, std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count());
  }
  return best;
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
    std::size_t count = Scan(text);
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

}  // namespace

BENCHMARK(BM_ScanSequence)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_ReadSequenceExpression)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_WriteSequenceExpression)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_AnalyzeOneEdit)->Unit(benchmark::kMillisecond);
