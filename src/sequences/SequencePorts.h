#pragma once

#include <vector>

#include "support/ConditionList.h"
#include "support/Dstring.h"

// What the sequence needs of the system configuration, as a value: whether there is a central
// module (which alone has sequence events), whether the instrument captures, and the type of
// every data port ("INPUT_PORT" for an analyser port). The sequence asks its port source for
// one whenever it needs it; the port information service is that source in the application.
struct SequencePorts {
  enum class Ask {
    Known,      // what is known, without asking the server
    IfUnknown,  // asks the server when nothing is known; its conditions are dropped
    Server,     // asks the server; its failure is the caller's
  };
  // Fills `out`; a status and conditions only for Ask::Server.
  using Source = int (*)(Ask ask, SequencePorts& out, ConditionList& cond);

  // The type text of data port `port` (from 1); null when there is no such port.
  const Dstring* DataPortType(unsigned long port) const {
    return port >= 1 && port <= dataPortTypes.size() ? &dataPortTypes[port - 1] : nullptr;
  }

  bool known = false;
  bool central = false;
  bool capture = false;
  std::vector<Dstring> dataPortTypes;
};
