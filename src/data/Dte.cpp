#include "data/Dte.h"

#include <algorithm>
#include <list>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "data/DirtyFlagDs.h"
#include "data/PinnedSources.h"
#include "data/QenDsView.h"
#include "data/QenParamDs.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "support/ConditionListLoader.h"
#include "support/ErrorMgr.h"
#include "support/FWBlocker.h"
#include "support/LgsDebug.h"
#include "support/ParserExpression.h"

Dstring Dte::mCmds;
unsigned Dte::mInTransaction = 0;

namespace {

// All live parameter sources: in order (most recently written first) and by upper-cased name.
struct Repository {
  std::list<QenParamDs*> order;
  std::unordered_map<std::string, std::list<QenParamDs*>::iterator> byName;
};

Repository mDataSourceRepository;
std::vector<QenParamDs*> gTransactionMembers;
DirtyFlagDs* gDirtyFlag = nullptr;
ErrorMgr* gErrorMgr = nullptr;

std::string Key(const Dstring& name) { return name.ToUpper(); }

std::vector<QenParamDs*> AllSources() {
  return {mDataSourceRepository.order.begin(), mDataSourceRepository.order.end()};
}

Dstring FirstHeader(const Dstring& batch) { return Dstring(batch.substr(0, batch.find_first_of(" ?;"))); }

}  // namespace

// Reads the values of many sources in a few joined queries, before their views are told.
class DteRefresher {
 public:
  static void ReadValues(const std::vector<QenParamDs*>& sources) {
    for (std::size_t start = 0, end = 0; start < sources.size(); start = end) {
      Dstring cmd = sources[start]->GetRefreshCmdStr();
      for (end = start + 1; end < sources.size(); ++end) {
        const Dstring read = sources[end]->GetRefreshCmdStr();
        if (cmd.size() + 1 + read.size() > Dte::kRefreshBatchBytes) break;
        cmd += ';' + read;
      }
      ReadBatch(sources, start, end, cmd);
    }
  }

  // Takes the replies of sources [start, end), read with the joined command `cmd`.
  static void ReadBatch(const std::vector<QenParamDs*>& sources, std::size_t start, std::size_t end,
                        const Dstring& cmd) {
    Dstring reply;
    ConditionList ignored;
    if (QenGuiInst::Call(cmd, reply, ignored) != QenStatus::kOk) return;
    std::vector<std::string_view> parts;
    std::size_t expected = 0;
    for (std::size_t i = start; i < end; ++i) expected += sources[i]->GetRefreshParts();
    if (ParserExpression::SplitJoined(reply, parts, ignored) != 0 || parts.size() != expected) return;
    for (std::size_t i = start, at = 0; i < end; at += sources[i]->GetRefreshParts(), ++i) {
      const bool clashing = sources[i]->GetRefreshParts() == 2 && Dstring(parts[at + 1]).Trimmed() == "1";
      sources[i]->TakeReadValue(Dstring(parts[at]), clashing);
    }
  }

  static void ReadMissing(const std::vector<QenParamDs*>& sources) {
    std::vector<QenParamDs*> missing;
    for (QenParamDs* s : sources) {
      if (!s->mValid || s->mValue.empty()) missing.push_back(s);
    }
    ReadValues(missing);
  }

  // Forgets the cached values, reads them anew, then tells the views; the first failure of a
  // view is returned, but every source is told.
  static int Refresh(const std::vector<QenParamDs*>& sources, ConditionList& list) {
    PinnedSources<QenParamDs> held(sources);
    for (auto* s : held.Get()) s->Invalidate();
    ReadValues(held.Get());
    int first = 0;
    for (auto* s : held.Get()) {
      int status = s->Update(list, 0);
      if (first == 0) first = status;
    }
    return first;
  }

  static void MarkTransactionFailed(QenParamDs* source, int status) {
    if (status == QenStatus::kLocked) return;
    if (source) source->SetFailed(1);
    for (auto* s : gTransactionMembers) s->SetFailed(1);
  }

  static void EndTransactionMembers() {
    for (auto* s : gTransactionMembers) s->SetInTransaction(0);
    gTransactionMembers.clear();
  }

  static void NoteTransactionMember(QenParamDs* source) {
    if (!source->IsInTransaction()) gTransactionMembers.push_back(source);
    source->SetInTransaction(1);
  }

  static void SetFailedAfterSuccess(QenParamDs* source) {
    if (source) source->SetFailed(0);
    for (auto* s : gTransactionMembers) s->SetFailed(0);
  }

