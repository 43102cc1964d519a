// qensim's raw SCPI socket as a script uses it: write-then-query pairs from a client that
// leaves Nagle on against the same pairs with TCP_NODELAY, and a 16M x 64 segment uploaded and
// read back in blocks against a raw loopback copy of the same bytes in the same run.
#include <benchmark/benchmark.h>

#include <netinet/in.h>
#include <netinet/tcp.h>
#include <arpa/inet.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <thread>

#include "SimSegment.h"
#include "common/Loopback.h"
#include "instrument/QenSimProcess.h"

namespace {

using Clock = std::chrono::steady_clock;

double Seconds(Clock::time_point from) {
  return std::chrono::duration<double>(Clock::now() - from).count();
}

struct ScpiSim {
  QenSimProcess process;
  unsigned short scpiPort = 0;
};

ScpiSim& Sim() {
  static ScpiSim sim;
  if (sim.process.Port() == 0) {
    const std::filesystem::path dir = std::filesystem::temp_directory_path() / "qen_bench_scpi";
    sim.scpiPort = FreeLoopbackPort();
    sim.process.Start(QenSimProcess::FindBesideExecutable(),
                      {"--quiet", "--scpi-port", std::to_string(sim.scpiPort), "--data-dir", dir.string()});
  }
  return sim;
}

// One SCPI connection: sends whole texts, reads lines and blocks, each wait bounded.
class ScpiClient {
 public:
  ScpiClient(unsigned short port, bool noDelay) : mFd(ConnectLoopback(port, noDelay)) {}
  ~ScpiClient() {
    if (mFd >= 0) close(mFd);
  }
  ScpiClient(const ScpiClient&) = delete;
  ScpiClient& operator=(const ScpiClient&) = delete;

  bool Ok() const { return mFd >= 0; }

  bool Send(const std::string& text) { return SendAll(mFd, text.data(), text.size()); }

  // The next line, without its terminator; false on a time-out or a closed connection.
  bool ReadLine(std::string& line) {
    std::size_t end;
    while ((end = mIn.find('\n')) == std::string::npos) {
      if (!Fill()) return false;
    }
    line.assign(mIn, 0, end);
    mIn.erase(0, end + 1);
    return true;
  }

  // The bytes of a definite-length block answer and its terminator.
  bool ReadBlock(std::string& bytes) {
    while (mIn.size() < 2 && Fill()) {
    }
    if (mIn.size() < 2 || mIn[0] != '#') return false;
    const std::size_t digits = static_cast<std::size_t>(mIn[1] - '0');
    while (mIn.size() < 2 + digits && Fill()) {
    }
    if (mIn.size() < 2 + digits) return false;
    const std::size_t length = std::strtoul(mIn.substr(2, digits).c_str(), nullptr, 10);
    const std::size_t total = 2 + digits + length + 1;
    mIn.reserve(total);
    while (mIn.size() < total && Fill()) {
    }
    if (mIn.size() < total) return false;
    bytes.assign(mIn, 2 + digits, length);
    mIn.erase(0, total);
    return true;
  }

  static bool SendAll(int fd, const char* data, std::size_t size) {
    while (size > 0) {
      ssize_t n = send(fd, data, size, MSG_NOSIGNAL);
      if (n <= 0) return false;
      data += n;
      size -= static_cast<std::size_t>(n);
    }
    return true;
  }

 private:
  bool Fill() {
    pollfd p{mFd, POLLIN, 0};
    if (poll(&p, 1, 30000) <= 0) return false;
    char buf[1 << 16];
    ssize_t n = recv(mFd, buf, sizeof buf, 0);
    if (n <= 0) return false;
    mIn.append(buf, static_cast<std::size_t>(n));
    return true;
  }

