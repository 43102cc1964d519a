#pragma once

#include <vector>

#include "support/ConditionList.h"
#include "support/Dstring.h"

// What CSequence::SyncSegments hands each named segment of the sequence to before the
// instrument runs: the segment pool, which writes back what the editors changed so that the
// server runs what the user sees, and which says which of them the instrument does not have. SegmentPoolSync
// is that adapter, installed with CSequence::SetSegmentSync; without one SyncSegments does nothing.
class SequenceSegmentSync {
 public:
  virtual ~SequenceSegmentSync() = default;

  // 0, or the failure status with its conditions added.
  virtual int SyncSegment(const Dstring& name, ConditionList& cond) = 0;
  // The names of `names` that the instrument has no segment of, in the order given.
  virtual int FindMissing(const std::vector<Dstring>& names, std::vector<Dstring>& missing,
                          ConditionList& cond) = 0;
};
