#include "SimUnitAttr.h"

#include <cmath>

#include "support/ConditionList.h"
#include "support/DataParcel.h"
#include "support/ParserExpression.h"

namespace {

constexpr int kBadType = -104;
constexpr int kBadValue = -224;

bool IsExponent(int e) {
  return e % 3 == 0 && e >= -12 && e <= 9;
}

// The reply form writes the unit between plain quotes and the step with six decimals: a unit
// with a quote or a control character, or a step that would be written as 0, cannot be told.
bool FitsReplyForm(const Dstring& unit, double step) {
  for (char c : unit) {
    if (c == '"' || static_cast<unsigned char>(c) < 0x20 || c == 0x7F) return false;
  }
  return Dstring::Format("%f", step) != "0.000000";
}

bool ReadInt(const DataItem& item, int& out) {
  long v = 0;
  if (!item.IsInteger() || !item.GetLong(v) || v < -100000 || v > 100000) return false;
  out = static_cast<int>(v);
  return true;
}

}  // namespace

Dstring SimUnitAttr::Format() const {
  return Dstring::Format("(\"%s\",%d,%d,%d,%fd)", mUnit.c_str(), mMinExp, mMaxExp, mCurExp, mStep);
}

int SimUnitAttr::Parse(std::string_view text, SimUnitAttr& out) {
  DataParcel items;
  ConditionList ignored;
  if (ParserExpression::Parse(text, items, ignored) != 0 || items.size() != 5) return kBadType;
  if (items[0].GetType() != DataItemType::String || !items[4].IsNumber()) return kBadType;
  SimUnitAttr attr;
  attr.mUnit = Dstring(items[0].GetText());
  if (!ReadInt(items[1], attr.mMinExp) || !ReadInt(items[2], attr.mMaxExp) ||
      !ReadInt(items[3], attr.mCurExp) || !items[4].GetDouble(attr.mStep)) {
    return kBadType;
  }
  if (attr.Check() != 0 || !FitsReplyForm(attr.mUnit, attr.mStep)) return kBadValue;
  out = attr;
  return 0;
}

int SimUnitAttr::Check() const {
  bool spanOk = IsExponent(mMinExp) && IsExponent(mMaxExp) && mMinExp <= mMaxExp;
  bool curOk = mCurExp == kNotSet || (IsExponent(mCurExp) && mCurExp >= mMinExp && mCurExp <= mMaxExp);
  bool stepOk = std::isfinite(mStep) && mStep > 0.0;
  return spanOk && curOk && stepOk ? 0 : kBadValue;
}
