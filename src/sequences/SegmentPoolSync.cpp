#include "sequences/SegmentPoolSync.h"

#include <algorithm>

#include "segments/QenSegmentPool.h"

int SegmentPoolSync::SyncSegment(const Dstring& name, ConditionList& cond) {
  return QenSegmentPool::Sync(name, cond);
}

int SegmentPoolSync::FindMissing(const std::vector<Dstring>& names, std::vector<Dstring>& missing,
                                 ConditionList& cond) {
  missing.clear();
  if (names.empty()) return 0;
  std::vector<Dstring> saved;
  if (int status = QenSegmentPool::Catalog(saved, cond)) return status;
  for (const Dstring& name : names) {
    const bool there =
        QenSegmentPool::IsOpenHere(name) || std::find(saved.begin(), saved.end(), name) != saved.end();
    if (!there) missing.push_back(name);
  }
  return 0;
}
