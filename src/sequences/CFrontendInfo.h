#pragma once

#include <vector>

#include "sequences/CPortInfo.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

// The front-end information of the rack, as far as the system scheme draws it: the clock
// groups, the modules in each with model, kind and mainframe slot, and every module's ports
// with their class and number of terminals (channels).
//
// The reply of "%s:CONF:FRON?", as qensim writes it (docs/simulator.md): one list per clock
// group, (NUMBER,(module),...); each module ("PATH","MODEL",GEN|ANA,SLOT,(port),...); each port
// ("PATH","CLASS",TERMINALS). A module's path lies in its group (":CGR1:MOD2"), a port's in its
// module (":CGR1:MOD2:CONN1"); slots are unique.
//
// Static, beside CPortInfo: it is read once and again when the port information has changed
// since (a configuration read that differs), so that a poll costs nothing while the rack stays.
class CFrontendInfo {
 public:
  struct Port {
    Dstring path;
    Dstring portClass;  // "PDAT" data, "PCLK" clock
    long terminals = 0;
    bool operator==(const Port&) const = default;
  };
  struct Module {
    Dstring path;
    Dstring model;
    bool generator = false;
    long slot = 0;
    std::vector<Port> ports;
    bool operator==(const Module&) const = default;
  };
  struct Group {
    long number = 0;
    std::vector<Module> modules;
    bool operator==(const Group&) const = default;
  };

  // Reads the port information when it is not known, and the front-end information when it is
  // not known or the port information differs from the one it was read with.
  static int Update(ConditionList& cond);
  // Takes a reply; "GUI_FRONTEND_BAD_INFO" and status 1 when it is not of the form above,
  // leaving what was known.
  static int SetFrontend(const Dstring& reply, ConditionList& cond);
  // Forgets everything: the next Update asks the server again.
  static void Invalidate();
  static bool IsKnown() { return mKnown; }

  static const std::vector<Group>& GetGroups() { return mGroups; }
  // The module and port of a port path (exact); null when the rack has no such port.
  static const Port* FindPort(const Dstring& path, const Module** module = nullptr);

 private:
  static bool mKnown;
  static std::vector<Group> mGroups;
  static std::vector<CPortInfo::Port> mReadWith;  // the port information when it was read
};
