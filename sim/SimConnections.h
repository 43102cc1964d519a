#pragma once

#include <map>
#include <vector>

#include "SimCommandModule.h"
#include "SimRack.h"

// The cabling of the rack: which generator data port drives which analyser data port, whole
// ports, one cable per terminal. It belongs to the instrument, not to a setting, and lasts as
// long as the process; it starts as the default wiring (the k-th analyser data port of a clock
// group is driven by the group's k-th generator data port, where the rules below allow it).
//   ":CONF:CONN:ADD "GEN","ANA""   connects; refused (nothing changes) when a port is unknown
//                                    (-224) or the rules forbid it (-221, the reason in the text)
//   ":CONF:CONN:DEL "GEN","ANA""   disconnects; -224 when there is no such connection
//   ":CONF:CONN?"                  ("GEN","ANA"),... in the configuration order of the analysers
// A rack forbids: a port that is not a data port, a generator as the receiver or an analyser as
// the driver, ports of different clock groups (the analyser samples with its group's clock),
// an analyser that is driven already, a generator that drives one already, and ports of
// different widths. The other handles hear ":CONF:CONN" after every change.
class SimConnections : public SimCommandModule {
 public:
  explicit SimConnections(const SimRack& rack);

  bool RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) override;
  // The generator port that drives an analyser port (upper case), empty when none.
  Dstring DriverOf(const Dstring& analyser) const;

 private:
  // Why the rack forbids the connection, empty when it allows it.
  Dstring Refusal(const SimRack::Place& from, const SimRack::Place& to) const;
  void Add(const SimCommand& cmd, SimContext& context);
  void Delete(const SimCommand& cmd, SimContext& context);
  void List(SimContext& context) const;
  // The two ports of the arguments; queues the error and returns false when they are not two
  // quoted ports of the rack.
  bool ReadPorts(const SimCommand& cmd, SimContext& context, SimRack::Place& from, SimRack::Place& to) const;

  SimRack mRack;
  std::map<Dstring, Dstring> mDrivers;  // analyser path → generator path
};
