#include "sequences/CPortConnections.h"

#include <set>

#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "support/ConditionListLoader.h"
#include "support/LispList.h"
#include "support/ParserExpression.h"

namespace {

bool PortPath(const LispList& e, Dstring& out) {
  if (!e.IsItem() || e.GetItem().GetType() != DataItemType::String) return false;
  out = Dstring(e.GetItem().GetText());
  return out.StartsWith(":CGR") && out.find(":CONN") != Dstring::npos;
}

}  // namespace

int CPortConnections::Read(ConditionList& cond) {
  Dstring reply;
  const Dstring cmd = Dstring::Format("%s:CONF:CONN?", QenGuiInst::GetAppHandle().c_str());
  if (int status = QenGuiInst::Call(cmd, reply, cond)) return status;
  return SetConnections(reply.Trimmed(), cond);
}

int CPortConnections::SetConnections(const Dstring& reply, ConditionList& cond) {
  ConditionList parse;
  LispList top;
  std::vector<Connection> connections;
  std::set<Dstring> analysers;
  bool ok = ParserExpression::ParseElements(reply, top, parse) == 0;
  for (std::size_t i = 0; ok && i < top.Size(); ++i) {
    const LispList& e = top[i];
    Connection c;
    ok = e.IsList() && e.Size() == 2 && PortPath(e[0], c.generator) && PortPath(e[1], c.analyser) &&
         c.generator != c.analyser && analysers.insert(c.analyser).second;
    connections.push_back(std::move(c));
  }
  if (!ok) {
    ConditionListLoader::ConditionToken(cond, "GUI_CONNECTIONS_BAD_LIST", {reply}, 1);
    return 1;
  }
  mConnections = std::move(connections);
  return 0;
}

int CPortConnections::Change(const char* verb, const Dstring& generator, const Dstring& analyser,
                             ConditionList& cond) {
  if (int status = CommandText::CheckArgument(generator, cond)) return status;
  if (int status = CommandText::CheckArgument(analyser, cond)) return status;
  Dstring reply;
  const Dstring cmd = Dstring::Format("%s:CONF:CONN:%s \"%s\",\"%s\"", QenGuiInst::GetAppHandle().c_str(),
                                      verb, generator.c_str(), analyser.c_str());
  const int status = QenGuiInst::Call(cmd, reply, cond);
  if (status == QenStatus::kLocked) return status;
  // A refused change may still follow another client's: show what the server holds.
  ConditionList again;
  const int read = Read(again);
  if (status == 0) cond.Append(again);
  return status != 0 ? status : read;
}

int CPortConnections::Add(const Dstring& generator, const Dstring& analyser, ConditionList& cond) {
  return Change("ADD", generator, analyser, cond);
}

int CPortConnections::Remove(const Dstring& generator, const Dstring& analyser, ConditionList& cond) {
  return Change("DEL", generator, analyser, cond);
}

bool CPortConnections::NfyMatchDirtyFlag(const Dstring& name) {
  return name == "ALL" || name == Dstring::Format(":%s:CONF:CONN", QenGuiInst::GetAppHandle().c_str());
}
