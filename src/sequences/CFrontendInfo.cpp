#include "sequences/CFrontendInfo.h"

#include <set>

#include "instrument/QenGuiInst.h"
#include "support/ConditionListLoader.h"
#include "support/LispList.h"
#include "support/ParserExpression.h"

bool CFrontendInfo::mKnown = false;
std::vector<CFrontendInfo::Group> CFrontendInfo::mGroups;
std::vector<CPortInfo::Port> CFrontendInfo::mReadWith;

namespace {

bool Text(const LispList& e, Dstring& out) {
  if (!e.IsItem() || !e.GetItem().IsText()) return false;
  out = Dstring(e.GetItem().GetText());
  return true;
}

bool Positive(const LispList& e, long& out) {
  return e.IsItem() && e.GetItem().IsInteger() && e.GetItem().GetLong(out) && out > 0;
}

// "within" followed by the element word and digits (":CGR1" + ":MOD" → ":CGR1:MOD2").
bool IsBelow(const Dstring& path, const Dstring& within, std::string_view element) {
  const Dstring stem = within + Dstring(element);
  if (!path.StartsWith(stem) || path.size() == stem.size()) return false;
  for (std::size_t i = stem.size(); i < path.size(); ++i) {
    if (path[i] < '0' || path[i] > '9') return false;
  }
  return true;
}

// A model name is shown as it is: something to show, and no control characters.
bool IsShowable(const Dstring& text) {
  if (text.empty()) return false;
  for (char c : text) {
    if (static_cast<unsigned char>(c) < 0x20 || c == 0x7f) return false;
  }
  return true;
}

bool ReadPort(const LispList& e, const Dstring& module, CFrontendInfo::Port& port) {
  return e.IsList() && e.Size() == 3 && Text(e[0], port.path) && IsBelow(port.path, module, ":CONN") &&
         Text(e[1], port.portClass) && (port.portClass == "PDAT" || port.portClass == "PCLK") &&
         Positive(e[2], port.terminals);
}

bool ReadModule(const LispList& e, const Dstring& group, CFrontendInfo::Module& module) {
  Dstring kind;
  if (!(e.IsList() && e.Size() >= 4 && Text(e[0], module.path) && IsBelow(module.path, group, ":MOD") &&
        Text(e[1], module.model) && IsShowable(module.model) && Text(e[2], kind) &&
        (kind == "GEN" || kind == "ANA") && Positive(e[3], module.slot))) {
    return false;
  }
  module.generator = kind == "GEN";
  for (std::size_t i = 4; i < e.Size(); ++i) {
    module.ports.emplace_back();
    if (!ReadPort(e[i], module.path, module.ports.back())) return false;
  }
  return true;
}

bool ReadGroup(const LispList& e, std::set<long>& slots, CFrontendInfo::Group& group) {
  if (!(e.IsList() && e.Size() >= 1 && Positive(e[0], group.number))) return false;
  const Dstring path = Dstring::Format(":CGR%ld", group.number);
  for (std::size_t i = 1; i < e.Size(); ++i) {
    group.modules.emplace_back();
    if (!ReadModule(e[i], path, group.modules.back()) || !slots.insert(group.modules.back().slot).second)
      return false;
  }
  return true;
}

}  // namespace

int CFrontendInfo::Update(ConditionList& cond) {
  if (!CPortInfo::IsKnown()) {
    if (int status = CPortInfo::Update(cond)) return status;
  }
  if (mKnown && mReadWith == CPortInfo::GetPorts()) return 0;
  Dstring reply;
  const Dstring cmd = Dstring::Format("%s:CONF:FRON?", QenGuiInst::GetAppHandle().c_str());
  if (int status = QenGuiInst::Call(cmd, reply, cond)) return status;
  if (int status = SetFrontend(reply.Trimmed(), cond)) return status;
  mReadWith = CPortInfo::GetPorts();
  return 0;
}

int CFrontendInfo::SetFrontend(const Dstring& reply, ConditionList& cond) {
  ConditionList parse;
  LispList top;
  std::vector<Group> groups;
  std::set<long> slots;
  bool ok = ParserExpression::ParseElements(reply, top, parse) == 0;
  for (std::size_t i = 0; ok && i < top.Size(); ++i) {
    groups.emplace_back();
    ok = ReadGroup(top[i], slots, groups.back());
  }
  if (!ok) {
    ConditionListLoader::ConditionToken(cond, "GUI_FRONTEND_BAD_INFO", {reply}, 1);
    return 1;
  }
  mGroups = std::move(groups);
  mKnown = true;
  return 0;
}

void CFrontendInfo::Invalidate() {
  mKnown = false;
  mGroups.clear();
  mReadWith.clear();
}

const CFrontendInfo::Port* CFrontendInfo::FindPort(const Dstring& path, const Module** module) {
  for (const Group& g : mGroups) {
    for (const Module& m : g.modules) {
      for (const Port& p : m.ports) {
        if (p.path != path) continue;
        if (module != nullptr) *module = &m;
        return &p;
      }
    }
  }
  return nullptr;
}
