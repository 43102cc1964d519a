#pragma once

#include <cstddef>
#include <vector>

#include "SimParamTable.h"
#include "support/Dstring.h"

// What the sequence commands need of the rack, read from the parameter table, which is all
// the simulator keeps of its configuration (docs/simulator.md, "Sequence"):
//  - a port is every ":CGRn:MODm:CONNk" that parameters are given under, in table order;
//    one with a ":DIV" parameter is a clock port (class PCLK), any other a data port (PDAT);
//    a data port with a ":VOLT:THR" parameter is an analyser port (INPUT_PORT), any other
//    port an OUTPUT_PORT; its model is its module's ":TYPE";
//  - the system has a central module when the top-level parameter ":CENT:TYPE" exists; its
//    value is the central module's model;
//  - the measurement mode is the value of the top-level parameter ":MEAS:MODE" when it
//    exists, else PATT;
//  - the sequencer has 4 loop levels with a central module and 3 without.
class SimSequenceConfig {
 public:
  struct Port {
    Dstring path;
    Dstring portClass;
    Dstring type;
    Dstring model;
  };

  explicit SimSequenceConfig(const SimParamTable& params);

  bool HasCentral() const { return !mCentral.empty(); }
  const Dstring& GetCentral() const { return mCentral; }
  const std::vector<Port>& GetPorts() const { return mPorts; }
  unsigned long NumDataPorts() const;
  unsigned long LoopLevels() const { return HasCentral() ? 4 : 3; }
  // The mode word as the parameters hold it now.
  Dstring Mode(const SimParamTable& params) const;
  // The reply to ":SGEN:GLOB:CONF?": "MODE","CENTRAL",("PATH","CLASS","TYPE","MODEL"),...
  Dstring Format(const SimParamTable& params) const;

 private:
  Dstring mCentral;
  std::vector<Port> mPorts;
  std::size_t mModeIndex = static_cast<std::size_t>(-1);
};
