#include "sequences/SegmentPortSequenceBlockInstanceInfo.h"

SegmentPortSequenceBlockInstanceInfo::SegmentPortSequenceBlockInstanceInfo(const LispList& list)
    : SegmentPortInstanceInfo(list) {
  ReadNumber(list, 2, mBlockNum);
}

bool SegmentPortSequenceBlockInstanceInfo::isEqual(const InstanceInfo* other) const {
  if (!SameClass(other)) return false;
  const auto& o = static_cast<const SegmentPortSequenceBlockInstanceInfo&>(*other);
  return SameSegmentPort(o) && mBlockNum == o.mBlockNum;
}

void SegmentPortSequenceBlockInstanceInfo::asLispList(LispList& list) const {
  SegmentPortInstanceInfo::asLispList(list);
  AppendNumber(list, mBlockNum);
}
