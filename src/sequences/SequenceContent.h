#pragma once

#include "sequences/SequenceTypes.h"

// What an expression describes: the blocks (block n is blocks[n - 1]), the loops, which the
// blocks point at and this owns, and the number of ports of every block. The readers build
// one, the writer writes one, the change analysis compares two.
struct SequenceTypes::Content {
  Content();
  ~Content();
  Content(Content&&) noexcept;
  Content& operator=(Content&&) noexcept;
  void Clear();

  unsigned long numPorts = 0;
  BlockList blocks;
  LoopList loops;
};
