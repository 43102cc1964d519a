#pragma once

#include <string_view>

#include "sequences/SequenceContent.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

// Writes the sequence expression, version 3.0:
// no blanks, numbers in decimal, texts in double quotes with a double quote doubled.
class CSequenceWriter {
 public:
  // 0, or 1 with "GUI_SEQUENCE_IMPOSSIBLE_NESTING_LOOPS" (block, level) when a loop overlaps a
  // loop of a higher level or leaves the range being written; `out` is then unspecified.
  static int Write(const SequenceTypes::Content& content, unsigned long levels, Dstring& out,
                   ConditionList& cond);
  // Appends `text` in `quote`s, doubling every quote inside.
  static void AppendQuoted(Dstring& out, std::string_view text, char quote = '"');
};
