// The waveform of a capture of 16M vectors drawn fitted into 1920 x 1080 pixels, against one of
// 1M vectors drawn the same way in the same run: the summaries make the cost follow the pixels.
#include <benchmark/benchmark.h>

#include <QImage>
#include <chrono>
#include <string>

#include "BenchApp.h"
#include "capture/CaptureData.h"
#include "capture/ui/WaveView.h"

namespace {

constexpr int kTraces = 16;
constexpr long kChunk = 1L << 20;

// Trace t is bit t of the vector number, as a counter pattern plays; an error every 100,003 vectors.
void Fill(CaptureData& data, long length) {
  data.Reset(kTraces, length, 1e-9);
  const std::size_t rowBytes = static_cast<std::size_t>(kChunk / 8);
  std::string rows(rowBytes * kTraces, '\0');
  std::string errors(rowBytes * kTraces, '\0');
  for (long start = 0; start < length; start += kChunk) {
    for (int t = 0; t < kTraces; ++t) {
      for (std::size_t i = 0; i < rowBytes; ++i) {
        const long v = start + static_cast<long>(i) * 8;
        static const char kLow[] = {'\x55', '\x33', '\x0F'};
        rows[t * rowBytes + i] = t < 3 ? kLow[t] : (((v >> t) & 1) != 0 ? '\xFF' : '\0');
      }
    }
    std::fill(errors.begin(), errors.end(), '\0');
    for (long v = (start + 100002) / 100003 * 100003; v < start + kChunk; v += 100003) {
      errors[static_cast<std::size_t>((v - start) / 8)] = static_cast<char>(0x80 >> ((v - start) % 8));
    }
    data.Put(start, kChunk, rows, false);
    data.Put(start, kChunk, errors, true);
  }
  data.Summarise();
}

double PaintSeconds(WaveView& view, QImage& image) {
  const auto t0 = std::chrono::steady_clock::now();
  view.render(&image);
  return std::chrono::duration<double>(std::chrono::steady_clock::now() - t0).count();
}

void BM_WavePaint16MVs1M(benchmark::State& state) {
  BenchApp();
  CaptureData small;
  CaptureData large;
  Fill(small, 1L << 20);
  Fill(large, 16L << 20);
  WaveView smallView;
  WaveView largeView;
  for (WaveView* view : {&smallView, &largeView}) view->resize(1920, 1080);
  smallView.SetData(&small);
  largeView.SetData(&large);
  smallView.SetBus(0, 7, 16);
  largeView.SetBus(0, 7, 16);
  QImage image(1920, 1080, QImage::Format_ARGB32_Premultiplied);
  double smallSeconds = 0;
  double largeSeconds = 0;
  for (auto _ : state) {
    smallSeconds += PaintSeconds(smallView, image);
    largeSeconds += PaintSeconds(largeView, image);
  }
  const double n = static_cast<double>(state.iterations());
  state.counters["paint_1M_ms"] = 1e3 * smallSeconds / n;
  state.counters["paint_16M_ms"] = 1e3 * largeSeconds / n;
  state.counters["ratio"] = largeSeconds / smallSeconds;
}
BENCHMARK(BM_WavePaint16MVs1M)->Unit(benchmark::kMillisecond)->MinTime(2.0);

}  // namespace
