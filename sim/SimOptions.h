#pragma once

#include "support/Dstring.h"

// The command line of qensim.
class SimOptions {
 public:
  static constexpr unsigned short kDefaultPort = 7130;

  unsigned short mPort = kDefaultPort;
  int mScpiPort = -1;  // the raw SCPI socket; -1 for none, 0 for a free port
  int mVxi11Port = -1;       // the VXI-11 core channel; -1 for none, 0 for a free port
  int mPortMapperPort = -1;  // the port mapper qensim answers itself; -1 for none, 0 for a free port
  Dstring mBind = "127.0.0.1";
  Dstring mConfigPath;  // empty: the configuration built into the program
  Dstring mDataDir;     // empty: the per-user default
  bool mTestControl = false;
  bool mQuiet = false;
};
