#pragma once

#include <optional>
#include <string>
#include <vector>

#include "support/ConditionList.h"

// The command line of the qengui host.
struct HostOptions {
  enum class Mode { Console, Headless, Help };

  Mode mode = Mode::Console;
  bool simulate = false;
  std::string host = "127.0.0.1";
  unsigned short port = 7130;
  std::string resource = "QEN1";
  std::optional<std::string> logDir;
  std::optional<unsigned long> paramSet;
  std::vector<std::string> watch;
  double seconds = 0.0;

  // Returns 0, or 1 with a condition naming the bad argument.
  static int Parse(const std::vector<std::string>& args, HostOptions& out, ConditionList& list);
  static const char* Usage();
};
