#include "segments/SegmentCatalogFollower.h"

#include "segments/QenSegmentPool.h"
#include "segments/SegmentCatalogDs.h"

SegmentCatalogFollower::SegmentCatalogFollower(std::function<void()> refresh)
    : mCatalog(QenSegmentPool::GetCatalogDs()), mRefresh(std::move(refresh)) {
  if (mCatalog == nullptr) return;
  mCatalog->Use();
  ConditionList ignored;
  mCatalog->RegisterView(this, ignored);
}

SegmentCatalogFollower::~SegmentCatalogFollower() {
  if (mCatalog == nullptr) return;
  ConditionList ignored;
  mCatalog->UnregisterView(this, ignored);
  mCatalog->Release();
}

int SegmentCatalogFollower::Read(ConditionList& list) {
  return mCatalog != nullptr ? mCatalog->Read(list) : 0;
}

const std::vector<Dstring>& SegmentCatalogFollower::GetNames() const {
  static const std::vector<Dstring> kNone;
  return mCatalog != nullptr ? mCatalog->GetNames() : kNone;
}

bool SegmentCatalogFollower::IsRead() const {
  return mCatalog != nullptr && mCatalog->IsRead();
}

bool SegmentCatalogFollower::IsMissing(const Dstring& name) const {
  return IsRead() && !mCatalog->Contains(name) && !QenSegmentPool::IsOpenHere(name);
}

int SegmentCatalogFollower::NfyViewDataUpdated(QenDs*, ConditionList&) {
  if (mRefresh) mRefresh();
  return 0;
}
