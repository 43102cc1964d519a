// Segment buffers through qensim: moving a full buffer against a raw transfer of the same
// bytes, state access against a plain byte loop over the same memory, and paging through a
// 16M x 64 segment, by buffer and through the segment grid, whose page is also painted against
// plain text cells.
#include <benchmark/benchmark.h>

#include <chrono>
#include <memory>
#include <string>

#include <QImage>
#include <QKeyEvent>
#include <QPainter>
#include <random>

#include "BenchApp.h"
#include "ManyParamsRig.h"
#include "instrument/QenTcpInstrument.h"
#include "segments/QenSegmentDs.h"
#include "segments/QenSegmentPool.h"
#include "segments/SegmentBuffer.h"
#include "segments/ui/AddrDisp.h"
#include "segments/ui/DigitDisp.h"
#include "segments/ui/SegmentGridManager.h"

namespace {

using Clock = std::chrono::steady_clock;

constexpr long kFullVectors = 799992;  // one trace of 99,999 bytes: the largest buffer
constexpr long kBigLength = 16L << 20;
constexpr long kBigWidth = 64;
constexpr long kPageVectors = 12496;  // 1562 bytes a row, 99,968 bytes a page

double Seconds(Clock::time_point from) {
  return std::chrono::duration<double>(Clock::now() - from).count();
}

// The program's one qensim and call path (ManyParamsRig, whose start-up also starts the segment
// pool), with a second plain client for the raw baseline. Built on first use, shared.
class Server {
 public:
  static Server& Get() {
    static Server server;
    return server;
  }

  bool IsUp() const { return mUp; }
  QenTcpInstrument& Raw() { return mRaw; }
  CountingInstrument& Counter() { return mRig.Counter(); }

  // The 16M x 64 segment, made once.
  bool MakeBig() {
    if (!mBigMade) mBigMade = Make("Bench/Big", kBigLength, kBigWidth);
    return mBigMade;
  }

  // Makes a segment of memory data, saved, and closed again.
  bool Make(const Dstring& name, long length, long width) {
    SegmentProperties p;
    p.name = name;
    p.length = length;
    p.width = width;
    unsigned created = 0;
    ConditionList list;
    return QenSegmentPool::Create(p, created, list) == 0;
  }

  // The segment opened, with one buffer over `window` vectors from 0.
  QenSegmentDs* Open(const Dstring& name, long window, SegmentBuffer*& buffer) {
    ConditionList list;
    QenSegmentDs* ds = QenSegmentPool::AllocDs(name);
    if (ds->Open(list) != 0 || ds->CreateBuffer(buffer, list) != 0 || ds->Init(buffer, list) != 0 ||
        ds->SetBufferLength(buffer, window, list) != 0) {
      ds->Release();
      return nullptr;
    }
    return ds;
  }

  QenSegmentDs* Segment(const Dstring& name, long length, long width, long window, SegmentBuffer*& buffer) {
    return Make(name, length, width) ? Open(name, window, buffer) : nullptr;
  }

 private:
  Server() : mRig(ManyParamsRig::Get()) {
    mUp = mRig.Ok() && mRaw.Connect("127.0.0.1", mRig.Port()) == 0;
  }

