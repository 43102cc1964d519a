#pragma once

#include <map>
#include <memory>

#include "SimCommandModule.h"

// The bit error rate of every analyser data port (":CGR<n>:MOD<m>:CONN<k>:BER?", replied
// as "compared,errors,ratio"). Counting starts afresh with every start of the instrument and
// stops with it; each port compares one bit per clock of its group and sees errors at a ratio
// of its own, so that the figures differ between ports and grow believably while it runs; a
// port that no generator drives (SimCabling) compares nothing.
// "<port>:BER:RES" starts a port's counts afresh; with test control, "<port>:BER:INJ RATIO"
// sets the ratio its errors come at (0 goes back to the port's own).
class SimCabling;

class SimBerMeter : public SimCommandModule {
 public:
  // An analyser port that no generator drives compares nothing.
  explicit SimBerMeter(std::shared_ptr<const SimCabling> connections) : mConnections(std::move(connections)) {}

  bool RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) override;
  void Advance(SimContext& context) override;
  // The ratio a data port (":CGR1:MOD3:CONN1") sees errors at now: the injected one, else its own.
  double RatioFor(const Dstring& port) const;
  // A data port's whole errors so far, and how often its counts started afresh.
  double ErrorsOf(const Dstring& port, unsigned long& epoch) const;
  // Whether `port` (":CGR1:MOD3:CONN1", upper case) is an analyser data port.
  static bool IsPort(const Dstring& port, SimContext& context);

 private:
  struct Count {
    double compared = 0;
    double errors = 0;
    double injected = 0;  // a ratio set by test control, 0 when none
    unsigned long epoch = 0;
    // Starts the counts afresh, keeping the injected ratio.
    void Restart() { *this = Count{0, 0, injected, epoch + 1}; }
  };
  // The port's ":BER" parameter, or false when `rest` names none.
  static bool PortOf(const Dstring& rest, std::string_view suffix, SimContext& context, Dstring& header);
  // The error ratio of a port: 1E-7 on connector 1, ten times lower on each further one, and
  // a little different per module.
  static double RatioOf(const Dstring& header);
  static double ClockOf(const Dstring& header, SimContext& context);

  std::shared_ptr<const SimCabling> mConnections;
  std::map<Dstring, Count> mCounts;
  long long mLastMs = -1;
  bool mWasRunning = false;
};
