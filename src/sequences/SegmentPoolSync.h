#pragma once

#include "segments/QenSegmentPool.h"
#include "sequences/SequenceSegmentSync.h"

// Hands the sequence's segments to the segment pool, which writes back what the editors
// changed before the instrument runs.
class SegmentPoolSync : public SequenceSegmentSync {
 public:
  int SyncSegment(const Dstring& name, ConditionList& cond) override { return QenSegmentPool::Sync(name, cond); }
};
