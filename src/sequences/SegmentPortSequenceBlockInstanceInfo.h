#pragma once

#include "sequences/SegmentPortInstanceInfo.h"

// A window that shows the segment one block plays on one port.
class SegmentPortSequenceBlockInstanceInfo : public SegmentPortInstanceInfo {
 public:
  SegmentPortSequenceBlockInstanceInfo() = default;
  SegmentPortSequenceBlockInstanceInfo(const Dstring& portClass, unsigned long portNum,
                                       const Dstring& segmentName, unsigned long blockNum)
      : SegmentPortInstanceInfo(portClass, portNum, segmentName), mBlockNum(blockNum) {}
  // As SegmentPortInstanceInfo; 2: block number. Element 2 is also the port class: the legacy
  // layout, kept exactly so (a stored list thus gives block number 0).
  explicit SegmentPortSequenceBlockInstanceInfo(const LispList& list);

  const char* IsA() const override { return "SegmentPortSequenceBlockInstanceInfo"; }
  bool isEqual(const InstanceInfo* other) const override;
  std::unique_ptr<InstanceInfo> Clone() const override {
    return std::make_unique<SegmentPortSequenceBlockInstanceInfo>(*this);
  }
  void asLispList(LispList& list) const override;

  unsigned long GetBlockNum() const { return mBlockNum; }

 private:
  unsigned long mBlockNum = 0;
};
