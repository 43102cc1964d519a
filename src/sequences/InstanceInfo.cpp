#include "sequences/InstanceInfo.h"

#include <cstring>

InstanceInfo::InstanceInfo(const LispList& list) {
  ReadText(list, 1, mInstanceName);
}

bool InstanceInfo::SameClass(const InstanceInfo* other) const {
  return other != nullptr && std::strcmp(IsA(), other->IsA()) == 0;
}

bool InstanceInfo::isEqual(const InstanceInfo* other) const {
  return SameClass(other) && mInstanceName == other->mInstanceName;
}

void InstanceInfo::asLispList(LispList& list) const {
  list.Clear();
  AppendText(list, IsA());
  AppendText(list, mInstanceName);
}

void InstanceInfo::ReadText(const LispList& list, std::size_t index, Dstring& out) {
  if (!list.IsList() || index >= list.Size() || !list[index].IsItem() || !list[index].GetItem().IsText())
    return;
  out = Dstring(list[index].GetItem().GetText());
}

void InstanceInfo::ReadNumber(const LispList& list, std::size_t index, unsigned long& out) {
  if (!list.IsList() || index >= list.Size() || !list[index].IsItem()) return;
  unsigned long n = 0;
  if (list[index].GetItem().IsInteger() && list[index].GetItem().GetULong(n)) out = n;
}

void InstanceInfo::AppendText(LispList& list, const Dstring& text) {
  list.Append(DataItem::MakeString(text));
}

void InstanceInfo::AppendNumber(LispList& list, unsigned long n) {
  list.Append(DataItem::MakeUnsigned(n));
}
