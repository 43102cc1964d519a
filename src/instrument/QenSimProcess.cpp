#include "instrument/QenSimProcess.h"

#include <chrono>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

namespace {

unsigned short PortOfFirstLine(const std::string& line) {
  auto colon = line.rfind(':');
  if (colon == std::string::npos) return 0;
  long port = std::strtol(line.c_str() + colon + 1, nullptr, 10);
  return port > 0 && port < 65536 ? static_cast<unsigned short>(port) : 0;
}

std::string ReadFirstLine(int fd, int timeoutMs) {
  std::string text;
  const auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(timeoutMs);
  while (text.find('\n') == std::string::npos && std::chrono::steady_clock::now() < deadline) {
    pollfd p{fd, POLLIN, 0};
    if (poll(&p, 1, 50) <= 0) continue;
    char buf[256];
    ssize_t n = read(fd, buf, sizeof buf);
    if (n <= 0) break;
    text.append(buf, static_cast<std::size_t>(n));
  }
  return text.substr(0, text.find('\n'));
}

}  // namespace

QenSimProcess::~QenSimProcess() { Stop(); }

bool QenSimProcess::Start(const std::string& program, const std::vector<std::string>& args, int timeoutMs) {
  Stop();
  int out[2];
  if (pipe(out) != 0) return false;
  std::vector<std::string> argv = {program, "--port", "0"};
  argv.insert(argv.end(), args.begin(), args.end());
  std::vector<char*> cargv;
  for (auto& a : argv) cargv.push_back(a.data());
  cargv.push_back(nullptr);
  const pid_t parent = getpid();
  mPid = fork();
  if (mPid == 0) {
    // A private simulator ends with the program that started it, however that program ends.
    prctl(PR_SET_PDEATHSIG, SIGTERM);
    if (getppid() != parent) _exit(0);
    dup2(out[1], STDOUT_FILENO);
    close(out[0]);
    close(out[1]);
    execvp(cargv[0], cargv.data());
    _exit(127);
  }
  close(out[1]);
  if (mPid > 0) mPort = PortOfFirstLine(ReadFirstLine(out[0], timeoutMs));
  close(out[0]);
  if (mPort == 0) Stop();
  return mPort != 0;
}

int QenSimProcess::WaitForExit(int timeoutMs) {
  for (int waited = 0; mPid > 0 && waited <= timeoutMs; waited += 10) {
    int status = 0;
    if (waitpid(mPid, &status, WNOHANG) == mPid) {
      mPid = -1;
      return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }
  return -1;
}

void QenSimProcess::Stop() {
  if (mPid > 0) {
    kill(mPid, SIGTERM);
    if (WaitForExit(3000) < 0 && mPid > 0) {
      kill(mPid, SIGKILL);
      waitpid(mPid, nullptr, 0);
    }
  }
  mPid = -1;
  mPort = 0;
}

std::string QenSimProcess::FindBesideExecutable() {
  std::error_code ec;
  auto self = std::filesystem::read_symlink("/proc/self/exe", ec);
  if (!ec) {
    auto dir = self.parent_path();
    for (const auto& candidate : {dir / "qensim", dir.parent_path() / "sim" / "qensim"}) {
      if (std::filesystem::exists(candidate, ec)) return candidate.string();
    }
  }
  return "qensim";
}
