#pragma once

#include "support/Dstring.h"

// A memory size in bits as a number and a 1024-based unit ("Bit", "KBit", "MBit", "GBit"),
// truncating.
class MemorySize {
 public:
  static void Format(unsigned long bits, Dstring& number, Dstring& unit);
};
