#pragma once

#include "support/Dstring.h"

// Registers the VXI-11 core channel with the machine's port mapper (program 100000, version
// 2, on the loopback at port 111), where one runs and takes it, and takes the registration
// back. Every step waits at most kTimeoutMs.
class SimPortMapperClient {
 public:
  static constexpr unsigned short kPort = 111;
  static constexpr int kTimeoutMs = 1000;

  // PMAPPROC_SET (or, with `set` false, PMAPPROC_UNSET) of the core channel over TCP at
  // `vxi11Port`. True when the port mapper took it; otherwise `why` says what went wrong.
  static bool Register(bool set, unsigned short vxi11Port, Dstring& why);
};