  ManyParamsRig& mRig;
  QenTcpInstrument mRaw;
  bool mUp = false;
  bool mBigMade = false;
};

// Each move writes the 99,999 edited bytes back and reads the next 99,999; the raw exchange
// sends the same bytes up and gets them back.
void BM_MoveFullBufferVsRaw(benchmark::State& state) {
  Server& server = Server::Get();
  SegmentBuffer* buffer = nullptr;
  QenSegmentDs* ds =
      server.IsUp() ? server.Segment("Bench/Move", 2 * kFullVectors, 1, kFullVectors, buffer) : nullptr;
  if (ds == nullptr) return state.SkipWithError("qensim or the segment did not come up");
  const Dstring echo = ":TEST:ECHO #599999" + std::string(99999, 'B');
  ConditionList list;
  Dstring reply;
  double moveSeconds = 0, rawSeconds = 0;
  // The first move after the first edit makes the copy of the whole segment that unsaved work
  // is rescued from; it is reported on its own, the moves after it only put the edits there.
  ds->ToggleState(buffer, 0, 0, list);
  const auto first = Clock::now();
  if (ds->SetBufferStart(buffer, kFullVectors, list) != 0) return state.SkipWithError(list.ToText().c_str());
  state.counters["first_move_ms"] = 1e3 * Seconds(first);
  long start = kFullVectors;
  for (auto _ : state) {
    ds->ToggleState(buffer, start, 0, list);
    start = kFullVectors - start;
    auto t0 = Clock::now();
    if (ds->SetBufferStart(buffer, start, list) != 0) return state.SkipWithError(list.ToText().c_str());
    moveSeconds += Seconds(t0);
    auto t1 = Clock::now();
    if (server.Raw().Call(echo, reply) != 0 || reply.size() != 100006)
      return state.SkipWithError("raw echo failed");
    rawSeconds += Seconds(t1);
  }
  const auto n = static_cast<double>(state.iterations());
  state.counters["move_us"] = 1e6 * moveSeconds / n;
  state.counters["raw_us"] = 1e6 * rawSeconds / n;
  state.counters["ratio"] = moveSeconds / rawSeconds;
  ds->Close(list);
  ds->Release();
}

// Every state of a full buffer read (or set, or read as binary digits) through the data
// source, against a loop that takes the same bits straight from the same bytes.
void BM_StateAccessVsByteLoop(benchmark::State& state) {
  Server& server = Server::Get();
  SegmentBuffer* buffer = nullptr;
  QenSegmentDs* ds =
      server.IsUp() ? server.Segment("Bench/States", kFullVectors, 1, kFullVectors, buffer) : nullptr;
  if (ds == nullptr) return state.SkipWithError("qensim or the segment did not come up");
  const std::string bytes(99999, '\x5a');
  ConditionList list;
  double get = 0, set = 0, digit = 0, loop = 0;
  long ones = 0;
  for (auto _ : state) {
    auto t0 = Clock::now();
    for (long v = 0; v < kFullVectors; ++v) {
      char s = 0;
      ds->GetState(buffer, v, 0, s, list);
      ones += s == '1';
    }
    get += Seconds(t0);
    t0 = Clock::now();
    for (long v = 0; v < kFullVectors; ++v) ds->SetState(buffer, v, 0, (v & 1) ? '1' : '0', list);
    set += Seconds(t0);
    t0 = Clock::now();
    for (long v = 0; v < kFullVectors; ++v) {
      char d = 0;
      ds->GetDigit(buffer, v, 0, DataFormat::kBin, d, list);
      ones += d == '1';
    }
    digit += Seconds(t0);
    t0 = Clock::now();
    for (long v = 0; v < kFullVectors; ++v) {
      ones += (static_cast<unsigned char>(bytes[static_cast<std::size_t>(v >> 3)]) >> (7 - (v & 7))) & 1u;
    }
    benchmark::DoNotOptimize(ones);
    loop += Seconds(t0);
  }
  state.counters["get_ratio"] = get / loop;
  state.counters["set_ratio"] = set / loop;
  state.counters["digit_ratio"] = digit / loop;
  state.counters["loop_ns_per_state"] = 1e9 * loop / static_cast<double>(state.iterations()) / kFullVectors;
  ds->Close(list);
  ds->Release();
}

// A 16M x 64 two-state segment: the time to make it (the server writes its file), to open it
// (the server reads the file) and per page of its first 100 windows.
void BM_Page16Mx64(benchmark::State& state) {
  Server& server = Server::Get();
  if (!server.IsUp()) return state.SkipWithError("qensim did not come up");
  SegmentBuffer* buffer = nullptr;
  auto t0 = Clock::now();
  const bool made = server.MakeBig();
  const double makeSeconds = Seconds(t0);
  t0 = Clock::now();
  QenSegmentDs* ds = made ? server.Open("Bench/Big", kPageVectors, buffer) : nullptr;
  const double openSeconds = Seconds(t0);
  if (ds == nullptr) return state.SkipWithError("the segment did not come up");
  ConditionList list;
  double pageSeconds = 0, pages = 0;
  for (auto _ : state) {
    t0 = Clock::now();
    for (long page = 1; page <= 100; ++page) {
      if (ds->SetBufferStart(buffer, (page % 100) * kPageVectors, list) != 0) {
        return state.SkipWithError(list.ToText().c_str());
      }
    }
    pageSeconds += Seconds(t0);
    pages += 100;
  }
  state.counters["make_ms"] = 1e3 * makeSeconds;
  state.counters["open_ms"] = 1e3 * openSeconds;
  state.counters["page_us"] = 1e6 * pageSeconds / pages;
  ds->Close(list);
  ds->Release();
}

// The segment grid of the editor at 1920 x 1080 on the 16M x 64 segment, in `format`.
class GridRig {
 public:
  explicit GridRig(DataFormat format) {
    mGrid.SetDX(14);
    mGrid.SetDY(20);
    mGrid.SetOffY(22);
    (new AddrDisp(&mGrid))->SetCells(9);
    new DigitDisp(&mGrid);
    mGrid.resize(1920, 1080);
    ConditionList list;
    mUp = Server::Get().MakeBig() && mGrid.HookOn(0, 0, "Bench/Big", list) == 0 &&
          mGrid.SetDataFormat(0, format, list) == 0;
  }
  ~GridRig() {
    ConditionList list;
    mGrid.Release(list);
  }
  bool IsUp() const { return mUp; }
  SegmentGridManager& Grid() { return mGrid; }

