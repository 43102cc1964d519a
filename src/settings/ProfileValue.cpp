#include "settings/ProfileValue.h"

#include <cmath>
#include <cstdlib>

#include "settings/SettingsStatus.h"
#include "support/ConditionListLoader.h"
#include "support/ParserExpression.h"

namespace {

using Outcome = ProfileValue::Outcome;

Dstring Wrapped(const Dstring& body, bool parens) { return parens ? Dstring("(" + body + ")") : body; }

Outcome ParseList(std::string_view text, LispList& out) {
  ConditionList ignored;
  return ParserExpression::Parse(text, out, ignored) == 0 ? Outcome::kRead : Outcome::kUnparsable;
}

// The one item of a value text, when it is of the type asked for.
Outcome ReadItem(std::string_view text, DataItemType type, DataItem& item) {
  LispList parsed;
  if (ParseList(text, parsed) != Outcome::kRead) return Outcome::kUnparsable;
  if (parsed.Size() != 1 || !parsed[0].IsItem() || parsed[0].GetItem().GetType() != type) return Outcome::kWrongType;
  item = parsed[0].GetItem();
  return Outcome::kRead;
}

template <typename T, typename Get>
Outcome ReadNumber(std::string_view text, DataItemType type, T& v, Get get) {
  DataItem item;
  Outcome outcome = ReadItem(text, type, item);
  if (outcome != Outcome::kRead) return outcome;
  T read{};
  if (!(item.*get)(read)) return Outcome::kWrongType;
  v = read;
  return Outcome::kRead;
}

}  // namespace

Dstring ProfileValue::Format(long v, bool parens) { return Wrapped(Dstring::Format("%ldi", v), parens); }

Dstring ProfileValue::Format(unsigned long v, bool parens) { return Wrapped(Dstring::Format("%luu", v), parens); }

Dstring ProfileValue::Format(float v, bool parens) {
  const Dstring fixed = Dstring::Format("%f", static_cast<double>(v));
  if (std::strtof(fixed.c_str(), nullptr) == v) return Wrapped(fixed + "f", parens);
  return Wrapped(DataItem::MakeFloat(v).AsExpression(), parens);
}

Dstring ProfileValue::Format(double v, bool parens) {
  const Dstring fixed = Dstring::Format("%f", v);
  if (std::strtod(fixed.c_str(), nullptr) == v) return Wrapped(fixed + "d", parens);
  return Wrapped(DataItem::MakeDouble(v).AsExpression(), parens);
}

Dstring ProfileValue::Format(const DataParcel& v) { return "(" + v.AsExpression() + ")"; }

Dstring ProfileValue::Format(const LispList& v) { return v.IsList() ? v.AsExpression() : Dstring("(" + v.AsExpression() + ")"); }

Outcome ProfileValue::Read(std::string_view text, long& v) {
  return ReadNumber(text, DataItemType::Signed, v, &DataItem::GetLong);
}

Outcome ProfileValue::Read(std::string_view text, unsigned long& v) {
  return ReadNumber(text, DataItemType::Unsigned, v, &DataItem::GetULong);
}

Outcome ProfileValue::Read(std::string_view text, float& v) {
  return ReadNumber(text, DataItemType::Float, v, &DataItem::GetFloat);
}

Outcome ProfileValue::Read(std::string_view text, double& v) {
  return ReadNumber(text, DataItemType::Double, v, &DataItem::GetDouble);
}

Outcome ProfileValue::Read(std::string_view text, DataParcel& v) {
  LispList parsed;
  if (ParseList(text, parsed) != Outcome::kRead) return Outcome::kUnparsable;
  DataParcel items;
  for (const LispList& child : parsed) {
    if (child.IsList()) return Outcome::kWrongType;
    items.push_back(child.GetItem());
  }
  v = std::move(items);
  return Outcome::kRead;
}

Outcome ProfileValue::Read(std::string_view text, LispList& v) {
  LispList parsed;
  if (ParseList(text, parsed) != Outcome::kRead) return Outcome::kUnparsable;
  v = std::move(parsed);
  return Outcome::kRead;
}

Outcome ProfileValue::ReadText(std::string_view text, Dstring& v) {
  LispList parsed;
  if (ParseList(text, parsed) != Outcome::kRead) return Outcome::kUnparsable;
  if (parsed.Size() != 1 || !parsed[0].IsItem() || !parsed[0].GetItem().IsText()) return Outcome::kWrongType;
  v = Dstring(parsed[0].GetItem().GetText());
  return Outcome::kRead;
}

int ProfileValue::CheckFinite(double v, const Dstring& name, ConditionList& list) {
  if (std::isfinite(v)) return SettingsStatus::kOk;
  ConditionListLoader::ConditionToken(list, "GUI_PROFILE_VALUE_NOT_FINITE", {name}, SettingsStatus::kNotFinite);
  return SettingsStatus::kNotFinite;
}
