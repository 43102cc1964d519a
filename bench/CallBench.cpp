// The call path against a raw socket that sends the same frame bytes to the same server:
// the ratio is what QenTcpInstrument::Call adds on top of the wire.
#include <benchmark/benchmark.h>

#include <netinet/in.h>
#include <netinet/tcp.h>
#include <arpa/inet.h>
#include <sys/socket.h>
#include <unistd.h>

#include <QElapsedTimer>
#include <QEventLoop>
#include <QTimer>
#include <algorithm>
#include <chrono>
#include <functional>
#include <memory>

#include "BenchApp.h"
#include "ManyParamsRig.h"

#include "instrument/Frame.h"
#include "instrument/QenSimProcess.h"
#include "instrument/QenGuiInst.h"
#include "common/Loopback.h"
#include "instrument/QenTcpInstrument.h"
#include "windows/InstrumentWaitView.h"

namespace {

QenSimProcess& Sim() {
  static QenSimProcess sim;
  if (sim.Port() == 0) sim.Start(QenSimProcess::FindBesideExecutable(), {"--quiet", "--test-control"});
  return sim;
}

class RawClient {
 public:
  explicit RawClient(unsigned short port) : mFd(ConnectLoopback(port)) {}
  ~RawClient() { close(mFd); }

  // Sends the frame and reads exactly `replySize` bytes back.
  bool PingPong(const std::string& frame, std::size_t replySize) {
    if (send(mFd, frame.data(), frame.size(), 0) != static_cast<ssize_t>(frame.size())) return false;
    mBuffer.resize(replySize);
    std::size_t got = 0;
    while (got < replySize) {
      ssize_t n = recv(mFd, mBuffer.data() + got, replySize - got, 0);
      if (n <= 0) return false;
      got += static_cast<std::size_t>(n);
    }
    return true;
  }

 private:
  int mFd = -1;
  std::string mBuffer;
};

// The largest gap, in ms, between ticks of a 10 ms timer while `work` runs.
double LargestTickGap(const std::function<void()>& work) {
  QElapsedTimer clock;
  qint64 last = 0;
  qint64 largest = 0;
  QTimer timer;
  timer.setTimerType(Qt::PreciseTimer);
  timer.setInterval(10);
  QObject::connect(&timer, &QTimer::timeout, [&] {
    largest = std::max(largest, clock.elapsed() - last);
    last = clock.elapsed();
  });
  clock.start();
  timer.start();
  work();
  largest = std::max(largest, clock.elapsed() - last);
  return static_cast<double>(largest);
}

struct Exchange {
  Dstring cmd;
  std::size_t replyBytes;
};

using CallProc = std::function<int(const Dstring& cmd, Dstring& reply)>;

// The same command through `call` and the raw socket, timed in one run; reports the ratio.
void RunComparison(benchmark::State& state, unsigned short port, const Exchange& exchange, const CallProc& call) {
  RawClient raw(port);
  FrameHeader header;
  header.id = 1;
  const std::string frame = EncodeFrame(header, exchange.cmd);
  double callSeconds = 0;
  double rawSeconds = 0;
  Dstring reply;
  for (auto _ : state) {
    auto t0 = std::chrono::steady_clock::now();
    if (call(exchange.cmd, reply) != 0 || reply.size() != exchange.replyBytes) {
      state.SkipWithError("call failed");
      return;
    }
    auto t1 = std::chrono::steady_clock::now();
    if (!raw.PingPong(frame, FrameHeader::kSize + exchange.replyBytes)) {
      state.SkipWithError("raw exchange failed");
      return;
    }
    auto t2 = std::chrono::steady_clock::now();
    callSeconds += std::chrono::duration<double>(t1 - t0).count();
    rawSeconds += std::chrono::duration<double>(t2 - t1).count();
  }
  state.counters["call_us"] = 1e6 * callSeconds / static_cast<double>(state.iterations());
  state.counters["raw_us"] = 1e6 * rawSeconds / static_cast<double>(state.iterations());
  state.counters["ratio"] = callSeconds / rawSeconds;
}

// The instrument client alone.
void RunClientComparison(benchmark::State& state, const Exchange& exchange) {
  if (Sim().Port() == 0) {
    state.SkipWithError("qensim did not start");
    return;
  }
  QenTcpInstrument client;
  client.Connect("127.0.0.1", Sim().Port());
  RunComparison(state, Sim().Port(), exchange, [&](const Dstring& cmd, Dstring& reply) { return client.Call(cmd, reply); });
}

void BM_ShortQueryCallVsRaw(benchmark::State& state) {
  RunClientComparison(state, {":TEST:ECHO SEQ", 3});
}

// The window's waiter on the application's connection while it lives.
class GuiPath {
 public:
  GuiPath() : mWaiter(nullptr) { QenGuiInst::SetCallWaiter(&mWaiter); }
  ~GuiPath() { QenGuiInst::SetCallWaiter(nullptr); }
  GuiPath(const GuiPath&) = delete;
  GuiPath& operator=(const GuiPath&) = delete;
  int Call(const Dstring& cmd, Dstring& reply) { return QenGuiInst::Call(cmd, reply, mList); }

