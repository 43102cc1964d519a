#include "data/QenDs.h"

#include <algorithm>

#include "data/QenDsView.h"
#include "support/ConditionListLoader.h"
#include "support/FWBlocker.h"

unsigned QenDs::Use() { return ++mRefCount; }

unsigned QenDs::Release() {
  if (mRefCount == 0 || --mRefCount == 0) {
    if (mPins == 0) delete this;
    return 0;
  }
  return mRefCount;
}

void QenDs::Unpin() {
  if (--mPins == 0 && mRefCount == 0) delete this;
}

void QenDs::Append(DsNfyListEntry entry) {
  if (mNfyList.empty()) mNfyList.reserve(64);
  entry.SetSerial(mNextSerial++);
  mNfyList.push_back(entry);
}

void QenDs::EraseAt(std::size_t index) {
  mNfyList.erase(mNfyList.begin() + static_cast<std::ptrdiff_t>(index));
  ++mRemovals;
}

int QenDs::RegisterView(QenDsView* view, ConditionList& list) {
  Append(DsNfyListEntry(view));
  return view->NfyViewRegistered(this, list);
}

int QenDs::UnregisterView(QenDsView* view, ConditionList& list) {
  auto it = std::find_if(mNfyList.begin(), mNfyList.end(), [&](const auto& e) { return e.GetView() == view; });
  if (it == mNfyList.end()) {
    ConditionListLoader::ConditionToken(list, "GUI_QENDS_VIEWNOTREGISTERED");
    return 1;
  }
  EraseAt(static_cast<std::size_t>(it - mNfyList.begin()));
  return view->NfyViewUnregistered(this, list);
}

void QenDs::RegisterProc(QenDsProc proc, QenDsMatchProc matchProc, void* client) {
  Append(DsNfyListEntry(proc, matchProc, client));
}

void QenDs::RegisterProc(QenDsProc proc, void* client) { RegisterProc(proc, nullptr, client); }

void QenDs::UnregisterProc(QenDsProc proc, QenDsMatchProc matchProc, void* client) {
  const DsNfyListEntry wanted(proc, matchProc, client);
  auto it = std::find_if(mNfyList.begin(), mNfyList.end(), [&](const auto& e) { return e.isEqual(wanted); });
  if (it != mNfyList.end()) EraseAt(static_cast<std::size_t>(it - mNfyList.begin()));
}

void QenDs::UnregisterProc(QenDsProc proc, void* client) { UnregisterProc(proc, nullptr, client); }

bool QenDs::IsStillRegistered(const DsNfyListEntry& entry, std::uint64_t removalsAtStart) const {
  if (mRemovals == removalsAtStart) return true;
  // The live list stays in serial order, so the entry itself is found by bisection; an
  // equal entry registered anew also counts.
  auto it = std::lower_bound(mNfyList.begin(), mNfyList.end(), entry.GetSerial(),
                             [](const DsNfyListEntry& e, std::uint64_t s) { return e.GetSerial() < s; });
  if (it != mNfyList.end() && it->GetSerial() == entry.GetSerial()) return true;
  return std::any_of(mNfyList.begin(), mNfyList.end(), [&](const auto& e) { return e.isEqual(entry); });
}

int QenDs::Notify(const DsNfyListEntry& entry, ConditionList& list) {
  if (QenDsView* view = entry.GetView()) return view->NfyViewDataUpdated(this, list);
  return entry.GetProc() ? entry.GetProc()(this, entry.GetClient(), list) : 0;
}

int QenDs::Update(ConditionList& list, unsigned block) {
  FWBlocker guard("QenDs::Update", list);
  // The copy lets views register and unregister while they are being told.
  const std::vector<DsNfyListEntry> copy = mNfyList;
  if (block && !copy.empty()) {
    if (int status = guard.Block()) return status;
  }
  const std::uint64_t removals = mRemovals;
  // A view may release the last reference to this source while being told.
  Pin();
  int status = 0;
  for (const auto& entry : copy) {
    if (!IsStillRegistered(entry, removals)) continue;
    if ((status = Notify(entry, list)) != 0) break;
  }
  Unpin();
  return status;
}