 private:
  QApplication& mApp = BenchApp();  // before any widget
  SegmentGridManager mGrid;
  bool mUp = false;
};

// Runs `step` on the grid and then sends the very commands it sent again, straight through the
// connection: the same bytes both ways, without the grid and its buffer.
template <typename Step>
void GridAgainstRaw(benchmark::State& state, GridRig& rig, Step step) {
  CountingInstrument& counter = Server::Get().Counter();
  double gridSeconds = 0, rawSeconds = 0;
  long calls = 0;
  long steps = 0;
  for (auto _ : state) {
    counter.mRecorded.clear();
    counter.mRecording = true;
    const long before = counter.mCalls;
    auto t0 = Clock::now();
    step();
    gridSeconds += Seconds(t0);
    counter.mRecording = false;
    calls += counter.mCalls - before;
    ++steps;
    t0 = Clock::now();
    for (const Dstring& cmd : counter.mRecorded) {
      Dstring reply;
      if (counter.Call(cmd, reply) != 0) return state.SkipWithError("raw call failed");
    }
    rawSeconds += Seconds(t0);
  }
  state.counters["round_trips"] = static_cast<double>(calls) / static_cast<double>(steps);
  state.counters["held_vectors"] = static_cast<double>(rig.Grid().HeldVectors());
  state.counters["grid_us"] = 1e6 * gridSeconds / static_cast<double>(steps);
  state.counters["raw_us"] = 1e6 * rawSeconds / static_cast<double>(steps);
  state.counters["ratio"] = gridSeconds / rawSeconds;
}

// A jump to a vector anywhere in the segment, as the go-to field does.
void BM_GridJump16Mx64(benchmark::State& state) {
  GridRig rig(DataFormat::kHex);
  if (!rig.IsUp()) return state.SkipWithError("the grid did not open the segment");
  std::mt19937 random(7);
  ConditionList list;
  GridAgainstRaw(state, rig, [&] { rig.Grid().GoToVectorTrace(static_cast<long>(random() % kBigLength), 0, list); });
}

// Page Down through the grid: the buffer moves when the page shown leaves the screens it holds.
void BM_GridPageDown16Mx64(benchmark::State& state) {
  GridRig rig(DataFormat::kHex);
  if (!rig.IsUp()) return state.SkipWithError("the grid did not open the segment");
  QKeyEvent press(QEvent::KeyPress, Qt::Key_PageDown, Qt::NoModifier);
  GridAgainstRaw(state, rig, [&] { QCoreApplication::sendEvent(&rig.Grid(), &press); });
}

// A full page of binary digits painted offscreen, against QPainter::drawText of as many
// one-character cells of the same size on the same image.
void BM_GridPaintVsDrawText(benchmark::State& state) {
  GridRig rig(DataFormat::kBin);
  if (!rig.IsUp()) return state.SkipWithError("the grid did not open the segment");
  SegmentGridManager& grid = rig.Grid();
  const long lines = grid.GetNumDispVectors(0);
  const long digits = grid.GetNumDispDigits(0);
  const long cells = lines * (digits + 1);
  QImage image(1920, 1080, QImage::Format_ARGB32_Premultiplied);
  const QString one = QStringLiteral("1");
  double gridSeconds = 0, textSeconds = 0;
  for (auto _ : state) {
    auto t0 = Clock::now();
    grid.render(&image);
    gridSeconds += Seconds(t0);
    t0 = Clock::now();
    {
      QPainter painter(&image);
      painter.fillRect(image.rect(), Qt::white);
      for (long line = 0; line < lines; ++line) {
        for (long cell = 0; cell <= digits; ++cell) {
          painter.drawText(QRect(static_cast<int>(cell * 14), static_cast<int>(22 + line * 20), 14, 20), Qt::AlignCenter, one);
        }
      }
    }
    textSeconds += Seconds(t0);
  }
  const double n = static_cast<double>(state.iterations());
  state.counters["cells"] = static_cast<double>(cells);
  state.counters["grid_ms"] = 1e3 * gridSeconds / n;
  state.counters["drawtext_ms"] = 1e3 * textSeconds / n;
  state.counters["ratio"] = gridSeconds / textSeconds;
}

}  // namespace

BENCHMARK(BM_GridJump16Mx64)->MinTime(2.0)->UseRealTime();
BENCHMARK(BM_GridPageDown16Mx64)->MinTime(2.0)->UseRealTime();
BENCHMARK(BM_GridPaintVsDrawText)->MinTime(2.0)->UseRealTime();
BENCHMARK(BM_MoveFullBufferVsRaw)->MinTime(2.0)->UseRealTime();
BENCHMARK(BM_StateAccessVsByteLoop)->MinTime(1.0)->UseRealTime();
BENCHMARK(BM_Page16Mx64)->Iterations(3)->UseRealTime();
