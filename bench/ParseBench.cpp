// The expression parser against a plain byte scan of the same ~1 MB sequence expression.
#include <benchmark/benchmark.h>

#include "ScanBaseline.h"

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <string>

#include "support/ParserExpression.h"

namespace {

// A long sequence expression: nested loops of blocks with strings, numbers and words.
std::string MakeSequence(std::size_t minimumSize) {
  std::string text = "(3.0,\"start\",(SEQ";
  for (int i = 0; text.size() < minimumSize; ++i) {
    text += ",(BLOCK," + std::to_string(i % 7) + "," + std::to_string(1024 + 64 * (i % 50)) +
            ",0,\"\",(),\"seg" + std::to_string(i) + "\",0,0),\"lbl" + std::to_string(i) + "\",(LOOP1,0," +
            (i % 3 == 0 ? std::string("INF") : std::to_string(i % 1000)) + ",\"\",(BLOCK,0,64," +
            std::to_string(i % 2) + ",\"\",SYNC,PAUSE0,1.500000f,-" + std::to_string(i) + "))";
  }
  return text + "))";
}

const std::string& Text() {
  static const std::string text = MakeSequence(1 << 20);
  return text;
}

void BM_ScanBytes(benchmark::State& state) {
  const std::string& text = Text();
  for (auto _ : state) {
    std::size_t count = ScanStructure(text);
    benchmark::DoNotOptimize(count);
  }
  state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * text.size()));
}

void BM_ParseExpression(benchmark::State& state) {
  const std::string& text = Text();
  double scan = ScanSeconds(text);
  double scanCpu = ScanCpuSeconds(text);
  double parse = 0;
  double parseCpu = 0;
  for (auto _ : state) {
    auto start = std::chrono::steady_clock::now();
    const double startCpu = ThreadCpuSeconds();
    {
      LispList tree;
      ConditionList list;
      int rc = ParserExpression::Parse(text, tree, list);
      benchmark::DoNotOptimize(rc);
      benchmark::DoNotOptimize(tree);
      if (rc != 0) state.SkipWithError("the generated expression did not parse");
    }
    parse += std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
    parseCpu += ThreadCpuSeconds() - startCpu;
  }
  state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations() * text.size()));
  state.counters["parse_over_scan"] = parse / static_cast<double>(state.iterations()) / scan;
  state.counters["parse_over_scan_cpu"] = parseCpu / static_cast<double>(state.iterations()) / scanCpu;
}

}  // namespace

BENCHMARK(BM_ScanBytes)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_ParseExpression)->Unit(benchmark::kMillisecond);

BENCHMARK_MAIN();