  static bool ReleasePending(QenParamDs* s) { return s->GetReleasePending(); }
  static bool Failed(QenParamDs* s) { return s->GetFailed(); }
  static void SetReleasePending(QenParamDs* s) { s->SetReleasePending(1); }
  static void ClearReleasePending(QenParamDs* s) { s->SetReleasePending(0); }
  static void SetSubCmd(QenParamDs* s) { s->SetSubCmdEnabled(1); }
  static Dstring WriteCmd(QenParamDs* s) { return s->GetWriteCmdStr(); }
};

void Dte::Init(DirtyFlagDs* dirtyFlag, ErrorMgr* errorMgr) {
  mDataSourceRepository.order.clear();
  mDataSourceRepository.byName.clear();
  gTransactionMembers.clear();
  mCmds.clear();
  mInTransaction = 0;
  gErrorMgr = errorMgr;
  gDirtyFlag = dirtyFlag;
  if (gDirtyFlag) gDirtyFlag->RegisterProc(&Dte::DirtyFlagProc, &Dte::DirtyFlagMatch, nullptr);
}

void Dte::End() {
  ReleaseAllFailed();
  if (gDirtyFlag) gDirtyFlag->UnregisterProc(&Dte::DirtyFlagProc, &Dte::DirtyFlagMatch, nullptr);
  gDirtyFlag = nullptr;
  gErrorMgr = nullptr;
}

void Dte::Prefetch(const std::vector<QenParamDs*>& sources) { DteRefresher::ReadMissing(sources); }

std::size_t Dte::NumSources() { return mDataSourceRepository.order.size(); }

QenParamDs* Dte::GetDsByName(const Dstring& name) {
  auto it = mDataSourceRepository.byName.find(Key(name));
  return it == mDataSourceRepository.byName.end() ? nullptr : *it->second;
}

QenParamDs* Dte::AllocDsByName(const Dstring& name, unsigned flags) {
  LgsDebug trace("Dte::AllocDsByName", "ur,dte,dte_registration");
  trace.Printf("(%s\n", name.c_str());
  if (QenParamDs* existing = GetDsByName(name)) {
    // A source whose release was deferred is taken back: its kept reference becomes this one.
    if (DteRefresher::ReleasePending(existing)) {
      DteRefresher::ClearReleasePending(existing);
    } else {
      existing->Use();
    }
    return existing;
  }
  auto* source = new QenParamDs(name);
  if (flags & kSubCmd) DteRefresher::SetSubCmd(source);
  // A new source starts with one reference: the allocation's.
  mDataSourceRepository.order.push_back(source);
  mDataSourceRepository.byName.emplace(Key(name), std::prev(mDataSourceRepository.order.end()));
  return source;
}

void Dte::Forget(QenParamDs* source) {
  auto it = mDataSourceRepository.byName.find(Key(source->GetProgramHeader()));
  if (it != mDataSourceRepository.byName.end() && *it->second == source) {
    mDataSourceRepository.order.erase(it->second);
    mDataSourceRepository.byName.erase(it);
  }
  std::erase(gTransactionMembers, source);
}

void Dte::FreeDs(QenParamDs* source) {
  LgsDebug trace("Dte::FreeDs", "ur,dte,dte_registration");
  if (!source) return;
  // The last reference of a failed source is kept, so that IsFailed still sees the failure.
  if (DteRefresher::Failed(source) && source->NumRefs() == 1) {
    DteRefresher::SetReleasePending(source);
    return;
  }
  source->Release();
}

int Dte::RegisterView(QenParamDs* source, QenDsView* view, ConditionList& list, unsigned tell) {
  LgsDebug trace("Dte::RegisterView", "ur,dte,dte_registration");
  trace.Printf("(%s, 0x%08lx)\n", source->GetProgramHeader().c_str(), reinterpret_cast<unsigned long>(view));
  int status = source->RegisterView(view, list);
  if (status == 0 && tell) status = view->NfyViewDataUpdated(source, list);
  return status;
}

int Dte::RegisterView(const Dstring& name, QenDsView* view, ConditionList& list, unsigned tell) {
  return RegisterView(AllocDsByName(name, 0), view, list, tell);
}

