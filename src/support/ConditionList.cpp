#include "support/ConditionList.h"

#include <algorithm>

void ConditionList::Append(const ConditionList& other) {
  mConditions.insert(mConditions.end(), other.mConditions.begin(), other.mConditions.end());
}

bool ConditionList::HasKey(const Dstring& key) const {
  return std::any_of(mConditions.begin(), mConditions.end(), [&](const Condition& c) { return c.GetKey() == key; });
}

Dstring ConditionList::ToText() const {
  Dstring out;
  for (const auto& c : mConditions) out.AppendPrintf("%ld: %s\n", c.GetCode(), c.GetMessage().c_str());
  return out;
}
