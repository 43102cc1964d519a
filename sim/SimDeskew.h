#pragma once

#include <vector>

#include "SimTimedTask.h"

// The automatic deskew (":SYST:DESK", see SimTimedTask): every data port in turn is measured,
// 0.4 s each, and its delay (":PULS:DEL") set to what evens out its skew, which every client
// hears as a change of that parameter. A cancelled deskew puts back the delays it had set, so
// that nothing is left half done.
class SimDeskew : public SimTimedTask {
 public:
  SimDeskew() : SimTimedTask(":SYST:DESK", 0.4) {}

 protected:
  std::size_t Begin(SimContext& context) override;
  void ItemDone(std::size_t item, SimContext& context) override;
  void Aborted(std::size_t done, SimContext& context) override;
  bool RunTaskCommand(const Dstring&, const SimCommand&, SimContext&) override { return false; }

 private:
  struct Port {
    std::size_t index;  // of its ":PULS:DEL" parameter
    Dstring before;     // the delay before the deskew
  };
  // The delay that evens out a port's skew: a few tens of picoseconds, different per port.
  static Dstring DelayOf(const Dstring& header);
  static void Write(std::size_t index, const Dstring& text, SimContext& context);

  std::vector<Port> mPorts;
};
