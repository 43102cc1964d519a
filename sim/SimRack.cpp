#include "SimRack.h"

void SimRack::AddModule(const Module& module) {
  mGroups.back().modules.push_back(module);
}

void SimRack::AddPort(const Port& port) {
  mGroups.back().modules.back().ports.push_back(port);
}

bool SimRack::Find(const Dstring& path, Place& place) const {
  const Dstring wanted = path.ToUpper();
  for (const Group& g : mGroups) {
    for (const Module& m : g.modules) {
      for (const Port& p : m.ports) {
        if (p.path == wanted) {
          place = Place{&g, &m, &p};
          return true;
        }
      }
    }
  }
  return false;
}

Dstring SimRack::Format() const {
  Dstring out;
  for (const Group& g : mGroups) {
    if (!out.empty()) out += ",";
    out += Dstring::Format("(%ld", g.number);
    for (const Module& m : g.modules) {
      out += Dstring::Format(",(\"%s\",\"%s\",%s,%ld", m.path.c_str(), m.model.c_str(),
                             m.generator ? "GEN" : "ANA", m.slot);
      for (const Port& p : m.ports) {
        out += Dstring::Format(",(\"%s\",\"%s\",%ld)", p.path.c_str(), p.type.c_str(), p.terminals);
      }
      out += ")";
    }
    out += ")";
  }
  return out;
}
