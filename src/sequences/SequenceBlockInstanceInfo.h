#pragma once

#include "sequences/InstanceInfo.h"

// A window that shows one block of the sequence.
class SequenceBlockInstanceInfo : public InstanceInfo {
 public:
  SequenceBlockInstanceInfo() = default;
  explicit SequenceBlockInstanceInfo(unsigned long blockNum) : mBlockNum(blockNum) {}
  // As InstanceInfo; 2: block number.
  explicit SequenceBlockInstanceInfo(const LispList& list);

  const char* IsA() const override { return "SequenceBlockInstanceInfo"; }
  bool isEqual(const InstanceInfo* other) const override;
  std::unique_ptr<InstanceInfo> Clone() const override {
    return std::make_unique<SequenceBlockInstanceInfo>(*this);
  }
  void asLispList(LispList& list) const override;

  unsigned long GetBlockNum() const { return mBlockNum; }

 private:
  unsigned long mBlockNum = 0;
};
