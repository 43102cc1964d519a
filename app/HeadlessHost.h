#pragma once

#include <iosfwd>
#include <memory>
#include <vector>

#include "data/QenDsView.h"
#include "support/ConditionList.h"
#include "support/DstringList.h"

class HeadlessToolkit;
class QenParamDs;

// The host without a display: runs the application's main loop and poll, and prints every
// change of the instrument's state and of the watched parameters, one line each, until a
// signal or the time limit ends it.
class HeadlessHost {
 public:
  // `watch` holds headers without the handle (":TRIG:MODE"); `seconds` <= 0 runs until a signal.
  HeadlessHost(std::ostream& out, HeadlessToolkit& toolkit, DstringList watch, double seconds);
  ~HeadlessHost();

  // Expects uiapp started, connected and with its handle; returns the exit code.
  int Run();
  // Ends Run from a signal handler.
  static void RequestStop();

 private:
  class Printer;

  std::ostream& mOut;
  HeadlessToolkit& mToolkit;
  DstringList mWatch;
  double mSeconds;
  void Watch(QenDs* source, std::unique_ptr<Printer> printer, unsigned tell, ConditionList& list);

  std::vector<std::unique_ptr<Printer>> mPrinters;
  std::vector<QenDs*> mWatched;
  std::vector<QenParamDs*> mParams;
};
