#pragma once

#include "SimCommand.h"
#include "SimContext.h"

// A group of handle commands kept apart from the core of the command language (settings,
// measurements, segments, the sequence): the processor offers each command to its modules
// before it looks for a parameter of that header.
class SimCommandModule {
 public:
  virtual ~SimCommandModule() = default;

  // Runs `cmd`, whose header after the handle is `rest` (upper case, as ":MMEM:SETT:NEW");
  // false when the command is not this module's.
  virtual bool RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) = 0;
  // Called before every frame, so that a module can bring time-driven state up to date.
  virtual void Advance(SimContext&) {}
};
