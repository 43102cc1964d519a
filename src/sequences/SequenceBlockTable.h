#pragma once

#include "support/ConditionList.h"
#include "support/Dstring.h"

class CSequence;

// The simple sequence editor's table over the sequence model: a row per block (from 1), the
// columns label, length and then the segment of each port. What a cell shows, whether it takes
// an edit, and the one edit of the model a typed cell becomes.
class SequenceBlockTable {
 public:
  static constexpr unsigned long kLabel = 0;
  static constexpr unsigned long kLength = 1;
  static constexpr unsigned long kFirstPort = 2;

  explicit SequenceBlockTable(CSequence& sequence) : mSequence(sequence) {}

  CSequence& Sequence() const { return mSequence; }
  unsigned long Rows() const;
  unsigned long Columns() const;
  // The port of `column` (from 1); 0 for the label and the length.
  static unsigned long PortOf(unsigned long column) { return column < kFirstPort ? 0 : column - kFirstPort + 1; }
  // The heading of the label and length columns; a port's heading is the window's.
  static Dstring Heading(unsigned long column);
  // Empty outside the table.
  Dstring Text(unsigned long block, unsigned long column) const;
  // The segment a port's cell names; empty for a word (PAUSE …) or another column.
  Dstring NamedSegment(unsigned long block, unsigned long column) const;
  // A sequence with loops belongs to the loop grid, and nothing is changed while another
  // client holds the instrument.
  bool IsEditable(bool locked) const;
  // The typed text (blanks around it dropped) as one edit of the model; a refusal is in `cond`.
  int Write(unsigned long block, unsigned long column, const Dstring& text, ConditionList& cond) const;

 private:
  CSequence& mSequence;
};
