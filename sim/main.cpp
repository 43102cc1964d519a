#include <cstdio>
#include <cstring>

#include "SimApp.h"

namespace {

constexpr const char* kUsage =
    "usage: qensim [--port N] [--scpi-port N] [--bind ADDR] [--config FILE] [--data-dir DIR] [--test-control]"
    " [--quiet]\n";

bool ReadPort(const char* text, SimOptions& options) {
  unsigned long port = 0;
  if (!Dstring(text).ToULong(port) || port > 65535) return false;
  options.mPort = static_cast<unsigned short>(port);
  return true;
}

bool ReadScpiPort(const char* text, SimOptions& options) {
  unsigned long port = 0;
  if (!Dstring(text).ToULong(port) || port > 65535) return false;
  options.mScpiPort = static_cast<int>(port);
  return true;
}

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
};

struct FlagOption {
  const char* name;
  bool SimOptions::*flag;
};

constexpr ValueOption kValueOptions[] = {
    {"--port", ReadPort}, {"--scpi-port", ReadScpiPort}, {"--bind", ReadBind}, {"--config", ReadConfig}, {"--data-dir", ReadDataDir}};
constexpr FlagOption kFlagOptions[] = {{"--test-control", &SimOptions::mTestControl},
                                       {"--quiet", &SimOptions::mQuiet}};

// Takes the option at argv[i] (and its value); returns the next index, or 0 on a bad option.
int ReadOption(int argc, char** argv, int i, SimOptions& options) {
  for (const FlagOption& f : kFlagOptions) {
    if (std::strcmp(argv[i], f.name) != 0) continue;
    options.*f.flag = true;
    return i + 1;
  }
  for (const ValueOption& v : kValueOptions) {
    if (std::strcmp(argv[i], v.name) != 0) continue;
    return i + 1 < argc && v.read(argv[i + 1], options) ? i + 2 : 0;
  }
  return 0;
}

}  // namespace

int main(int argc, char** argv) {
  SimOptions options;
  for (int i = 1; i < argc;) {
    if (std::strcmp(argv[i], "--help") == 0) {
      std::fputs(kUsage, stdout);
      return 0;
    }
    i = ReadOption(argc, argv, i, options);
    if (i == 0) {
      std::fputs(kUsage, stderr);
      return 2;
    }
  }
  return SimApp::Run(options);
}
