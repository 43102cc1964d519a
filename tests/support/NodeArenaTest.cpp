#include <gtest/gtest.h>

#include <cstdint>
#include <thread>
#include <vector>

#include "support/LispList.h"
#include "support/NodeArena.h"
#include "support/ParserExpression.h"

namespace {

using Stream = NodeArena::Stream;
constexpr std::size_t kPiece = 4000;

std::uintptr_t ChunkOf(const void* piece) {
  return reinterpret_cast<std::uintptr_t>(piece) / NodeArena::kChunkBytes;
}

// Pieces of one stream follow each other, whatever the other stream cuts meanwhile. A chunk
// ends at most once among three pieces, so one pair of neighbours is always adjacent.
TEST(NodeArenaTest, EachStreamCutsItsPiecesOneAfterAnother) {
  std::vector<char*> trees, records;
  for (int i = 0; i < 3; ++i) {
    trees.push_back(static_cast<char*>(NodeArena::Allocate(Stream::Trees, 48)));
    records.push_back(static_cast<char*>(NodeArena::Allocate(Stream::Records, 40)));
  }
  EXPECT_TRUE(trees[1] == trees[0] + 48 || trees[2] == trees[1] + 48);
  EXPECT_TRUE(records[1] == records[0] + 48 || records[2] == records[1] + 48);  // whole 16-byte grains
  for (int i = 0; i < 3; ++i) {
    NodeArena::Free(trees[i], 48);
    NodeArena::Free(records[i], 40);
  }
}

// Run on a thread of its own, so that it starts without spare chunks.
template <typename Check>
void OnFreshThread(Check check) {
  std::thread(check).join();
}

// Cuts pieces until one lands in a chunk other than `first`'s; all but that one go to `made`.
void* CutThrough(void* first, std::vector<void*>& made) {
  made.push_back(first);
  for (;;) {
    void* piece = NodeArena::Allocate(Stream::Trees, kPiece);
    if (ChunkOf(piece) != ChunkOf(first)) return piece;
    made.push_back(piece);
  }
}

// A chunk cut through goes back whole once its last piece is freed, not before, and is the
// next chunk the thread cuts from.
TEST(NodeArenaTest, AChunkReturnsWholeAfterItsLastPieceAndIsCutAgain) {
  OnFreshThread([] {
    std::vector<void*> a;
    void* inB = CutThrough(NodeArena::Allocate(Stream::Trees, kPiece), a);
    for (std::size_t i = 1; i < a.size(); ++i) NodeArena::Free(a[i], kPiece);
    EXPECT_EQ(NodeArena::SpareBytes(), 0u);
    NodeArena::Free(a.front(), kPiece);
    EXPECT_EQ(NodeArena::SpareBytes(), NodeArena::kChunkBytes);

    std::vector<void*> b;
    void* next = CutThrough(inB, b);
    EXPECT_EQ(ChunkOf(next), ChunkOf(a.front()));
    EXPECT_EQ(NodeArena::SpareBytes(), 0u);
    for (void* piece : b) NodeArena::Free(piece, kPiece);
    NodeArena::Free(next, kPiece);
  });
}

TEST(NodeArenaTest, WhatAThreadKeepsIsBounded) {
  OnFreshThread([] {
    std::vector<void*> pieces;
    const std::size_t count = (NodeArena::kMaxSpareBytes + 4 * NodeArena::kChunkBytes) / kPiece;
    for (std::size_t i = 0; i < count; ++i) pieces.push_back(NodeArena::Allocate(Stream::Trees, kPiece));
    for (void* piece : pieces) NodeArena::Free(piece, kPiece);
    EXPECT_GT(NodeArena::SpareBytes(), 0u);
    EXPECT_LE(NodeArena::SpareBytes(), NodeArena::kMaxSpareBytes);
  });
}

// A tree made on one thread and freed on another: its chunks go to whichever thread frees
// their last piece.
TEST(NodeArenaTest, ATreeParsedOnOneThreadIsFreedOnAnother) {
  LispList tree;
  ConditionList list;
  ASSERT_EQ(ParserExpression::Parse("(1,(2,(3,\"a long text that is not held in place\")),x)", tree, list),
            0);
  LispList copy = tree;
  std::thread([taken = std::move(tree)]() mutable { LispList gone = std::move(taken); }).join();
  EXPECT_EQ(copy.AsExpression(), "(1,(2,(3,\"a long text that is not held in place\")),x)");
  std::thread([&copy] {
    LispList other;
    ConditionList errors;
    ASSERT_EQ(ParserExpression::Parse("(4,(5))", other, errors), 0);
    copy = other;
  }).join();
  EXPECT_EQ(copy.AsExpression(), "(4,(5))");
}

}  // namespace
