#include "sequences/ParamInstanceInfo.h"

ParamInstanceInfo::ParamInstanceInfo(const LispList& list) : InstanceInfo(list) {
  ReadText(list, 2, mCmdPath);
  ReadNumber(list, 3, mResType);
}

bool ParamInstanceInfo::isEqual(const InstanceInfo* other) const {
  if (!SameClass(other)) return false;
  const auto& o = static_cast<const ParamInstanceInfo&>(*other);
  return mCmdPath == o.mCmdPath && mResType == o.mResType && mStartPage == o.mStartPage;
}

void ParamInstanceInfo::asLispList(LispList& list) const {
  InstanceInfo::asLispList(list);
  AppendText(list, mCmdPath);
  AppendNumber(list, mResType);
  AppendNumber(list, mStartPage);
}
