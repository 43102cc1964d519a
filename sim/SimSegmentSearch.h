#pragma once

#include <functional>

#include "SimSegment.h"
#include "support/Dstring.h"

// The searches of the segment editor. Positions are (trace, vector); a search that finds
// nothing gives (-1, -1). NEXT looks after the start position and PREV before it, both
// wrapping round the segment (the start position itself comes last); FIRS looks from the
// beginning.
class SimSegmentSearch {
 public:
  // Told how many positions of how many were looked at, every so many; false stops the search.
  using Step = std::function<bool(long long done, long long total)>;
  static constexpr long kStep = 1L << 20;

  // A pattern as written on the wire: digits with the radix suffix "H" (hexadecimal), "O"
  // (octal) or none (binary), "X" digits standing for don't-care bits. `bits` gets '0', '1'
  // or 'x' per bit, most significant first. False for anything else.
  static bool ParsePattern(const Dstring& text, Dstring& bits);

  // Along vectors (`alongTraces` false) the pattern is a word across traces trace ..
  // trace + n - 1 of one vector, its lowest bit on the lowest trace, and positions go vector
  // by vector. Along traces it is a run in time on one trace, its first bit first, and
  // positions go trace by trace. A don't-care state ("X") matches any bit.
  // Both searches give false when `step` stopped them.
  static bool Find(const SimSegment& segment, const Dstring& bits, bool alongTraces, const Dstring& direction,
                   long trace, long vector, long& foundTrace, long& foundVector, const Step& step);
  // The errored states ('k' and 'r', either case) of an analyser segment, vector by vector.
  static bool FindError(const SimSegment& segment, const Dstring& direction, long trace, long vector,
                        long& foundTrace, long& foundVector, const Step& step);
};
