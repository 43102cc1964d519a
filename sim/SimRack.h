#pragma once

#include <vector>

#include "support/Dstring.h"

// The rack as the configuration describes it: the clock groups, their modules (model, kind and
// the slot of the mainframe they sit in) and each module's ports (type and terminals). It is what
// ":CONF:FRON?" answers and what the connection table checks a connection against.
class SimRack {
 public:
  struct Port {
    Dstring path;  // ":CGR1:MOD1:CONN1"
    Dstring type;  // "PDAT", "PCLK"
    long terminals = 1;
  };
  struct Module {
    Dstring path;  // ":CGR1:MOD1"
    Dstring model;
    bool generator = false;
    long slot = 0;
    std::vector<Port> ports;
  };
  struct Group {
    long number = 0;
    std::vector<Module> modules;
  };
  // Where a port sits.
  struct Place {
    const Group* group = nullptr;
    const Module* module = nullptr;
    const Port* port = nullptr;
  };

  void AddGroup(long number) { mGroups.push_back(Group{number, {}}); }
  // Into the last group.
  void AddModule(const Module& module);
  // Into the last module of the last group.
  void AddPort(const Port& port);

  const std::vector<Group>& GetGroups() const { return mGroups; }
  // The port of that path (any case); false when the rack has none.
  bool Find(const Dstring& path, Place& place) const;
  // The reply to ":CONF:FRON?": one list per clock group, (NUMBER,(module),...), each module
  // ("PATH","MODEL",GEN|ANA,SLOT,(port),...), each port ("PATH","TYPE",TERMINALS).
  Dstring Format() const;

 private:
  std::vector<Group> mGroups;
};
