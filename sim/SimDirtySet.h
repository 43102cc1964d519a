#pragma once

#include <cstddef>
#include <string>
#include <unordered_set>
#include <vector>

#include "support/Dstring.h"

// What one handle has not yet been told about: the headers (without handle) changed by
// others since its last "DFL?", or "everything" once too much piled up.
class SimDirtySet {
 public:
  static constexpr std::size_t kMaxNames = 256;

  void Add(const Dstring& header);
  void MarkAll();
  // The reply to "DFL?" for `handle`, after which the set is empty.
  Dstring TakeReply(const Dstring& handle);

 private:
  bool mAll = false;
  std::vector<Dstring> mOrder;
  std::unordered_set<std::string> mSeen;
};
