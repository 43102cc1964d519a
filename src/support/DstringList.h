#pragma once

#include <string_view>
#include <vector>

#include "support/Dstring.h"

class DstringList : public std::vector<Dstring> {
 public:
  using std::vector<Dstring>::vector;

  Dstring Join(std::string_view separator) const;
  // Splits on every occurrence of the separator character; an empty text gives an empty list.
  static DstringList Split(std::string_view text, char separator);
  bool Contains(std::string_view item) const;
};
