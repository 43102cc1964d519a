#pragma once

#include <memory>

#include "sequences/SequenceContent.h"

class CSequence;

// The loop rules of inserting and removing blocks (AddBlockBefore/After and
// DeleteBlock), shared by the edits, the clipboard and MoveBlock. Numbers count from 1.
class CSequenceStructure {
 public:
  using Content = SequenceTypes::Content;
  using Block = SequenceTypes::CSequenceBlock;
  using Loop = SequenceTypes::CLoop;

  static SequenceTypes::LOOP_STATUS LoopStatus(const Content& content, unsigned long block,
                                               unsigned long level);
  // The highest level any loop of the content has (0 without loops).
  static unsigned long MaxLoopLevel(const Content& content);
  // The levels the writer and the loop rules work on: the instrument's, or more when the
  // content holds loops above them (a sequence read before the levels were known).
  static unsigned long Levels(const Content& content);

  // Inserts `block` as block n (before = true) or n + 1 (before = false; n = 0 inserts the
  // first block): on each level it joins the loop of block n when block n's status is
  // END/INSIDE (before) or START/INSIDE (after), and later loops move up one block.
  static void Insert(Content& content, unsigned long n, bool before, std::unique_ptr<Block> block);
  // Takes block n out: loops around it shrink, later loops move down, a loop left empty goes.
  static std::unique_ptr<Block> Remove(Content& content, unsigned long n);
  // A new loop over block .. block + length - 1 on `level`, pointed at by those blocks.
  static Loop* AddLoop(Content& content, CSequence* owner, unsigned long block, unsigned long length,
                       unsigned long level);
  static void RemoveLoop(Content& content, Loop* loop);
};
