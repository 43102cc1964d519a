#pragma once

#include <iosfwd>

#include "support/ConditionList.h"
#include "support/Dstring.h"

// The command console: reads command lines and sends each through the one call path. A person
// at a terminal gets a greeting and a prompt; a script that feeds the input gets exactly one
// line per line it sent: "OK" for a write, the reply of a query, or "ERROR code,"text"" (as
// SYST:ERR? words an error) when the command failed.
class ConsoleHost {
 public:
  ConsoleHost(std::istream& in, std::ostream& out, bool interactive)
      : mIn(in), mOut(out), mInteractive(interactive) {}

  // The shell's code for a program ended by Ctrl+C.
  static constexpr int kInterruptedExitCode = 130;
  // Any command of the input failed.
  static constexpr int kCommandFailedExitCode = 1;

  // Runs until end of input, "quit" or Ctrl+C; returns the process exit code.
  int Run();
  // Handles one line ("::TRIG:MODE?" stands for ":<handle>:TRIG:MODE?"); false when the
  // console should end.
  bool HandleLine(const Dstring& line);
  // The output line of a command's outcome.
  static Dstring ResultLine(int status, const Dstring& reply, const ConditionList& list);

 private:
  void PrintHelp();

  std::istream& mIn;
  std::ostream& mOut;
  bool mInteractive;
  bool mFailed = false;
};
