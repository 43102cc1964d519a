#pragma once

#include <ostream>

#include "support/ConditionList.h"
#include "support/Dstring.h"

class QenSegmentDs;

// Writes a segment as a Value Change Dump for the common waveform viewers: a wire per trace
// ("t0" …), one vector per nanosecond from time 0 (a segment has no clock of its own), states
// 0/L as 0 and 1/H as 1, Z as z and every other state as x, and a wire "error" high on the
// vectors that hold an errored compare state. Only changes are written. The segment is read
// block by block, so its length costs time, not memory.
class SegmentVcdWriter {
 public:
  static int Write(QenSegmentDs& ds, std::ostream& out, ConditionList& list);
  static int WriteFile(QenSegmentDs& ds, const Dstring& path, ConditionList& list);
};
