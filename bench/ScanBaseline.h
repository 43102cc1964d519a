#pragma once

#include <benchmark/benchmark.h>

#include <time.h>

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <string>

// The baseline of the text benchmarks: a plain scan that counts the list structure.
inline std::size_t ScanStructure(const std::string& text) {
  std::size_t count = 0;
  for (char c : text) count += (c == ',') + (c == '(') + (c == ')');
  return count;
}

// The fastest of several scans, so that a ratio is measured against the baseline of this run.
inline double ScanSeconds(const std::string& text) {
  double best = 1e9;
  for (int i = 0; i < 20; ++i) {
    auto start = std::chrono::steady_clock::now();
    std::size_t count = ScanStructure(text);
    benchmark::DoNotOptimize(count);
    best = std::min(best, std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count());
  }
  return best;
}

// Processor time of this thread: on a shared machine a ratio of wall times also measures who
// else ran meanwhile, so the text benchmarks give the ratio of processor times as well.
inline double ThreadCpuSeconds() {
  timespec now{};
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
  return static_cast<double>(now.tv_sec) + 1e-9 * static_cast<double>(now.tv_nsec);
}

// The scan's processor time, the fastest of several like ScanSeconds.
inline double ScanCpuSeconds(const std::string& text) {
  double best = 1e9;
  for (int i = 0; i < 20; ++i) {
    const double start = ThreadCpuSeconds();
    std::size_t count = ScanStructure(text);
    benchmark::DoNotOptimize(count);
    best = std::min(best, ThreadCpuSeconds() - start);
  }
  return best;
}
