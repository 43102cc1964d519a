#include "segments/SegmentCatalogDs.h"

#include <algorithm>

#include "segments/QenSegmentPool.h"

bool SegmentCatalogDs::Contains(const Dstring& name) const {
  return std::find(mNames.begin(), mNames.end(), name) != mNames.end();
}

int SegmentCatalogDs::Read(ConditionList& list) {
  std::vector<Dstring> names;
  if (int status = QenSegmentPool::Catalog(names, list)) return status;
  const bool changed = !mRead || names != mNames;
  mNames = std::move(names);
  mRead = true;
  return changed ? Update(list, 0) : 0;
}
