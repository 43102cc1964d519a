#pragma once

#include <cstdlib>
#include <cstring>

#include "support/Dstring.h"

// The number after `word` in a header (":CGR2:MOD3:CONN1:BER" and ":MOD" give 3; 0 without it).
inline long NumberAfter(const Dstring& header, const char* word) {
  auto at = header.find(word);
  return at == Dstring::npos ? 0 : std::strtol(header.c_str() + at + std::strlen(word), nullptr, 10);
}
