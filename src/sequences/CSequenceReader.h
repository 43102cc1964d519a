#pragma once

#include "sequences/SequenceContent.h"
#include "support/LispList.h"
#include "support/ParserExpression.h"

class CSequence;

// Rebuilds the blocks and loops that a block expression (the third top element of a sequence
// expression) describes. Two generations of layout (docs/sequences.md):
//  - second (versions above 1.0 up to 3.0), what CSequenceWriter writes:
//      (BLOCK,trigger,length,measure,"vxi",SYNC|(reactions),segment,0,0,...)
//      (SEQ,item,"label",item,...)   (LOOPh,trigger,iterations|INF,"vxi",element)
//  - first (version 1.0 and below), without triggers, reactions and levels:
//      (BLOCK,length,segment,...)   (SEQ,item,"label",item,...)   (LOOP,iterations|INF,element)
//    where a loop's level is one above the highest level of the loops inside it.
// Keywords are read in any case. A loop holds only loops of lower levels; every block has the
// same number of ports; levels go up to SequenceTypes::kMaxLoopLevels.
class CSequenceReader {
 public:
  enum class Generation { First, Second };

  // Appends to `out`, which must be empty; false when the element breaks the layout (`out` is
  // then half built and must be cleared).
  static bool Read(const LispList& element, Generation generation, CSequence* owner,
                   SequenceTypes::Content& out);
  // The layout a version number of a sequence expression stands for.
  static Generation GenerationOf(double version) { return version <= 1.0 ? Generation::First : Generation::Second; }

  // Reads a SEQ block expression while the parser reads the whole sequence expression: it takes
  // the items and labels of that SEQ list as they come, so the tree of a long sequence never
  // stands whole beside the blocks read from it. Other block expressions, and a text that is
  // not one parenthesised list, are left in the tree for Read.
  class Stream : public ParserExpression::Sink {
   public:
    Stream(CSequence* owner, SequenceTypes::Content& out) : mOwner(owner), mOut(out) {}
    std::size_t Depth() const override { return 2; }
    bool Take(std::size_t depth, std::size_t index, LispList& element) override;
    // True when it read the block expression; the tree then holds only its SEQ keyword.
    bool Streamed() const { return mStreamed; }
    // False when what it read broke the layout.
    bool Ok() const { return !mFailed && mCount >= 2 && mCount % 2 == 0; }

   private:
    CSequence* mOwner;
    SequenceTypes::Content& mOut;
    std::size_t mTopCount = 0;
    bool mVersionOk = false;
    Generation mGeneration = Generation::Second;
    bool mStreamed = false;
    bool mFailed = false;
    std::size_t mCount = 0;
    unsigned long mLevel = 0;
    LispList mLabel;
  };

  // A label: any plain item, quoted or not, as its text (a start label 5 is "5"); false for a
  // list or a block.
  static bool Label(const LispList& element, Dstring& out);

  // The reader names, one per generation.
  static bool ReadBlockExpression(const LispList& element, CSequence* owner, SequenceTypes::Content& out) {
    return Read(element, Generation::First, owner, out);
  }
  static bool ReadBlockExpression2(const LispList& element, CSequence* owner, SequenceTypes::Content& out) {
    return Read(element, Generation::Second, owner, out);
  }
};