int Dte::UnregisterView(QenParamDs* source, QenDsView* view, ConditionList& list) {
  LgsDebug trace("Dte::UnregisterView", "ur,dte,dte_registration");
  trace.Printf("(%s, 0x%08lx)\n", source->GetProgramHeader().c_str(), reinterpret_cast<unsigned long>(view));
  return source->UnregisterView(view, list);
}

int Dte::UnregisterView(const Dstring& name, QenDsView* view, ConditionList& list) {
  QenParamDs* source = GetDsByName(name);
  if (!source) {
    ConditionListLoader::ConditionToken(list, "GUI_QENDS_VIEWNOTREGISTERED");
    return 1;
  }
  int status = UnregisterView(source, view, list);
  if (status == 0) FreeDs(source);
  return status;
}

int Dte::RegisterProc(QenParamDs* source, QenDsProc proc, void* client, unsigned tell) {
  LgsDebug trace("Dte::RegisterProc", "ur,dte,dte_registration");
  trace.Printf("(%s, 0x%08lx, 0x%08lx)\n", source->GetProgramHeader().c_str(), reinterpret_cast<unsigned long>(proc),
               reinterpret_cast<unsigned long>(client));
  source->RegisterProc(proc, client);
  if (!tell) return 0;
  ConditionList list;
  return proc(source, client, list);
}

int Dte::RegisterProc(const Dstring& name, QenDsProc proc, void* client, unsigned tell) {
  return RegisterProc(AllocDsByName(name, 0), proc, client, tell);
}

int Dte::UnregisterProc(QenParamDs* source, QenDsProc proc, void* client) {
  LgsDebug trace("Dte::UnregisterProc", "ur,dte,dte_registration");
  source->UnregisterProc(proc, client);
  return 0;
}

int Dte::UnregisterProc(const Dstring& name, QenDsProc proc, void* client) {
  QenParamDs* source = GetDsByName(name);
  if (!source) return 1;
  UnregisterProc(source, proc, client);
  FreeDs(source);
  return 0;
}

int Dte::EndTransaction(ConditionList& list) {
  mInTransaction = 0;
  return Write(nullptr, list);
}

int Dte::SendCmd(const Dstring& cmd, ConditionList& list) {
  if (!mCmds.empty()) mCmds += ';';
  mCmds += cmd;
  return mInTransaction ? 0 : Write(nullptr, list);
}

int Dte::Write(QenParamDs* source, ConditionList& list) {
  LgsDebug trace("Dte::Write(QenParamDs)", "ur,dte");
  trace.Printf("theDs=0x%08lx\n", reinterpret_cast<unsigned long>(source));
  FWBlocker guard("Dte::Write", list);
  if (int status = guard.Block()) return status;

  if (source) {
    auto it = mDataSourceRepository.byName.find(Key(source->GetProgramHeader()));
    if (it != mDataSourceRepository.byName.end()) {
      mDataSourceRepository.order.splice(mDataSourceRepository.order.begin(), mDataSourceRepository.order, it->second);
    }
    if (!mCmds.empty()) mCmds += ';';
    mCmds += DteRefresher::WriteCmd(source);
    if (mInTransaction) {
      DteRefresher::NoteTransactionMember(source);
      return 0;
    }
  }
  Dstring batch = std::move(mCmds);
  mCmds.clear();
  if (batch.empty()) {
    DteRefresher::EndTransactionMembers();
    return 0;
  }
  trace.Printf("header=%s\n", FirstHeader(batch).c_str());

  std::vector<QenParamDs*> clashing;
  for (auto* s : mDataSourceRepository.order) {
    if (s == source || !s->IsClashing()) continue;
    batch += ";" + DteRefresher::WriteCmd(s);
    clashing.push_back(s);
  }
  if (!clashing.empty()) {
    const Dstring handle = QenGuiInst::GetAppHandle();
    Dstring running;
    if (QenGuiInst::Call(Dstring::Format(":%s:SGEN:GLOB:INIT:CONT?", handle.c_str()), running, list) == 0 &&
        running.Trimmed() == "ON") {
      batch = Dstring::Format(":%s:SGEN:GLOB:INIT:CONT OFF;", handle.c_str()) + batch +
              Dstring::Format(";:%s:SGEN:GLOB:INIT:CONT ON", handle.c_str());
    }
  }

  Dstring reply;
  int status = QenGuiInst::Call(batch, reply, list);
  if (status != QenStatus::kOk) {
    DteRefresher::MarkTransactionFailed(source, status);
    DteRefresher::EndTransactionMembers();
    return status;
  }
  DteRefresher::SetFailedAfterSuccess(source);
  DteRefresher::EndTransactionMembers();
  if (gErrorMgr) gErrorMgr->clear();

  std::set<Dstring> changed;
  QueryValueCoupled(batch, changed, list);
  for (auto* s : clashing) changed.insert(s->GetProgramHeader());
  std::set<Dstring> limits;
  QueryRangeCoupled(batch, limits, list);

  std::vector<QenParamDs*> refresh;
  std::vector<QenParamDs*> limitsOnly;
  for (const auto& name : changed) {
    if (QenParamDs* s = GetDsByName(name)) refresh.push_back(s);
  }
  for (const auto& name : limits) {
    QenParamDs* s = GetDsByName(name);
    if (s && std::find(refresh.begin(), refresh.end(), s) == refresh.end()) limitsOnly.push_back(s);
  }
  DteRefresher::Refresh(refresh, list);
  PinnedSources<QenParamDs> held(limitsOnly);
  for (auto* s : held.Get()) s->Update(list, 0);
  return status;
}

