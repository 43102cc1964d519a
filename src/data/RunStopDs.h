#pragma once

#include "data/OnOffStateDs.h"

// Whether the instrument runs ("<handle>:SGEN:GLOB:INIT:CONT").
class RunStopDs : public OnOffStateDs {
 public:
  RunStopDs() : OnOffStateDs("RunStopDs", ":SGEN:GLOB:INIT:CONT") {}

  int Run(ConditionList& list) { return Switch("Run", true, list); }
  int Stop(ConditionList& list) { return Switch("Stop", false, list); }
  bool IsRunning() const { return IsOn(); }
};
