#pragma once

#include "support/ConditionList.h"
#include "support/DstringList.h"

// The lines typed in the command window, oldest first, kept across runs in the registry
// ("...\Gui\CommandWindow", value "History"). Up and Down walk it as a shell's history does:
// Previous from the newest line backwards, Next forwards and at the end back to the text the
// user had begun.
class CommandHistory {
 public:
  static constexpr std::size_t kLength = 500;

  int Read(ConditionList& list);
  int Write(ConditionList& list) const;
  // Appends a line (not a repeat of the newest one) and ends any walk.
  void Add(const Dstring& line);
  // The line before the one shown; `current` is what the field holds when a walk begins.
  Dstring Previous(const Dstring& current);
  Dstring Next();
  const DstringList& Lines() const { return mLines; }

 private:
  DstringList mLines;
  std::size_t mCursor = 0;  // mLines.size() when not walking
  Dstring mBegun;
};