int Dte::QueryCoupled(const char* prefix, const Dstring& cmds, std::set<Dstring>& names, ConditionList& list) {
  LgsDebug trace("Dte::QueryValueCoupled", "ur,dte");
  const Dstring cmd = Dstring(":") + prefix + cmds;
  Dstring reply;
  trace.Printf("cmd=%s\n", cmd.c_str());
  int status = QenGuiInst::Call(cmd, reply, list);
  trace.Printf("resp=%s\n", reply.c_str());
  if (status != QenStatus::kOk) return status;
  // Runs of characters between double quotes are the names; the separators are skipped.
  std::size_t pos = 0;
  while ((pos = reply.find('"', pos)) != Dstring::npos) {
    std::size_t end = reply.find('"', pos + 1);
    if (end == Dstring::npos) break;
    if (end > pos + 1) {
      Dstring name(reply.substr(pos + 1, end - pos - 1));
      trace.Printf("theDsName=%s\n", name.c_str());
      names.insert(std::move(name));
    }
    pos = end + 1;
  }
  return status;
}

int Dte::QueryValueCoupled(const Dstring& cmds, std::set<Dstring>& names, ConditionList& list) {
  return QueryCoupled("VC", cmds, names, list);
}

int Dte::QueryRangeCoupled(const Dstring& cmds, std::set<Dstring>& names, ConditionList& list) {
  return QueryCoupled("RC", cmds, names, list);
}

int Dte::Update(ConditionList& list) {
  FWBlocker guard("Dte::Update", list);
  if (int status = guard.Block()) return status;
  return DteRefresher::Refresh(AllSources(), list);
}

int Dte::UpdateDsByName(const Dstring& name, ConditionList& list) {
  QenParamDs* source = GetDsByName(name);
  return source ? DteRefresher::Refresh({source}, list) : 0;
}

int Dte::ResetEngine(ConditionList& list) {
  FWBlocker guard("Dte::ResetEngine", list);
  if (int status = guard.Block()) return status;
  int status = DteRefresher::Refresh(AllSources(), list);
  if (gErrorMgr) gErrorMgr->clear();
  mCmds.clear();
  return status;
}

unsigned Dte::IsFailed() {
  return std::any_of(mDataSourceRepository.order.begin(), mDataSourceRepository.order.end(),
                     [](QenParamDs* s) { return DteRefresher::Failed(s); });
}

void Dte::ReleaseAllFailed() {
  for (;;) {
    auto& order = mDataSourceRepository.order;
    auto it = std::find_if(order.begin(), order.end(), [](QenParamDs* s) { return DteRefresher::ReleasePending(s); });
    if (it == order.end()) return;
    DteRefresher::ClearReleasePending(*it);
    (*it)->Release();
  }
}

int Dte::DirtyFlagMatch(QenDs*, void*, const Dstring& name) { return GetDsByName(name) != nullptr; }

int Dte::DirtyFlagProc(QenDs* source, void*, ConditionList& list) {
  auto* dirtyFlag = static_cast<DirtyFlagDs*>(source);
  if (dirtyFlag->IsAllChanged()) return DteRefresher::Refresh(AllSources(), list);
  std::vector<QenParamDs*> changed;
  for (const auto& name : dirtyFlag->GetChangedNames()) {
    if (QenParamDs* s = GetDsByName(name)) changed.push_back(s);
  }
  return DteRefresher::Refresh(changed, list);
}