 private:
  InstrumentWaitView mWaiter;
  ConditionList mList;
};

// The application and its connection, shared with the other benchmarks; false when qensim failed.
bool StartGuiPath(benchmark::State& state) {
  BenchApp();
  if (ManyParamsRig::Get().Ok()) return true;
  state.SkipWithError("qensim did not start");
  return false;
}

// The whole path of the window host: QenGuiInst::Call with the window's waiter, which lets the
// event loop run while a reply is slow and must cost nothing when it is fast.
void BM_ShortQueryGuiPathVsRaw(benchmark::State& state) {
  if (!StartGuiPath(state)) return;
  GuiPath path;
  RunComparison(state, ManyParamsRig::Get().Port(), {":TEST:ECHO SEQ", 3},
                [&](const Dstring& cmd, Dstring& reply) { return path.Call(cmd, reply); });
}

// The longest the event loop stands still (the largest gap between ticks of a 10 ms timer)
// while QenGuiInst::Call waits 2 s for a delayed reply, against the same loop left idle for 2 s.
void BM_EventLoopStallDuringSlowReplyVsIdle(benchmark::State& state) {
  if (!StartGuiPath(state)) return;
  GuiPath path;
  double waitGap = 0;
  double idleGap = 0;
  for (auto _ : state) {
    Dstring reply;
    path.Call(":TEST:DELAY 2000,1", reply);
    waitGap = std::max(waitGap, LargestTickGap([&] { path.Call(":TEST:ECHO SEQ", reply); }));
    idleGap = std::max(idleGap, LargestTickGap([] {
      QEventLoop idle;
      QTimer::singleShot(2000, &idle, &QEventLoop::quit);
      idle.exec();
    }));
  }
  state.counters["stall_ms"] = waitGap;
  state.counters["idle_gap_ms"] = idleGap;
  state.counters["ratio"] = waitGap / idleGap;
}

void BM_BlockCallVsRaw(benchmark::State& state) {
  const Dstring block = "#599999" + std::string(99999, 'B');
  RunClientComparison(state, {":TEST:ECHO " + block, block.size()});
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * 2 * static_cast<int64_t>(block.size()));
}

}  // namespace

BENCHMARK(BM_ShortQueryCallVsRaw)->MinTime(2.0)->UseRealTime();
BENCHMARK(BM_ShortQueryGuiPathVsRaw)->MinTime(2.0)->UseRealTime();
BENCHMARK(BM_EventLoopStallDuringSlowReplyVsIdle)->Iterations(2)->UseRealTime()->Unit(benchmark::kMillisecond);
BENCHMARK(BM_BlockCallVsRaw)->MinTime(2.0)->UseRealTime();
