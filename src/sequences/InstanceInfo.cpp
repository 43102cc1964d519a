// The instance record classes: InstanceInfo and the seven records derived from it.
#include "sequences/InstanceInfo.h"

#include <cstring>

#include "sequences/AnalyzerPortInstanceInfo.h"
#include "sequences/ParamInstanceInfo.h"
#include "sequences/PortInstanceInfo.h"
#include "sequences/SegmentPortInstanceInfo.h"
#include "sequences/SegmentPortSequenceBlockInstanceInfo.h"
#include "sequences/SequenceBlockInstanceInfo.h"

namespace {

void AppendText(LispList& list, const Dstring& text) {
  list.Append(DataItem::MakeString(text));
}
void AppendNumber(LispList& list, unsigned long n) {
  list.Append(DataItem::MakeUnsigned(n));
}

}  // namespace

// --- InstanceInfo ----------------------------------------------------------------------------

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

// --- PortInstanceInfo ------------------------------------------------------------------------

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

// --- AnalyzerPortInstanceInfo ----------------------------------------------------------------

AnalyzerPortInstanceInfo::AnalyzerPortInstanceInfo(const LispList& list) : PortInstanceInfo(list) {
  ReadNumber(list, 4, mDisplay);
}

bool AnalyzerPortInstanceInfo::isEqual(const InstanceInfo* other) const {
  return SameClass(other) && SamePort(static_cast<const PortInstanceInfo&>(*other));
}

void AnalyzerPortInstanceInfo::asLispList(LispList& list) const {
  PortInstanceInfo::asLispList(list);
  AppendNumber(list, mDisplay);
}

// --- SegmentPortInstanceInfo -----------------------------------------------------------------

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

// --- ParamInstanceInfo -----------------------------------------------------------------------

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

// --- SequenceBlockInstanceInfo ---------------------------------------------------------------

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

// --- SegmentPortSequenceBlockInstanceInfo ----------------------------------------------------

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
