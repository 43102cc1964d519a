#include "common/HostProcess.h"

#include <chrono>
#include <cstdlib>
#include <csignal>
#include <poll.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

HostProcess::HostProcess(const std::vector<std::string>& args, const std::string& input) {
  int out[2];
  int in[2] = {-1, -1};
  if (pipe(out) != 0) return;
  if (!input.empty() && pipe(in) != 0) return;
  std::vector<std::string> argv = {QENGUI_PATH};
  argv.insert(argv.end(), args.begin(), args.end());
  // The host keeps its registry under the configuration directory: never the user's own.
  const std::string config = "/tmp/qengui-test-config-" + std::to_string(::getpid());
  mPid = fork();
  if (mPid == 0) {
    setenv("XDG_CONFIG_HOME", config.c_str(), 1);
    dup2(out[1], STDOUT_FILENO);
    dup2(out[1], STDERR_FILENO);
    close(out[0]);
    close(out[1]);
    if (in[0] >= 0) {
      dup2(in[0], STDIN_FILENO);
      close(in[0]);
      close(in[1]);
    }
    std::vector<char*> cargv;
    for (auto& a : argv) cargv.push_back(a.data());
    cargv.push_back(nullptr);
    execv(cargv[0], cargv.data());
    _exit(127);
  }
  close(out[1]);
  mFd = out[0];
  if (in[0] >= 0) {
    close(in[0]);
    mInput = in[1];
    // A short write shows in the host's output, which every test reads.
    [[maybe_unused]] const ssize_t written = write(mInput, input.data(), input.size());
  }
}

HostProcess::~HostProcess() {
  if (mPid > 0) {
    kill(mPid, SIGKILL);
    waitpid(mPid, nullptr, 0);
  }
  if (mFd >= 0) close(mFd);
  if (mInput >= 0) close(mInput);
}

bool HostProcess::ReadSome(int timeoutMs) {
  pollfd p{mFd, POLLIN, 0};
  if (poll(&p, 1, timeoutMs) <= 0) return true;
  char buf[4096];
  ssize_t n = read(mFd, buf, sizeof buf);
  if (n <= 0) return false;
  mOutput.append(buf, static_cast<std::size_t>(n));
  return true;
}

bool HostProcess::WaitForOutput(const std::string& text, int timeoutMs, std::size_t from) {
  const auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(timeoutMs);
  while (mOutput.find(text, from) == std::string::npos) {
    if (std::chrono::steady_clock::now() >= deadline || !ReadSome(50)) return mOutput.find(text, from) != std::string::npos;
  }
  return true;
}

int HostProcess::WaitForExit(int timeoutMs) {
  for (int waited = 0; mPid > 0 && waited <= timeoutMs; waited += 20) {
    ReadSome(0);
    int status = 0;
    if (waitpid(mPid, &status, WNOHANG) == mPid) {
      mPid = -1;
      while (ReadSome(0) && mFd >= 0) {
        pollfd p{mFd, POLLIN, 0};
        if (poll(&p, 1, 0) <= 0) break;
      }
      return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
  return -1;
}

void HostProcess::Signal(int signal) {
  if (mPid > 0) kill(mPid, signal);
}
