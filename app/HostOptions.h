#pragma once

#include <optional>
#include <string>
#include <vector>

#include "support/ConditionList.h"

// The command line of the qengui host.
struct HostOptions {
  enum class Mode { Gui, Console, Headless, Help, Version };
  static constexpr unsigned short kDefaultPort = 7130;

  Mode mode = Mode::Gui;
  bool simulate = false;
  // The GUI was given no server: it asks with the connect dialog.
  bool askServer = false;
  std::string host = "127.0.0.1";
  unsigned short port = kDefaultPort;
  std::string resource = "QEN1";
  std::optional<std::string> logDir;
  std::optional<unsigned long> paramSet;
  std::vector<std::string> watch;
  double seconds = 0.0;
  // --reply-timeout: how long a reply is awaited, in seconds (else QEN_REPLY_TIMEOUT, or 30).
  std::optional<double> replyTimeout;
  // --screenshot: the PNG to write, the windows to open first and the window size.
  std::string screenshot;
  std::vector<std::string> open;
  int width = 1280;
  int height = 800;

  // Returns 0, or 1 with a condition naming the bad argument.
  static int Parse(const std::vector<std::string>& args, HostOptions& out, ConditionList& list);
  // Names every window --open takes, from the table the main window opens them by.
  static std::string Usage();
};
