#pragma once

#include <iosfwd>

#include "support/Dstring.h"

// The command console: reads command lines, sends each through the one call path and prints
// the reply and the drained error queue.
class ConsoleHost {
 public:
  ConsoleHost(std::istream& in, std::ostream& out) : mIn(in), mOut(out) {}

  // The shell's code for a program ended by Ctrl+C.
  static constexpr int kInterruptedExitCode = 130;

  // Runs until end of input, "quit" or Ctrl+C; returns the process exit code.
  int Run();
  // Handles one line ("::TRIG:MODE?" stands for ":<handle>:TRIG:MODE?"); false when the
  // console should end.
  bool HandleLine(const Dstring& line);

 private:
  void PrintHelp();

  std::istream& mIn;
  std::ostream& mOut;
};
