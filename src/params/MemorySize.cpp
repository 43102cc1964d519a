#include "params/MemorySize.h"

void MemorySize::Format(unsigned long bits, Dstring& number, Dstring& unit) {
  unsigned long count = bits;
  if (bits < 1024UL) {
    unit = "Bit";
  } else if (bits < 1048576UL) {
    count = bits >> 10;
    unit = "KBit";
  } else if (bits >= (1UL << 30)) {
    count = bits >> 30;
    unit = "GBit";
  } else {
    count = bits >> 20;
    unit = "MBit";
  }
  number = Dstring::Format("%d", static_cast<int>(count));
}
