#pragma once

#include <string>
#include <sys/types.h>
#include <vector>

// A private qensim process on a free loopback port: what `qengui --simulate` talks to, and
// what the integration tests start. The server is stopped when the object dies.
class QenSimProcess {
 public:
  QenSimProcess() = default;
  ~QenSimProcess();
  QenSimProcess(const QenSimProcess&) = delete;
  QenSimProcess& operator=(const QenSimProcess&) = delete;

  // Starts `program --port 0 <args>` and reads the port from its first line
  // ("... listening on ADDR:PORT"). Returns false when it did not come up within the time-out.
  bool Start(const std::string& program, const std::vector<std::string>& args, int timeoutMs = 20000);

  unsigned short Port() const { return mPort; }
  pid_t Pid() const { return mPid; }
  // Waits for the process to end by itself; its exit code, or -1 after the time-out.
  int WaitForExit(int timeoutMs);
  // SIGTERM, then SIGKILL if it does not go within three seconds.
  void Stop();

  // qensim beside the running program or in the build tree next to it, else "qensim" on PATH.
  static std::string FindBesideExecutable();

 private:
  pid_t mPid = -1;
  unsigned short mPort = 0;
};
