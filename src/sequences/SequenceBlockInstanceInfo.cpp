#include "sequences/SequenceBlockInstanceInfo.h"

SequenceBlockInstanceInfo::SequenceBlockInstanceInfo(const LispList& list) : InstanceInfo(list) {
  ReadNumber(list, 2, mBlockNum);
}

bool SequenceBlockInstanceInfo::isEqual(const InstanceInfo* other) const {
  return SameClass(other) && mBlockNum == static_cast<const SequenceBlockInstanceInfo&>(*other).mBlockNum;
}

void SequenceBlockInstanceInfo::asLispList(LispList& list) const {
  InstanceInfo::asLispList(list);
  AppendNumber(list, mBlockNum);
}
