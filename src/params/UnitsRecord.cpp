#include "params/UnitsRecord.h"

#include "support/ConditionListLoader.h"
#include "support/DataParcel.h"
#include "support/ParserExpression.h"

namespace {

bool ReadExp(const DataParcel& items, std::size_t i, std::int32_t& out) {
  long value = 0;
  if (i >= items.size() || !items[i].IsInteger() || !items[i].GetLong(value)) return false;
  if (value < INT32_MIN || value > INT32_MAX) return false;
  out = static_cast<std::int32_t>(value);
  return true;
}

bool ReadStep(const DataParcel& items, double& out) {
  if (items.size() <= 4 || !items[4].IsNumber()) return false;
  if (items[4].GetType() == DataItemType::Float) {
    float f = 0.0F;
    if (!items[4].GetFloat(f)) return false;
    out = f;
    return true;
  }
  return items[4].GetDouble(out);
}

}  // namespace

bool UnitsRecord::operator!=(const UnitsRecord& other) const {
  return unitName != other.unitName || minExp != other.minExp || maxExp != other.maxExp ||
         curExp != other.curExp || !(step == other.step);
}

Dstring UnitsRecord::Format() const {
  return Dstring::Format("(\"%s\",%d,%d,%d,%fd)", unitName.c_str(), minExp, maxExp, curExp, step);
}

int UnitsRecord::Parse(const Dstring& reply, ConditionList& list) {
  DataParcel items;
  ConditionList parseErrors;
  if (ParserExpression::Parse(reply, items, parseErrors) != 0) items.clear();
  int failures = 0;
  auto bad = [&] {
    ConditionListLoader::ConditionToken(list, "GUI_ATTR_QUERY_BAD_FORMAT", {reply}, 1);
    ++failures;
  };
  if (!items.empty() && items[0].IsText()) {
    unitName = Dstring(items[0].GetText());
  } else {
    bad();
  }
  if (!ReadExp(items, 1, minExp)) bad();
  if (!ReadExp(items, 2, maxExp)) bad();
  if (!ReadExp(items, 3, curExp)) bad();
  if (!ReadStep(items, step)) {
    bad();
    step = kNoValue;
  }
  if (step == kNoValue) step = 1.0;
  if (curExp == kExpNotSet) {
    if (minExp < 0 && maxExp < 0) {
      curExp = maxExp;
    } else if (minExp > 0 && maxExp > 0) {
      curExp = minExp;
    } else {
      curExp = 0;
    }
  }
  return failures == 0 ? 0 : 1;
}

const char* UnitsRecord::PrefixOf(std::int32_t exp) {
  static const char* const kPrefixes[] = {"p", "n", "u", "m", " ", "k", "M", "G"};
  const std::int32_t index = exp / 3 + 4;
  return index >= 0 && index < 8 ? kPrefixes[index] : "";
}

Dstring UnitsRecord::LabelText() const {
  if (curExp == kExpNotSet) return {};
  return Dstring::Format("%s%s", PrefixOf(curExp), unitName.c_str());
}
