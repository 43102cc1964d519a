#include "segments/QenSegmentPool.h"

#include <algorithm>
#include <climits>
#include <set>

#include "data/DirtyFlagDs.h"
#include "data/PinnedSources.h"
#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "segments/QenSegmentDs.h"
#include "segments/SegmentCatalogDs.h"
#include "segments/SegmentKeywords.h"
#include "segments/SegmentReply.h"
#include "segments/SegmentStatus.h"
#include "support/DataParcel.h"
#include "support/FWBlocker.h"
#include "support/LgsDebug.h"
#include "support/ParserExpression.h"

std::vector<QenSegmentDs*> QenSegmentPool::mPool;
DirtyFlagDs* QenSegmentPool::mDirtyFlag = nullptr;
SegmentCatalogDs* QenSegmentPool::mCatalog = nullptr;
bool QenSegmentPool::mKeepCopies = false;

namespace {

constexpr std::string_view kUnshared = "Analyzer";
constexpr std::string_view kSegmentHeader = ":EDIT:SEGM";
constexpr std::string_view kCatalogHeader = ":EDIT:SEGM:CAT";

Dstring Handle() {
  return QenGuiInst::GetAppHandle();
}

int Call(const Dstring& cmd, ConditionList& list) {
  Dstring reply;
  return QenGuiInst::Call(cmd, reply, list);
}

}  // namespace

void QenSegmentPool::Init(DirtyFlagDs* dirtyFlag) {
  mPool.clear();
  mPool.reserve(64);
  mDirtyFlag = dirtyFlag;
  if (mDirtyFlag) mDirtyFlag->RegisterProc(&NfyViewDataUpdatedDirtyFlag, &NfyMatchDirtyFlag, nullptr);
  if (mCatalog == nullptr) mCatalog = new SegmentCatalogDs;
}

void QenSegmentPool::End() {
  if (mDirtyFlag) mDirtyFlag->UnregisterProc(&NfyViewDataUpdatedDirtyFlag, &NfyMatchDirtyFlag, nullptr);
  mDirtyFlag = nullptr;
  mPool.clear();
  if (mCatalog != nullptr) mCatalog->Release();
  mCatalog = nullptr;
  mKeepCopies = false;
}

void QenSegmentPool::Enter(QenSegmentDs* ds) {
  mPool.push_back(ds);
}

void QenSegmentPool::Forget(QenSegmentDs* ds) {
  std::erase(mPool, ds);
}

QenSegmentDs* QenSegmentPool::GetSegmentDsByName(const Dstring& name) {
  auto it =
      std::find_if(mPool.begin(), mPool.end(), [&](const QenSegmentDs* ds) { return ds->GetName() == name; });
  return it == mPool.end() ? nullptr : *it;
}

QenSegmentDs* QenSegmentPool::AllocDs(const Dstring& name) {
  if (!name.StartsWith(kUnshared)) {
    if (QenSegmentDs* ds = GetSegmentDsByName(name)) {
      ds->Use();
      return ds;
    }
  }
  return new QenSegmentDs(name);
}

QenSegmentDs* QenSegmentPool::GetSegmentDsByNameAndView(const Dstring& name, QenDsView* view,
                                                        ConditionList& list) {
  QenSegmentDs* ds = AllocDs(name);
  ds->RegisterView(view, list);
  return ds;
}

QenSegmentDs* QenSegmentPool::GetSegmentDsByNameAndProc(const Dstring& name, QenDsProc proc, void* data) {
  QenSegmentDs* ds = AllocDs(name);
  ds->RegisterProc(proc, data);
  return ds;
}

void QenSegmentPool::FreeDs(QenSegmentDs* ds) {
  if (ds) ds->Release();
}

int QenSegmentPool::RegisterView(const Dstring& name, QenDsView* view, ConditionList& list) {
  return AllocDs(name)->RegisterView(view, list);
}

int QenSegmentPool::UnregisterView(QenSegmentDs* ds, QenDsView* view, ConditionList& list) {
  const int status = ds->UnregisterView(view, list);
  FreeDs(ds);
  return status;
}

int QenSegmentPool::Sync(ConditionList& list) {
  FWBlocker guard("QenSegmentPool::Sync", list);
  if (int status = guard.Block()) return status;
  PinnedSources<QenSegmentDs> held(mPool);
  int first = SegmentStatus::kOk;
  for (QenSegmentDs* ds : held.Get()) {
    const int status = ds->Write(list);
    if (first == 0) first = status;
  }
  return first;
}

int QenSegmentPool::Sync(const Dstring& name, ConditionList& list) {
  QenSegmentDs* ds = GetSegmentDsByName(name);
  return ds ? Sync(ds, list) : SegmentStatus::kOk;
}

int QenSegmentPool::Sync(QenSegmentDs* ds, ConditionList& list) {
  FWBlocker guard("QenSegmentPool::Sync", list);
  if (int status = guard.Block()) return status;
  return ds->Write(list);
}

