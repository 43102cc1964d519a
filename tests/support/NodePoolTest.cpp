#include <gtest/gtest.h>

#include <thread>
#include <vector>

#include "support/LispList.h"
#include "support/NodePool.h"
#include "support/ParserExpression.h"

namespace {

TEST(NodePoolTest, AFreedBlockIsHandedOutAgainForTheSameSize) {
  void* first = NodePool::Allocate(96);
  NodePool::Free(first, 96);
  const std::size_t kept = NodePool::KeptBytes();
  EXPECT_GE(kept, 96u);
  void* second = NodePool::Allocate(90);  // the same 16-byte class
  EXPECT_EQ(second, first);
  EXPECT_EQ(NodePool::KeptBytes(), kept - 96);
  NodePool::Free(second, 90);
}

TEST(NodePoolTest, WhatAThreadKeepsIsBounded) {
  std::vector<void*> blocks;
  const std::size_t count = NodePool::kMaxKeptBytes / 4096 + 100;
  for (std::size_t i = 0; i < count; ++i) blocks.push_back(NodePool::Allocate(4096));
  for (void* block : blocks) NodePool::Free(block, 4096);
  EXPECT_LE(NodePool::KeptBytes(), NodePool::kMaxKeptBytes);
}

// A tree made on one thread and freed on another, whose lists it joins or the heap takes.
TEST(NodePoolTest, ATreeParsedOnOneThreadIsFreedOnAnother) {
  LispList tree;
  ConditionList list;
  ASSERT_EQ(ParserExpression::Parse("(1,(2,(3,\"a long text that is not held in place\")),x)", tree, list), 0);
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
