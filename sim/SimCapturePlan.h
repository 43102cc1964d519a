#pragma once

#include <string_view>
#include <vector>

#include "support/Dstring.h"

// What one data port plays under a sequence, from its start, as runs of a segment slot: the
// blocks in order, loops repeated (an endless loop until `vectors` are covered), and the
// whole sequence again from the start while fewer than `vectors` are covered.
class SimCapturePlan {
 public:
  struct Run {
    Dstring segment;  // a segment name, or an upper-case keyword ("PAUSE1")
    bool named = false;
    unsigned long length = 0;
  };

  // The runs of data port `port` (its place among the data ports) covering `vectors`; empty
  // for a text that plays nothing.
  static std::vector<Run> Runs(std::string_view sequence, std::size_t port, unsigned long vectors);
};
