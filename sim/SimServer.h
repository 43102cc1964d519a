#pragma once

#include <map>
#include <memory>
#include <string>
#include <vector>

#include "SimClock.h"
#include "SimCommandProcessor.h"
#include "SimConnection.h"
#include "support/ConditionList.h"

// The TCP side of the simulator: one thread, one poll loop, non-blocking sockets. Frames go
// to the command processor; replies go back in order of readiness, late ones by timer.
class SimServer {
 public:
  SimServer(SimCommandProcessor& processor, const SimClock& clock, bool quiet);
  ~SimServer();
  SimServer(const SimServer&) = delete;
  SimServer& operator=(const SimServer&) = delete;

  // Opens the listening socket; port 0 picks a free one. 0, or 1 with a condition.
  int Listen(const Dstring& address, unsigned short port, ConditionList& list);
  // The address and port actually bound, as "ADDR:PORT".
  const Dstring& GetEndpoint() const { return mEndpoint; }
  // Opens the raw SCPI socket as well (newline-terminated messages); port 0 picks a free one.
  int ListenScpi(const Dstring& address, unsigned short port, ConditionList& list);
  const Dstring& GetScpiEndpoint() const { return mScpiEndpoint; }
  // Opens the VXI-11 core channel (ONC RPC over TCP), and a port mapper that names its port.
  int ListenVxi11(const Dstring& address, unsigned short port, ConditionList& list);
  const Dstring& GetVxi11Endpoint() const { return mVxi11Endpoint; }
  unsigned short GetVxi11Port() const { return mVxi11Port; }
  int ListenPortMapper(const Dstring& address, unsigned short port, ConditionList& list);
  const Dstring& GetPortMapperEndpoint() const { return mPortMapperEndpoint; }

  // SIGINT and SIGTERM make Run return; SIGPIPE is ignored. Call once, before Run.
  static void InstallSignalHandlers();
  // Serves until a stop signal or a test-control "die". Returns the exit code.
  int Run();

 private:
  struct Timer {
    long long dueMs;
    int connection;
    std::string bytes;
  };

  enum class Kind { Frames, Scpi, Vxi11, PortMapper };
  void Accept(int listenFd, Kind kind);
  void Serve(SimConnection& connection, short events);
  void HandleFrames(SimConnection& connection);
  void HandleScpi(SimConnection& connection);
  void HandleRpc(SimConnection& connection);
  void RunHeld(SimConnection& connection);
  void TickScpi();
  void FireTimers();
  // Closes the connections that are done (also those whose client finished sending and has
  // all its answers) and forgets the closed ones.
  void Reap();
  bool HasTimers(int connection) const;
  int PollTimeoutMs() const;
  void Log(const char* what, int connection) const;

  SimCommandProcessor& mProcessor;
  const SimClock& mClock;
  bool mQuiet;
  int mListenFd = -1;
  Dstring mEndpoint;
  int mScpiFd = -1;
  Dstring mScpiEndpoint;
  int mVxi11Fd = -1;
  Dstring mVxi11Endpoint;
  unsigned short mVxi11Port = 0;
  int mPortMapperFd = -1;
  Dstring mPortMapperEndpoint;
  int mNextId = 1;
  bool mDie = false;
  std::map<int, std::unique_ptr<SimConnection>> mConnections;
  std::vector<Timer> mTimers;
};
