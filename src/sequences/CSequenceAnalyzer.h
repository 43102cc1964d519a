#pragma once

#include <vector>

#include "sequences/SequenceContent.h"
#include "support/ConditionList.h"

class CSequenceObserver;

// The change analysis of a read (CSequence::AnalyzeChanges): pairs the old and the new blocks
// and loops and tells the observers what changed, in the order CSequenceObserver describes.
//
// Blocks are paired by a longest common subsequence of blocks equal in content (loops aside),
// after the common head and tail are taken off; between two pairs, removed and added blocks are
// paired in order as blocks that stayed and changed, and the rest reported as deleted or
// inserted. A loop stayed when a new loop of its level covers exactly the blocks its blocks
// became. Beyond kMaxCells cells of the pairing table the views are refreshed whole.
class CSequenceAnalyzer {
 public:
  static constexpr std::size_t kMaxCells = std::size_t{1} << 22;

  // `observers` is the sequence's live list: an observer that leaves while being told is not
  // told again.
  CSequenceAnalyzer(const std::vector<CSequenceObserver*>& observers, ConditionList& cond)
      : mObservers(observers), mCond(cond) {}

  int Analyze(const SequenceTypes::Content& old, const SequenceTypes::Content& now);
  // NfySequence to every observer.
  int Refresh();

 private:
  struct Op {
    enum Kind { Same, Changed, Deleted, Inserted } kind;
    unsigned long oldIndex;  // from 0
    unsigned long newIndex;
  };

  template <typename Tell>
  int TellAll(Tell tell);
  // The edit script from old to new; false when the pairing table would be too large.
  bool Script(const SequenceTypes::Content& old, const SequenceTypes::Content& now,
              std::vector<Op>& ops) const;
  int ReportBlocks(const SequenceTypes::Content& old, const SequenceTypes::Content& now,
                   const std::vector<Op>& ops);
  int ReportBlockChange(const SequenceTypes::CSequenceBlock& was, const SequenceTypes::CSequenceBlock& is,
                        unsigned long block, unsigned long numPorts);
  int ReportLoops(const SequenceTypes::Content& old, const SequenceTypes::Content& now,
                  const std::vector<Op>& ops);

  const std::vector<CSequenceObserver*>& mObservers;
  ConditionList& mCond;
};
