#include <cstdio>
#include <cstring>

#include "SimApp.h"

namespace {

constexpr const char* kUsage =
    "usage: qensim [options]\n"
    "  --port N            the framed protocol's port (7130; 0 picks a free one, named on the first line)\n"
    "  --scpi-port N       also a raw SCPI socket on port N (5025 by convention; 0 picks a free one)\n"
    "  --vxi11-port N      also the VXI-11 core channel, ONC RPC over TCP on port N (0 picks a free one);\n"
    "                      the links carry the same SCPI session as the raw socket. It is registered\n"
    "                      with the machine's port mapper on 127.0.0.1:111 where one runs\n"
    "  --portmap-port N    answer the port mapper (program 100000, version 2) on port N instead,\n"
    "                      naming the VXI-11 port: 111 is where VXI-11 clients ask (root, and no\n"
    "                      other port mapper on it); needs --vxi11-port\n"
    "  --bind ADDR         the address every socket listens on (127.0.0.1; 0.0.0.0 or :: for all)\n"
    "  --config FILE       the instrument's configuration (else the one built in)\n"
    "  --data-dir DIR      where segments and settings are stored (else $XDG_DATA_HOME/qensim\n"
    "                      or ~/.local/share/qensim)\n"
    "  --test-control      accept the :TEST: commands that tests use to inject faults\n"
    "  --quiet             no log of clients on standard error\n"
    "  --version           print the version and end\n"
    "  --help              this text\n";

bool ReadPortNumber(const char* text, int& port) {
  unsigned long value = 0;
  if (!Dstring(text).ToULong(value) || value > 65535) return false;
  port = static_cast<int>(value);
  return true;
}

bool ReadPort(const char* text, SimOptions& options) {
  int port = 0;
  if (!ReadPortNumber(text, port)) return false;
  options.mPort = static_cast<unsigned short>(port);
  return true;
}

bool ReadScpiPort(const char* text, SimOptions& options) { return ReadPortNumber(text, options.mScpiPort); }
bool ReadVxi11Port(const char* text, SimOptions& options) { return ReadPortNumber(text, options.mVxi11Port); }
bool ReadPortMapperPort(const char* text, SimOptions& options) { return ReadPortNumber(text, options.mPortMapperPort); }

bool ReadBind(const char* text, SimOptions& options) {
  options.mBind = text;
  return true;
}

bool ReadConfig(const char* text, SimOptions& options) {
  options.mConfigPath = text;
  return true;
}

bool ReadDataDir(const char* text, SimOptions& options) {
  options.mDataDir = text;
  return true;
}

struct ValueOption {
  const char* name;
  bool (*read)(const char*, SimOptions&);
  const char* value;  // what the value must be, for the message when it is not
};

struct FlagOption {
  const char* name;
  bool SimOptions::*flag;
};

constexpr const char* kPortValue = "a port number 0..65535";
constexpr ValueOption kValueOptions[] = {{"--port", ReadPort, kPortValue},
                                         {"--scpi-port", ReadScpiPort, kPortValue},
                                         {"--vxi11-port", ReadVxi11Port, kPortValue},
                                         {"--portmap-port", ReadPortMapperPort, kPortValue},
                                         {"--bind", ReadBind, "an address"},
                                         {"--config", ReadConfig, "a file"},
                                         {"--data-dir", ReadDataDir, "a directory"}};
constexpr FlagOption kFlagOptions[] = {{"--test-control", &SimOptions::mTestControl},
                                       {"--quiet", &SimOptions::mQuiet}};

int Refuse(const char* what, const char* name, const char* value = nullptr) {
  std::fprintf(stderr, "qensim: %s %s%s%s\n%s", what, name, value ? " needs " : "", value ? value : "", kUsage);
  return 0;
}

// Takes the option at argv[i] (and its value); returns the next index, or 0 after saying
// what is wrong with it.
int ReadOption(int argc, char** argv, int i, SimOptions& options) {
  for (const FlagOption& f : kFlagOptions) {
    if (std::strcmp(argv[i], f.name) != 0) continue;
    options.*f.flag = true;
    return i + 1;
  }
  for (const ValueOption& v : kValueOptions) {
    if (std::strcmp(argv[i], v.name) != 0) continue;
    if (i + 1 < argc && v.read(argv[i + 1], options)) return i + 2;
    return Refuse("option", v.name, v.value);
  }
  return Refuse("unknown option", argv[i]);
}

}  // namespace

int main(int argc, char** argv) {
  SimOptions options;
  for (int i = 1; i < argc;) {
    if (std::strcmp(argv[i], "--help") == 0) {
      std::fputs(kUsage, stdout);
      return 0;
    }
    if (std::strcmp(argv[i], "--version") == 0) {
      std::printf("qensim %s\n", QENSIM_VERSION);
      return 0;
    }
    i = ReadOption(argc, argv, i, options);
    if (i == 0) return 2;
  }
  if (options.mPortMapperPort >= 0 && options.mVxi11Port < 0) {
    std::fprintf(stderr, "qensim: --portmap-port needs --vxi11-port\n");
    return 2;
  }
  return SimApp::Run(options);
}
