#pragma once

#include "data/GlobalStateDs.h"

// A state source whose setting is ON or OFF. Every operation opens the guard named after
// itself, as "RunStopDs::Run".
class OnOffStateDs : public GlobalStateDs {
 public:
  int UpdateFromFW(ConditionList& list) override;

 protected:
  OnOffStateDs(const char* className, const char* setting) : GlobalStateDs(setting), mClassName(className) {}

  bool IsOn() const { return mOn; }
  // Sends ON or OFF and keeps it as the value.
  int Switch(const char* operation, bool on, ConditionList& list);

 private:
  Dstring GuardName(const char* operation) const { return mClassName + "::" + operation; }

  Dstring mClassName;
  bool mOn = false;
};
