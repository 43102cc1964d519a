#pragma once

#include <map>
#include <vector>

#include "SimCommandModule.h"
#include "SimRack.h"
#include "settings/SettingText.h"

// The cabling of the rack: which generator data port drives which analyser data port, whole
// ports, one cable per terminal. It is part of the setting; it starts, and a new setting starts,
// as the default wiring (the k-th analyser data port of a clock group is driven by the group's
// k-th generator data port, where the rules below allow it).
//   ":CONF:CONN:ADD "GEN","ANA""   connects; refused (nothing changes) when a port is unknown
//                                    (-224) or the rules forbid it (-221, the reason in the text)
//   ":CONF:CONN:DEL "GEN","ANA""   disconnects; -224 when there is no such connection
//   ":CONF:CONN?"                  ("GEN","ANA"),... in the configuration order of the analysers
// A rack forbids: a port that is not a data port, a generator as the receiver or an analyser as
// the driver, ports of different clock groups (the analyser samples with its group's clock),
// an analyser that is driven already, a generator that drives one already, and ports of
// different widths. The other handles hear ":CONF:CONN" after every change.
class SimCabling : public SimCommandModule {
 public:
  explicit SimCabling(const SimRack& rack);

  bool RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) override;
  // The generator port that drives an analyser port (upper case), empty when none.
  Dstring DriverOf(const Dstring& analyser) const;

  // analyser path → generator path
  using Drivers = std::map<Dstring, Dstring>;
  // The connections as a setting holds them, in the configuration order of the analysers.
  void Capture(SettingText& text) const;
  // The table the connections of `text` make: 0, or the SCPI error (-224 a port the rack does
  // not have, -221 a connection it forbids) with what is wrong and its line in `detail`.
  int Check(const SettingText& text, Drivers& out, Dstring& detail) const;
  void Take(Drivers drivers) { mDrivers = std::move(drivers); }
  // The default wiring (a new setting).
  void Reset() { mDrivers = DefaultWiring(); }

 private:
  Drivers DefaultWiring() const;
  // Why the rack forbids the connection with the table `drivers`, empty when it allows it.
  Dstring Refusal(const SimRack::Place& from, const SimRack::Place& to, const Drivers& drivers) const;
  void Add(const SimCommand& cmd, SimContext& context);
  void Delete(const SimCommand& cmd, SimContext& context);
  void List(SimContext& context) const;
  // The two ports of the arguments; queues the error and returns false when they are not two
  // quoted ports of the rack.
  bool ReadPorts(const SimCommand& cmd, SimContext& context, SimRack::Place& from, SimRack::Place& to) const;

  SimRack mRack;
  Drivers mDrivers;
};
