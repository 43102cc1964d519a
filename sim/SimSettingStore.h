#pragma once

#include "SimCommandModule.h"

// The instrument's settings: ":MMEM:SETT:NEW" starts a new setting, every parameter back at
// the value the configuration gives it, and every client hears that everything changed.
class SimSettingStore : public SimCommandModule {
 public:
  // `defaults` is the parameter table as configured, before any client wrote to it.
  explicit SimSettingStore(SimParamTable defaults) : mDefaults(std::move(defaults)) {}

  bool RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) override;

 private:
  SimParamTable mDefaults;
};
