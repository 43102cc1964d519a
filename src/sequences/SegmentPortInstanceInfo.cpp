#include "sequences/SegmentPortInstanceInfo.h"

SegmentPortInstanceInfo::SegmentPortInstanceInfo(const LispList& list) : PortInstanceInfo(list) {
  ReadText(list, 4, mSegmentName);
}

bool SegmentPortInstanceInfo::isEqual(const InstanceInfo* other) const {
  return SameClass(other) && SameSegmentPort(static_cast<const SegmentPortInstanceInfo&>(*other));
}

void SegmentPortInstanceInfo::asLispList(LispList& list) const {
  PortInstanceInfo::asLispList(list);
  AppendText(list, mSegmentName);
}
