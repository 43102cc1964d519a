#pragma once

#include <memory>
#include <vector>

// The names the sequence model shares with its reader, writer, change analysis and loop rules,
// so that those helpers need not see CSequence itself. CSequence derives from this class:
// CSequence::CSequenceBlock, CSequence::CLoop, CSequence::SEG_PAUSE and the rest are these.
class SequenceTypes {
 public:
  class CSequenceBlock;  // CSequenceBlock.h
  class CLoop;           // CLoop.h
  struct Content;        // SequenceContent.h
  using BlockList = std::vector<std::unique_ptr<CSequenceBlock>>;
  using LoopList = std::vector<std::unique_ptr<CLoop>>;

  // Segment kind of a port's item; a quoted name and any unknown keyword are SEG_NAMED.
  enum SeqSegType : int {
    SEG_NAMED = 0,
    SEG_PAUSE = 1,
    SEG_PAUSE0 = 2,
    SEG_PAUSE1 = 3,
    SEG_ACQUIRE = 4,
    SEG_EXPECTED0 = 5,
    SEG_EXPECTED1 = 6,
    SEG_DONTCARE = 7,
  };
  enum LOOP_STATUS : int { LOOP_NONE = 0, LOOP_SINGLE = 1, LOOP_START = 2, LOOP_END = 3, LOOP_INSIDE = 4 };

  // More levels than any instrument has; a reply or expression beyond it is refused.
  static constexpr unsigned long kMaxLoopLevels = 16;
  // The length of a block made by AddBlockBefore/AddBlockAfter (docs/sequences.md).
  static constexpr unsigned long kDefaultBlockLength = 512;
  static constexpr int kStatusError = 1;

  // The instrument's number of loop levels, class-wide; set by CSequence.
  static unsigned long GetNumLoopLevels() { return mNumLoopLevels; }
  static bool IsNumLoopLevelsInitialized() { return mIsNumLoopLevelsInitialized; }

 protected:
  SequenceTypes() = default;
  ~SequenceTypes() = default;

  static inline unsigned long mNumLoopLevels = 0;
  static inline bool mIsNumLoopLevelsInitialized = false;
};
