#include "support/DstringList.h"

#include <algorithm>

Dstring DstringList::Join(std::string_view separator) const {
  Dstring out;
  for (std::size_t i = 0; i < size(); ++i) {
    if (i) out.append(separator);
    out.append((*this)[i]);
  }
  return out;
}

DstringList DstringList::Split(std::string_view text, char separator) {
  DstringList out;
  if (text.empty()) return out;
  std::size_t start = 0;
  for (;;) {
    auto at = text.find(separator, start);
    out.emplace_back(text.substr(start, at == std::string_view::npos ? text.npos : at - start));
    if (at == std::string_view::npos) break;
    start = at + 1;
  }
  return out;
}

bool DstringList::Contains(std::string_view item) const {
  return std::find(begin(), end(), item) != end();
}
