#include "data/OnOffStateDs.h"

#include "support/FWBlocker.h"

int OnOffStateDs::UpdateFromFW(ConditionList& list) {
  const Dstring name = GuardName("UpdateFromFW");
  FWBlocker guard(name, list);
  if (int status = guard.Block()) return status;
  Dstring reply;
  if (int status = Query(reply, list)) return status;
  return Change(mOn, reply == "ON", list);
}

int OnOffStateDs::Switch(const char* operation, bool on, ConditionList& list) {
  const Dstring name = GuardName(operation);
  FWBlocker guard(name, list);
  if (int status = guard.Block()) return status;
  if (int status = Send(on ? "ON" : "OFF", list)) return status;
  return Change(mOn, on, list);
}
