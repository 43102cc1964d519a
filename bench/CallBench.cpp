// The call path against a raw socket that sends the same frame bytes to the same server:
// the ratio is what QenTcpInstrument::Call adds on top of the wire.
#include <benchmark/benchmark.h>

#include <netinet/in.h>
#include <netinet/tcp.h>
#include <arpa/inet.h>
#include <sys/socket.h>
#include <unistd.h>

#include <chrono>
#include <memory>

#include "instrument/Frame.h"
#include "instrument/QenSimProcess.h"
#include "instrument/QenTcpInstrument.h"

namespace {

QenSimProcess& Sim() {
  static QenSimProcess sim;
  if (sim.Port() == 0) sim.Start(QenSimProcess::FindBesideExecutable(), {"--quiet", "--test-control"});
  return sim;
}

class RawClient {
 public:
  explicit RawClient(unsigned short port) {
    mFd = socket(AF_INET, SOCK_STREAM, 0);
    sockaddr_in addr{};
    addr.sin_family = AF_INET;
    addr.sin_port = htons(port);
    addr.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    connect(mFd, reinterpret_cast<sockaddr*>(&addr), sizeof addr);
    int on = 1;
    setsockopt(mFd, IPPROTO_TCP, TCP_NODELAY, &on, sizeof on);
  }
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

struct Exchange {
  Dstring cmd;
  std::size_t replyBytes;
};

// The same command through both paths, timed in one run; reports the ratio.
void RunComparison(benchmark::State& state, const Exchange& exchange) {
  QenSimProcess& sim = Sim();
  if (sim.Port() == 0) {
    state.SkipWithError("qensim did not start");
    return;
  }
  QenTcpInstrument client;
  client.Connect("127.0.0.1", sim.Port());
  RawClient raw(sim.Port());
  FrameHeader header;
  header.id = 1;
  const std::string frame = EncodeFrame(header, exchange.cmd);
  double callSeconds = 0;
  double rawSeconds = 0;
  Dstring reply;
  for (auto _ : state) {
    auto t0 = std::chrono::steady_clock::now();
    if (client.Call(exchange.cmd, reply) != 0 || reply.size() != exchange.replyBytes) {
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

void BM_ShortQueryCallVsRaw(benchmark::State& state) {
  RunComparison(state, {":TEST:ECHO SEQ", 3});
}

void BM_BlockCallVsRaw(benchmark::State& state) {
  const Dstring block = "#599999" + std::string(99999, 'B');
  RunComparison(state, {":TEST:ECHO " + block, block.size()});
  state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) * 2 * static_cast<int64_t>(block.size()));
}

}  // namespace

BENCHMARK(BM_ShortQueryCallVsRaw)->MinTime(2.0)->UseRealTime();
BENCHMARK(BM_BlockCallVsRaw)->MinTime(2.0)->UseRealTime();
