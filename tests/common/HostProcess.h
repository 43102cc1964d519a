#pragma once

#include <string>
#include <sys/types.h>
#include <vector>

// The built qengui host as a child process whose output a test reads as it comes.
class HostProcess {
 public:
  // `input` is the host's standard input; the pipe stays open, so the host never reads its end.
  explicit HostProcess(const std::vector<std::string>& args, const std::string& input = {});
  ~HostProcess();
  HostProcess(const HostProcess&) = delete;
  HostProcess& operator=(const HostProcess&) = delete;

  // Reads until the output holds `text` at or after `from`; false after the time-out or when
  // the host ended.
  bool WaitForOutput(const std::string& text, int timeoutMs, std::size_t from = 0);
  // Its exit code, or -1 after the time-out.
  int WaitForExit(int timeoutMs);
  void Signal(int signal);
  const std::string& Output() const { return mOutput; }

 private:
  bool ReadSome(int timeoutMs);

  pid_t mPid = -1;
  int mFd = -1;
  int mInput = -1;
  std::string mOutput;
};