// Every open source reads again and tells its views.
int QenSegmentPool::UpdateAll(ConditionList& list) {
  FWBlocker guard("QenSegmentPool::UpdateAll", list);
  if (int status = guard.Block()) return status;
  PinnedSources<QenSegmentDs> held(mPool);
  int first = SegmentStatus::kOk;
  for (QenSegmentDs* ds : held.Get()) {
    if (ds->GetNumber() == 0) continue;
    const int status = ds->UpdateAll(list);
    if (first == 0) first = status;
  }
  return first;
}

unsigned QenSegmentPool::NumberOf(const Dstring& name) {
  const std::size_t at = name.find(kSegmentHeader);
  if (at == Dstring::npos) return 0;
  unsigned long number = 0;
  std::size_t i = at + kSegmentHeader.size();
  for (; i < name.size() && name[i] >= '0' && name[i] <= '9' && number <= UINT_MAX; ++i) {
    number = number * 10 + static_cast<unsigned long>(name[i] - '0');
  }
  const bool ended = i == name.size() || name[i] == ':';
  return ended && number <= UINT_MAX ? static_cast<unsigned>(number) : 0;
}

bool QenSegmentPool::IsCatalogName(const Dstring& name) {
  return std::string_view(name).ends_with(kCatalogHeader);
}

void QenSegmentPool::NfyCatalogChanged() {
  ConditionList ignored;
  if (mCatalog != nullptr && mCatalog->NumViews() > 0) mCatalog->Read(ignored);
}

int QenSegmentPool::NfyMatchDirtyFlag(QenDs*, void*, const Dstring& name) {
  if (IsCatalogName(name)) return 1;
  const unsigned number = NumberOf(name);
  if (number == 0) return 0;
  return std::any_of(mPool.begin(), mPool.end(),
                     [&](const QenSegmentDs* ds) { return ds->GetNumber() == number; });
}

// Another client changed segments (or everything): each open one that it may concern is told,
// and the catalogue is read again for the lists that follow it.
int QenSegmentPool::NfyViewDataUpdatedDirtyFlag(QenDs*, void*, ConditionList& list) {
  LgsDebug trace("QenSegmentPool::NfyViewDataUpdatedDirtyFlag ", "segments");
  const bool all = mDirtyFlag == nullptr || mDirtyFlag->IsAllChanged();
  std::set<unsigned> changed;
  bool catalog = all;
  if (!all) {
    for (const Dstring& name : mDirtyFlag->GetChangedNames()) {
      changed.insert(NumberOf(name));
      catalog = catalog || IsCatalogName(name);
    }
  }
  int first = SegmentStatus::kOk;
  {
    PinnedSources<QenSegmentDs> held(mPool);
    for (QenSegmentDs* ds : held.Get()) {
      if (ds->GetNumber() == 0 || (!all && !changed.contains(ds->GetNumber()))) continue;
      const int status = ds->NfyChangedElsewhere(list);
      if (first == 0) first = status;
    }
  }
  if (catalog && mCatalog != nullptr && mCatalog->NumViews() > 0) {
    const int status = mCatalog->Read(list);
    if (first == 0) first = status;
  }
  return first;
}

int QenSegmentPool::Create(const SegmentProperties& properties, unsigned& created, ConditionList& list) {
  FWBlocker guard("QenSegmentPool::Create", list);
  if (int status = guard.Block()) return status;
  const char* type = SegmentKeywords::Word(properties.type);
  if (*type == '\0') {
    return SegmentReply::Refuse(list, "GUI_SEGMENTDS_BAD_ARGUMENT",
                                {"SegmentType", Dstring::Format("%d", static_cast<int>(properties.type))},
                                SegmentStatus::kBadArgument);
  }
  bool exists = false;
  if (int status = Exists(properties.name, exists, list)) return status;
  if (exists) {
    if (int status = Delete(properties.name, list)) return status;
  }
  const Dstring cmd =
      Dstring::Format("%s:EDIT:SEGM:CRE? \"%s\",%s", Handle().c_str(), properties.name.c_str(), type);
  Dstring reply;
  long number = 0;
  if (int status = QenGuiInst::Call(cmd, reply, list)) return status;
  if (!SegmentReply::Number(reply, 1, UINT_MAX, number)) {
    return SegmentReply::Refuse(list, "GUI_SEGMENTDS_BAD_REPLY", {cmd, SegmentReply::Shown(reply)},
                                SegmentStatus::kBadReply);
  }
  created = static_cast<unsigned>(number);
  QenSegmentDs* ds = AllocDs(properties.name);
  int status = ds->Open(list);
  if (status == 0) {
    status = ds->SetProperties(properties, list);
    const int closed = ds->Close(list);
    if (status == 0) status = closed;
  }
  FreeDs(ds);
  // The creating number holds the new segment on the server until it is saved.
  if (status == 0) status = Save(created, list);
  const int closed = Close(created, list);
  if (status == 0) status = closed;
  if (status != 0 && Exists(properties.name, exists, list) == 0 && exists) Delete(properties.name, list);
  NfyCatalogChanged();
  return status;
}

