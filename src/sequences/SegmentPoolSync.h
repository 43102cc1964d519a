#pragma once

#include "sequences/SequenceSegmentSync.h"

// Hands the sequence's segments to the segment pool, which writes back what the editors
// changed before the instrument runs. A segment is there when the instrument lists it saved,
// or when it is open here (made and not saved yet).
class SegmentPoolSync : public SequenceSegmentSync {
 public:
  int SyncSegment(const Dstring& name, ConditionList& cond) override;
  int FindMissing(const std::vector<Dstring>& names, std::vector<Dstring>& missing,
                  ConditionList& cond) override;
};