  int mFd;
  std::string mIn;
};

// A write and then a query, as two sends, the way a script's write() and query() go out.
bool WriteThenQuery(ScpiClient& client) {
  std::string line;
  return client.Send("CGR1:PER 2E-9\n") && client.Send("CGR1:PER?\n") && client.ReadLine(line) &&
         line == "2.000000000000E-09";
}

void BM_ScpiWriteQueryPairsNagleVsNoDelay(benchmark::State& state) {
  if (Sim().process.Port() == 0) return state.SkipWithError("qensim did not start");
  ScpiClient nagle(Sim().scpiPort, false);
  ScpiClient noDelay(Sim().scpiPort, true);
  if (!nagle.Ok() || !noDelay.Ok()) return state.SkipWithError("no SCPI connection");
  double nagleSeconds = 0;
  double noDelaySeconds = 0;
  for (auto _ : state) {
    const auto t0 = Clock::now();
    if (!WriteThenQuery(nagle)) return state.SkipWithError("pair with Nagle failed");
    nagleSeconds += Seconds(t0);
    const auto t1 = Clock::now();
    if (!WriteThenQuery(noDelay)) return state.SkipWithError("pair with TCP_NODELAY failed");
    noDelaySeconds += Seconds(t1);
  }
  const double n = static_cast<double>(state.iterations());
  state.counters["nagle_pairs_per_s"] = n / nagleSeconds;
  state.counters["nodelay_pairs_per_s"] = n / noDelaySeconds;
  state.counters["ratio"] = noDelaySeconds / nagleSeconds;
}

constexpr long kTraces = 64;
constexpr long kVectors = 16L * 1024 * 1024;
// Vectors per block: 64 rows of them fill the largest block exactly.
constexpr long kBlockVectors = SimSegment::kMaxBlockBytes * 8 / kTraces;

// The seconds a raw loopback connection takes to carry `bytes` bytes in blocks of `block`.
double RawCopySeconds(std::size_t bytes, std::size_t block) {
  int listener = socket(AF_INET, SOCK_STREAM, 0);
  sockaddr_in addr{};
  addr.sin_family = AF_INET;
  addr.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  bind(listener, reinterpret_cast<sockaddr*>(&addr), sizeof addr);
  listen(listener, 1);
  socklen_t len = sizeof addr;
  getsockname(listener, reinterpret_cast<sockaddr*>(&addr), &len);
  const auto t0 = Clock::now();
  std::thread sender([&] {
    int fd = ConnectLoopback(ntohs(addr.sin_port), true);
    const std::string chunk(block, '\x5a');
    for (std::size_t sent = 0; sent < bytes; sent += block) ScpiClient::SendAll(fd, chunk.data(), block);
    close(fd);
  });
  int fd = accept(listener, nullptr, nullptr);
  std::string buf(block, '\0');
  for (std::size_t got = 0; got < bytes;) {
    ssize_t n = recv(fd, buf.data(), buf.size(), 0);
    if (n <= 0) break;
    got += static_cast<std::size_t>(n);
  }
  const double seconds = Seconds(t0);
  sender.join();
  close(fd);
  close(listener);
  return seconds;
}

std::string DataCommand(const char* header, long v0, const std::string& tail) {
  return std::string(header) + " 0," + std::to_string(v0) + "," + std::to_string(kTraces - 1) + "," +
         std::to_string(v0 + kBlockVectors - 1) + tail;
}

void BM_ScpiSegmentUploadAndReadBackVsRawCopy(benchmark::State& state) {
  if (Sim().process.Port() == 0) return state.SkipWithError("qensim did not start");
  ScpiClient client(Sim().scpiPort, true);
  std::string line;
  if (!client.Send("EDIT:SEGM:OPEN? \"bench/big\"\n") || !client.ReadLine(line) || line != "1" ||
      !client.Send("EDIT:SEGM1:PATT:MOD:INS 0,TRAC,BEF,64;EDIT:SEGM1:PATT:MOD:INS 0,VECT,BEF,16777216;"
                   "EDIT:SEGM1:PATT:LENG?\n") ||
      !client.ReadLine(line) || line != "16777216")
    return state.SkipWithError("the segment was not made");
  const std::size_t blockBytes = static_cast<std::size_t>(SimSegment::kMaxBlockBytes);
  const std::string rows(blockBytes, '\xa5');
  const std::string header = "#8" + std::to_string(blockBytes);
  const std::size_t total = static_cast<std::size_t>(kTraces * kVectors / 8);
  double upSeconds = 0;
  double downSeconds = 0;
  double rawSeconds = 0;
  std::string back;
  for (auto _ : state) {
    auto t0 = Clock::now();
    for (long v0 = 0; v0 < kVectors; v0 += kBlockVectors) {
      if (!client.Send(DataCommand("EDIT:SEGM1:PATT:DATA", v0, "," + header)) || !client.Send(rows) ||
          !client.Send("\n"))
        return state.SkipWithError("upload failed");
    }
    if (!client.Send("SYST:ERR?\n") || !client.ReadLine(line) || line != "0,\"No error\"")
      return state.SkipWithError("the upload was refused");
    upSeconds += Seconds(t0);
    t0 = Clock::now();
    for (long v0 = 0; v0 < kVectors; v0 += kBlockVectors) {
      if (!client.Send(DataCommand("EDIT:SEGM1:PATT:DATA?", v0, ",BIN\n")) || !client.ReadBlock(back) || back != rows)
        return state.SkipWithError("read-back failed");
    }
    downSeconds += Seconds(t0);
    rawSeconds += RawCopySeconds(total, blockBytes);
  }
  const double mib = static_cast<double>(total) / (1024.0 * 1024.0) * static_cast<double>(state.iterations());
  state.counters["up_MiBps"] = mib / upSeconds;
  state.counters["down_MiBps"] = mib / downSeconds;
  state.counters["raw_MiBps"] = mib / rawSeconds;
  state.counters["up_vs_raw"] = upSeconds / rawSeconds;
  state.counters["down_vs_raw"] = downSeconds / rawSeconds;
}

}  // namespace

BENCHMARK(BM_ScpiWriteQueryPairsNagleVsNoDelay)->MinTime(2.0)->UseRealTime();
BENCHMARK(BM_ScpiSegmentUploadAndReadBackVsRawCopy)->Iterations(2)->UseRealTime()->Unit(benchmark::kMillisecond);
