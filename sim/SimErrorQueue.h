#pragma once

#include <cstddef>
#include <deque>

#include "support/Dstring.h"

// The SCPI error queue of one handle (or of one connection, for commands naming no known
// handle). A full queue keeps its oldest entries and turns the newest into "Queue overflow".
class SimErrorQueue {
 public:
  static constexpr std::size_t kCapacity = 32;

  void Push(int code, const Dstring& text);
  // Removes and returns the oldest entry as code,"text"; 0,"No error" when empty.
  Dstring Pop();
  bool IsEmpty() const { return mEntries.empty(); }
  std::size_t Count() const { return mEntries.size(); }
  void Clear() { mEntries.clear(); }

 private:
  std::deque<Dstring> mEntries;
};