int QenSegmentPool::Open(const Dstring& name, SegmentProperties& properties, QenSegmentDs*& opened,
                         ConditionList& list) {
  FWBlocker guard("QenSegmentPool::Open", list);
  if (int status = guard.Block()) return status;
  QenSegmentDs* ds = AllocDs(name);
  int status = ds->Open(list);
  if (status == 0) {
    status = ds->GetProperties(properties, list);
    if (status != 0) ds->Close(list);
  }
  if (status != 0) {
    FreeDs(ds);
    return status;
  }
  opened = ds;
  return SegmentStatus::kOk;
}

int QenSegmentPool::Delete(const Dstring& name, ConditionList& list) {
  if (int status = CommandText::CheckArgument(name, list)) return status;
  if (int status = Call(Dstring::Format("%s:EDIT:SEGM:DEL \"%s\"", Handle().c_str(), name.c_str()), list))
    return status;
  NfyCatalogChanged();
  return SegmentStatus::kOk;
}

int QenSegmentPool::Exists(const Dstring& name, bool& exists, ConditionList& list) {
  if (int status = CommandText::CheckArgument(name, list)) return status;
  const Dstring cmd = Dstring::Format("%s:EDIT:SEGM:EXIS? \"%s\"", Handle().c_str(), name.c_str());
  Dstring reply;
  if (int status = QenGuiInst::Call(cmd, reply, list)) return status;
  if (SegmentReply::Truth(reply, exists)) return SegmentStatus::kOk;
  return SegmentReply::Refuse(list, "GUI_SEGMENTDS_BAD_REPLY", {cmd, SegmentReply::Shown(reply)},
                              SegmentStatus::kBadReply);
}

bool QenSegmentPool::IsOpenHere(const Dstring& name) {
  const QenSegmentDs* open = GetSegmentDsByName(name);
  return open != nullptr && open->GetNumber() != 0;
}

int QenSegmentPool::IsAvailable(const Dstring& name, bool& available, ConditionList& list) {
  available = IsOpenHere(name);
  return available ? SegmentStatus::kOk : Exists(name, available, list);
}

int QenSegmentPool::Catalog(std::vector<Dstring>& names, ConditionList& list) {
  const Dstring cmd = Dstring::Format("%s:EDIT:SEGM:CAT?", Handle().c_str());
  Dstring reply;
  if (int status = QenGuiInst::Call(cmd, reply, list)) return status;
  DataParcel items;
  ConditionList ignored;
  std::vector<Dstring> read;
  bool good = reply.empty() || ParserExpression::Parse(reply, items, ignored) == 0;
  for (std::size_t i = 0; good && i < items.size(); ++i) {
    good = items[i].GetType() == DataItemType::String;
    if (good) read.emplace_back(items[i].GetText());
  }
  if (!good) {
    return SegmentReply::Refuse(list, "GUI_SEGMENTDS_BAD_REPLY", {cmd, SegmentReply::Shown(reply)},
                                SegmentStatus::kBadReply);
  }
  names = std::move(read);
  return SegmentStatus::kOk;
}

int QenSegmentPool::Save(unsigned number, ConditionList& list) {
  return Call(Dstring::Format("%s:EDIT:SEGM%u:SAVE", Handle().c_str(), number), list);
}

int QenSegmentPool::Close(unsigned number, ConditionList& list) {
  return Call(Dstring::Format("%s:EDIT:SEGM%u:CLOS", Handle().c_str(), number), list);
}

// The path goes back to the server in a quoted argument, so it must be fit for one.
int QenSegmentPool::RealPath(const Dstring& name, Dstring& path, ConditionList& list) {
  if (int status = CommandText::CheckArgument(name, list)) return status;
  Dstring reply, text;
  if (int status = QenGuiInst::Call(
          Dstring::Format("%s:EDIT:SEGM:RPAT? \"%s\"", Handle().c_str(), name.c_str()), reply, list))
    return status;
  ConditionList ignored;
  if (!SegmentReply::FirstText(reply, text) || text.empty() ||
      CommandText::CheckArgument(text, ignored) != 0) {
    return SegmentReply::Refuse(list, "GUI_SEGMENTPOOL_BAD_REALPATH", {SegmentReply::Shown(reply)},
                                SegmentStatus::kBadReply);
  }
  path = text;
  return SegmentStatus::kOk;
}

int QenSegmentPool::GetType(const Dstring& name, SegmentType& type, ConditionList& list) {
  QenSegmentDs* ds = AllocDs(name);
  int status = ds->Open(list);
  if (status == 0) {
    status = ds->GetType(type, list);
    const int closed = ds->Close(list);
    if (status == 0) status = closed;
  }
  FreeDs(ds);
  return status;
}
