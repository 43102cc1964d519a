#pragma once

#include "data/OnOffStateDs.h"

// Whether the instrument's outputs are connected ("<handle>:SGEN:GLOB:CONN").
class ConnectDs : public OnOffStateDs {
 public:
  ConnectDs() : OnOffStateDs("ConnectDs", ":SGEN:GLOB:CONN") {}

  int Connect(ConditionList& list) { return Switch("Connect", true, list); }
  int Disconnect(ConditionList& list) { return Switch("Disconnect", false, list); }
  bool IsConnected() const { return IsOn(); }
};
