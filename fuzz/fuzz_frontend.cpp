// Arbitrary text into the readers of the system scheme: the front-end information and the
// connection list.
//  - Either a reply is read, or it is refused with one condition and what was known stays.
//  - What is read keeps the rack's shape (modules within their group, ports within their module,
//    slots unique, at least one terminal), and written back in the server's form it reads back
//    the same.
#include <cstddef>
#include <cstdint>
#include <set>
#include <string_view>

#include "sequences/CFrontendInfo.h"
#include "sequences/CPortConnections.h"
#include "support/DataItem.h"

namespace {

void Check(bool ok) {
  if (!ok) __builtin_trap();
}

Dstring Written(const std::vector<CFrontendInfo::Group>& groups) {
  Dstring out;
  for (const CFrontendInfo::Group& g : groups) {
    out += Dstring::Format("%s(%ld", out.empty() ? "" : ",", g.number);
    for (const CFrontendInfo::Module& m : g.modules) {
      out += Dstring::Format(",(\"%s\",%s,%s,%ld", m.path.c_str(),
                             DataItem::MakeString(m.model).AsExpression().c_str(),
                             m.generator ? "GEN" : "ANA", m.slot);
      for (const CFrontendInfo::Port& p : m.ports) {
        out += Dstring::Format(",(\"%s\",\"%s\",%ld)", p.path.c_str(), p.portClass.c_str(), p.terminals);
      }
      out += ")";
    }
    out += ")";
  }
  return out;
}

void CheckFrontend(const Dstring& text) {
  static const Dstring kKnown = "(1,(\":CGR1:MOD1\",\"K\",GEN,1,(\":CGR1:MOD1:CONN1\",\"PDAT\",8)))";
  ConditionList list;
  Check(CFrontendInfo::SetFrontend(kKnown, list) == 0);
  const std::vector<CFrontendInfo::Group> before = CFrontendInfo::GetGroups();
  if (CFrontendInfo::SetFrontend(text, list) != 0) {
    Check(list.Size() == 1 && CFrontendInfo::GetGroups() == before);
    return;
  }
  std::set<long> slots;
  for (const CFrontendInfo::Group& g : CFrontendInfo::GetGroups()) {
    for (const CFrontendInfo::Module& m : g.modules) {
      Check(m.path.StartsWith(Dstring::Format(":CGR%ld:MOD", g.number)) && slots.insert(m.slot).second);
      for (const CFrontendInfo::Port& p : m.ports)
        Check(p.path.StartsWith(m.path + ":CONN") && p.terminals >= 1);
    }
  }
  const std::vector<CFrontendInfo::Group> read = CFrontendInfo::GetGroups();
  Check(CFrontendInfo::SetFrontend(Written(read), list) == 0 && CFrontendInfo::GetGroups() == read);
}

void CheckConnections(const Dstring& text) {
  CPortConnections connections;
  ConditionList list;
  if (connections.SetConnections(text, list) != 0) {
    Check(list.Size() == 1 && connections.Get().empty());
    return;
  }
  std::set<Dstring> analysers;
  for (const CPortConnections::Connection& c : connections.Get()) {
    Check(c.generator != c.analyser && analysers.insert(c.analyser).second);
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const Dstring text(std::string_view(reinterpret_cast<const char*>(data), size));
  CheckFrontend(text);
  CheckConnections(text);
  CFrontendInfo::Invalidate();
  return 0;
}
