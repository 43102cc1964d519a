#pragma once

#include <ostream>

#include "capture/CaptureData.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

// Writes vectors [from, to) of a capture as a Value Change Dump, which the common waveform
// viewers open: a wire per trace ("d0" …), a wire "error" high on the vectors with an error,
// and the bus shown in the window as one scalar wire per trace ("bus [7]" … "bus [0]").
// A vector wire would read the same in some viewers, but the sigrok VCD input of the Linux
// distributions stops at the first value of a vector wider than one bit, so the bus goes bit
// by bit; viewers that join bits of one name (GTKWave) show it as "bus[7:0]".
// Times are those of the whole capture: vector 0 is time 0, so a range keeps its place, and
// a comment in the header names the range. The time scale is 1 ps, or 1 fs when the clock
// period is no whole number of picoseconds. Only changes are written.
class VcdWriter {
 public:
  struct Range {
    long from = 0;
    long to = 0;
    long busLow = 0;   // the bus's traces; busLow > busHigh: no bus
    long busHigh = -1;
  };

  static void Write(const CaptureData& data, const Dstring& scope, const Range& range, std::ostream& out);
  // GUI_EXPORT_FAILED when the file cannot be written.
  static int WriteFile(const CaptureData& data, const Dstring& scope, const Range& range, const Dstring& path,
                       ConditionList& list);
};
