#include "sequences/PortInstanceInfo.h"

PortInstanceInfo::PortInstanceInfo(const LispList& list) : InstanceInfo(list) {
  ReadText(list, 2, mPortClass);
  ReadNumber(list, 3, mPortNum);
}

bool PortInstanceInfo::isEqual(const InstanceInfo* other) const {
  return SameClass(other) && SamePort(static_cast<const PortInstanceInfo&>(*other));
}

void PortInstanceInfo::asLispList(LispList& list) const {
  InstanceInfo::asLispList(list);
  AppendText(list, mPortClass);
  AppendNumber(list, mPortNum);
}
