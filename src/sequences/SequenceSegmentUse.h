#pragma once

#include <vector>

#include "sequences/CSequence.h"
#include "support/Dstring.h"

// Where a sequence names segments: what a delete of a segment must warn about and what a run
// must find on the instrument.
class SequenceSegmentUse {
 public:
  // The blocks (from 1) that name `segment` on any port.
  static std::vector<unsigned long> BlocksNaming(const CSequence& sequence, const Dstring& segment);
  // The segments the sequence names, each once, in the order of the first block naming it.
  static std::vector<Dstring> NamedSegments(const CSequence& sequence);
  // "block 3", "blocks 2 and 5", "blocks 2, 5 and 7".
  static Dstring BlocksText(const std::vector<unsigned long>& blocks);
  // "\"walkB8\" (blocks 2 and 5), \"cnt32\" (block 3)": each segment with the blocks naming it.
  static Dstring SegmentsText(const CSequence& sequence, const std::vector<Dstring>& segments);
};
