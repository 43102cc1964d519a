#pragma once

#include "sequences/CSequence.h"
#include "support/LispList.h"

// Rebuilds the blocks and loops that a block expression (the third top element of a sequence
// expression) describes. Two generations of layout (docs/sequences.md):
//  - second (versions above 1.0 up to 3.0), what CSequenceWriter writes:
//      (BLOCK,trigger,length,measure,"vxi",SYNC|(reactions),segment,0,0,...)
//      (SEQ,item,"label",item,...)   (LOOPh,trigger,iterations|INF,"vxi",element)
//  - first (version 1.0 and below), without triggers, reactions and levels:
//      (BLOCK,length,segment,...)   (SEQ,item,"label",item,...)   (LOOP,iterations|INF,element)
//    where a loop's level is one above the highest level of the loops inside it.
// Keywords are read in any case. A loop holds only loops of lower levels; every block has the
// same number of ports; levels go up to CSequence::kMaxLoopLevels.
class CSequenceReader {
 public:
  enum class Generation { First, Second };

  // Appends to `out`, which must be empty; false when the element breaks the layout (`out` is
  // then half built and must be cleared).
  static bool Read(const LispList& element, Generation generation, CSequence* owner, CSequence::Content& out);

  // A label: any plain item, quoted or not, as its text (a start label 5 is "5"); false for a
  // list or a block.
  static bool Label(const LispList& element, Dstring& out);

  // The reader names, one per generation.
  static bool ReadBlockExpression(const LispList& element, CSequence* owner, CSequence::Content& out) {
    return Read(element, Generation::First, owner, out);
  }
  static bool ReadBlockExpression2(const LispList& element, CSequence* owner, CSequence::Content& out) {
    return Read(element, Generation::Second, owner, out);
  }
};
