#pragma once

#include "support/ConditionList.h"

class SettingMRU;
class StartUpConfig;
class ToolkitPort;

// The first setting of a session, as the start-up configuration of the parameter set asks:
// load the configured setting (recording it in the system profile as OPENSETTING_NAME and
// OPENSETTING_CABLEDELAY, and first in the recently used list) or start a new one; then read
// the setting's profile. There is no start-up dialog yet: when the configuration asks for it,
// or Shift is held, "GUI_STARTUP_NO_DIALOG" says so and the configured start is made. A
// configured load that cannot be sent falls back to a new setting.
//
// Shows nothing: every condition worth telling ends in `list`. 0 when the setting was loaded
// or started and everything about it recorded; otherwise the first failure.
class SettingStartUp {
 public:
  static int Run(unsigned long paramSet, ToolkitPort& toolkit, SettingMRU& mru, ConditionList& list);

 private:
  static int Load(const StartUpConfig& config, ConditionList& list);
  static int Record(const StartUpConfig& config, SettingMRU& mru, ConditionList& list);
  static int StartNew(ConditionList& list);
};
