#pragma once

#include <vector>

#include "support/ConditionList.h"
#include "support/Dstring.h"

// The cabling the instrument holds: which generator data port drives which analyser data port
// ("%s:CONF:CONN?" replies ("GEN","ANA"),...). Add and Remove send the change and read the
// table back whether the server took it or not, so that what is kept is always what the server
// holds; a refusal comes back as the server's error in the condition list.
class CPortConnections {
 public:
  struct Connection {
    Dstring generator;
    Dstring analyser;
    bool operator==(const Connection&) const = default;
  };

  int Read(ConditionList& cond);
  // Takes a reply; "GUI_CONNECTIONS_BAD_LIST" and status 1 when it is not a list of pairs of
  // port paths with each analyser at most once, leaving what was known.
  int SetConnections(const Dstring& reply, ConditionList& cond);
  int Add(const Dstring& generator, const Dstring& analyser, ConditionList& cond);
  int Remove(const Dstring& generator, const Dstring& analyser, ConditionList& cond);

  const std::vector<Connection>& Get() const { return mConnections; }

  // Whether a changed name of the dirty flag means that the cabling may have changed.
  static bool NfyMatchDirtyFlag(const Dstring& name);

 private:
  // Sends "%s:CONF:CONN:<verb> "GEN","ANA"" and reads the table back.
  int Change(const char* verb, const Dstring& generator, const Dstring& analyser, ConditionList& cond);

  std::vector<Connection> mConnections;
};
