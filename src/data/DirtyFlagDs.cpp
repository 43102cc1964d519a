#include "data/DirtyFlagDs.h"

#include <algorithm>

#include "data/QenDsView.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "support/FWBlocker.h"
#include "support/LgsDebug.h"

int DirtyFlagDs::UpdateFromFW(ConditionList& list) {
  LgsDebug trace("DirtyFlagDs::UpdateFromFW", "DirtyFlagDs");
  FWBlocker guard("DirtyFlagDs::UpdateFromFW", list);
  if (int status = guard.Block()) return status;
  Dstring reply;
  int status = QenGuiInst::Call(Dstring::Format("%s:DFL?", QenGuiInst::GetAppHandle().c_str()), reply, list);
  if (status != QenStatus::kOk) return status;
  reply = reply.Trimmed();
  if (reply.empty()) return QenStatus::kOk;
  trace.Printf("Changed : %s\n", reply.c_str());

  mChanged.clear();
  mAllChanged = reply == "\"ALL\"";
  if (!mAllChanged) {
    std::size_t pos = 0;
    while ((pos = reply.find('"', pos)) != Dstring::npos) {
      std::size_t end = reply.find('"', pos + 1);
      if (end == Dstring::npos) break;
      if (end > pos + 1) mChanged.insert(Dstring(reply.substr(pos + 1, end - pos - 1)));
      pos = end + 1;
    }
    if (mChanged.empty()) return QenStatus::kOk;
  }
  mInFWUpdate = 1;
  status = mAllChanged ? QenDs::Update(list, 0) : NotifyMatching(list);
  mInFWUpdate = 0;
  mChanged.clear();
  mAllChanged = false;
  return status;
}

int DirtyFlagDs::NotifyMatching(ConditionList& list) {
  const std::vector<DsNfyListEntry> copy = GetNfyList();
  const auto removals = GetRemovals();
  Pin();
  int status = 0;
  for (const auto& entry : copy) {
    if (!IsStillRegistered(entry, removals)) continue;
    bool matches = std::any_of(mChanged.begin(), mChanged.end(), [&](const Dstring& name) {
      if (QenDsView* view = entry.GetView()) return view->Match(name) != 0;
      return entry.GetMatchProc() && entry.GetMatchProc()(this, entry.GetClient(), name) != 0;
    });
    if (matches && (status = Notify(entry, list)) != 0) break;
  }
  Unpin();
  return status;
}

void DirtyFlagDs::ForceUpdate() {
  mDirty = 1;
  mInFWUpdate = 1;
}

int DirtyFlagDs::Update(ConditionList& list) {
  mDirty = 0;
  mAllChanged = true;
  int status = QenDs::Update(list, 1);
  mAllChanged = false;
  mInFWUpdate = 0;
  return status;
}
