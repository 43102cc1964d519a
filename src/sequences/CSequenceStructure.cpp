#include "sequences/CSequenceStructure.h"

#include <algorithm>

#include "sequences/CLoop.h"
#include "sequences/CSequenceBlock.h"

SequenceTypes::LOOP_STATUS CSequenceStructure::LoopStatus(const Content& content, unsigned long block,
                                                          unsigned long level) {
  if (block == 0 || block > content.blocks.size()) return SequenceTypes::LOOP_NONE;
  const Loop* loop = content.blocks[block - 1]->GetLoop(level);
  if (loop == nullptr) return SequenceTypes::LOOP_NONE;
  if (loop->GetStart() == block)
    return loop->GetLength() == 1 ? SequenceTypes::LOOP_SINGLE : SequenceTypes::LOOP_START;
  return loop->GetEnd() == block ? SequenceTypes::LOOP_END : SequenceTypes::LOOP_INSIDE;
}

unsigned long CSequenceStructure::MaxLoopLevel(const Content& content) {
  unsigned long level = 0;
  for (const auto& loop : content.loops) level = std::max(level, loop->GetLevel());
  return level;
}

unsigned long CSequenceStructure::Levels(const Content& content) {
  return std::max(SequenceTypes::GetNumLoopLevels(), MaxLoopLevel(content));
}

void CSequenceStructure::Insert(Content& content, unsigned long n, bool before,
                                std::unique_ptr<Block> block) {
  const unsigned long levels = Levels(content);
  block->ClearLoops();
  for (unsigned long level = 1; level <= levels; ++level) {
    const SequenceTypes::LOOP_STATUS status = LoopStatus(content, n, level);
    const bool joins = before ? (status == SequenceTypes::LOOP_END || status == SequenceTypes::LOOP_INSIDE)
                              : (status == SequenceTypes::LOOP_START || status == SequenceTypes::LOOP_INSIDE);
    if (!joins) continue;
    Loop* loop = content.blocks[n - 1]->GetLoop(level);
    loop->SetLength(loop->GetLength() + 1);
    block->SetLoop(level, loop);
  }
  for (const auto& loop : content.loops) {
    if (before ? loop->GetStart() >= n : loop->GetStart() > n) loop->SetStart(loop->GetStart() + 1);
  }
  const unsigned long at = before ? n - 1 : n;
  content.blocks.insert(content.blocks.begin() + static_cast<std::ptrdiff_t>(at), std::move(block));
}

std::unique_ptr<CSequenceStructure::Block> CSequenceStructure::Remove(Content& content, unsigned long n) {
  std::unique_ptr<Block> block = std::move(content.blocks[n - 1]);
  content.blocks.erase(content.blocks.begin() + static_cast<std::ptrdiff_t>(n - 1));
  for (auto& loop : content.loops) {
    if (loop->GetStart() < n && loop->Contains(n)) {
      loop->SetLength(loop->GetLength() - 1);
    } else if (loop->GetStart() > n) {
      loop->SetStart(loop->GetStart() - 1);
    } else if (loop->GetStart() == n) {
      loop->SetLength(loop->GetLength() - 1);
    }
  }
  // Only the block taken out can point at a loop it alone made up.
  std::erase_if(content.loops, [](const std::unique_ptr<Loop>& loop) { return loop->GetLength() == 0; });
  block->ClearLoops();
  return block;
}

CSequenceStructure::Loop* CSequenceStructure::AddLoop(Content& content, CSequence* owner, unsigned long block,
                                                      unsigned long length, unsigned long level) {
  auto loop = std::make_unique<Loop>(owner, block, length);
  loop->SetLevel(level);
  for (unsigned long b = block; b < block + length; ++b) content.blocks[b - 1]->SetLoop(level, loop.get());
  content.loops.push_back(std::move(loop));
  return content.loops.back().get();
}

void CSequenceStructure::RemoveLoop(Content& content, Loop* loop) {
  for (auto& block : content.blocks) {
    if (block->GetLoop(loop->GetLevel()) == loop) block->SetLoop(loop->GetLevel(), nullptr);
  }
  std::erase_if(content.loops, [loop](const std::unique_ptr<Loop>& l) { return l.get() == loop; });
}
