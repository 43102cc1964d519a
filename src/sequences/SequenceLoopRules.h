#pragma once

#include "support/ConditionList.h"
#include "support/Dstring.h"

class CSequence;

// Where a new loop may go, and which counts a loop may have, said before anything is written:
// the model's SetLoop leaves a range that already loops on the level alone without a word, and
// a loop that crosses another is found only when the expression is built. A loop of level h
// holds loops of lower levels whole and lies whole inside loops of higher levels. Refusals are
// conditions with status 1.
class SequenceLoopRules {
 public:
  // Whether blocks first .. last (from 1) may loop on `level`.
  static int Check(const CSequence& sequence, unsigned long first, unsigned long last, unsigned long level,
                   ConditionList& cond);
  // The lowest level blocks first .. last may loop on; 0 and a condition when there is none.
  static unsigned long FreeLevel(const CSequence& sequence, unsigned long first, unsigned long last,
                                 ConditionList& cond);
  // Reads a typed loop count: a whole number from 1 to `largest` (0: no limit known).
  static int ParseCount(const Dstring& text, unsigned long largest, unsigned long& count,
                        ConditionList& cond);
  // Sets the count of block's loop on `level` from typed text; the top level's loop always runs
  // for ever and is refused a count.
  static int SetCount(CSequence& sequence, unsigned long block, unsigned long level, const Dstring& text,
                      unsigned long largest, ConditionList& cond);
  // The largest loop count the instrument plays (":%s:SGEN:GLOB:SEQ:ITER:MAX?").
  static int ReadLargestCount(unsigned long& largest, ConditionList& cond);
};
