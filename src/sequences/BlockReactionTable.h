#pragma once

#include "support/ConditionList.h"
#include "support/Dstring.h"

class CSequence;

// The event window's table of one block's reactions over the sequence model: a row per
// reaction (from 0, as the model counts them), the columns if, go to label, trigger and VXI
// trigger. What a cell shows, whether it takes an edit, and the edit a typed cell becomes. The
// table keeps the block number it was given: a block inserted above moves the block it means.
class BlockReactionTable {
 public:
  enum Column : unsigned long { kIf = 0, kGoto = 1, kTrigger = 2, kVxi = 3, kColumns = 4 };

  BlockReactionTable(CSequence& sequence, unsigned long block) : mSequence(sequence), mBlock(block) {}

  CSequence& Sequence() const { return mSequence; }
  unsigned long Block() const { return mBlock; }
  void SetBlock(unsigned long block) { mBlock = block; }
  // Whether the sequence still has the block.
  bool HasBlock() const;
  unsigned long Rows() const;
  static Dstring Heading(unsigned long column);
  // Empty outside the table.
  Dstring Text(unsigned long n, unsigned long column) const;
  // A synchronisation block has no reactions, and nothing is changed while another client
  // holds the instrument.
  bool IsEditable(bool locked) const;
  // The typed text (blanks around it dropped) as one edit of the model; a trigger must be a
  // whole number from 0. A refusal is in `cond`.
  int Write(unsigned long n, unsigned long column, const Dstring& text, ConditionList& cond) const;

 private:
  CSequence& mSequence;
  unsigned long mBlock;
};
