#pragma once

#include <iosfwd>
#include <memory>
#include <utility>
#include <vector>

#include "data/QenDsView.h"
#include "support/ConditionList.h"
#include "support/DstringList.h"

class HeadlessToolkit;
class QenParamDs;

// The host without a display: runs the application's main loop and poll, and prints every
// change of the instrument's state and of the watched parameters, one line each behind its UTC
// time, until a signal or the time limit ends it.
class HeadlessHost {
 public:
  // `watch` holds headers without the handle (":TRIG:MODE"); `seconds` <= 0 runs until a signal.
  HeadlessHost(std::ostream& out, HeadlessToolkit& toolkit, DstringList watch, double seconds);
  ~HeadlessHost();

  // Expects uiapp started, connected and with its handle; returns the exit code.
  int Run();
  // Ends Run from a signal handler.
  static void RequestStop();
  // A --watch header the instrument cannot read.
  static constexpr int kBadWatchExitCode = 2;

 private:
  class Printer;

  std::ostream& mOut;
  HeadlessToolkit& mToolkit;
  DstringList mWatch;
  double mSeconds;
  // The printer tells of every change of any of `sources`, and prints its first line at once.
  void Watch(std::vector<QenDs*> sources, std::unique_ptr<Printer> printer, ConditionList& list);
  // Queries every watched header once; kBadWatchExitCode naming the first that fails.
  int CheckWatched();

  std::vector<std::unique_ptr<Printer>> mPrinters;
  std::vector<std::pair<QenDs*, Printer*>> mWatched;
  std::vector<QenParamDs*> mParams;
};
