#pragma once

#include "support/ConditionList.h"
#include "support/Dstring.h"

// What CSequence::SyncSegments hands each named segment of the sequence to before the
// instrument runs: the segment pool, which writes back what the editors changed so that the
// server runs what the user sees. SegmentPoolSync is that adapter, installed with
// CSequence::SetSegmentSync; without one SyncSegments does nothing.
class SequenceSegmentSync {
 public:
  virtual ~SequenceSegmentSync() = default;

  // 0, or the failure status with its conditions added.
  virtual int SyncSegment(const Dstring& name, ConditionList& cond) = 0;
};
