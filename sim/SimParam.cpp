#include "SimParam.h"

#include <charconv>
#include <cmath>
#include <cstdio>

#include "support/ConditionList.h"
#include "support/DataParcel.h"
#include "support/ParserExpression.h"

namespace {

constexpr int kBadType = -104;
constexpr int kBadValue = -224;
// Beyond this a double no longer holds every integer.
constexpr double kMaxInteger = 9007199254740992.0;

struct TypeName {
  const char* name;
  SimParamType type;
};

constexpr TypeName kTypeNames[] = {
    {"double", SimParamType::Double}, {"integer", SimParamType::Integer}, {"enum", SimParamType::Enum},
    {"string", SimParamType::String}, {"bool", SimParamType::Bool},
};

struct BoolWord {
  const char* word;
  double value;
};

constexpr BoolWord kBoolWords[] = {{"ON", 1.0}, {"OFF", 0.0}, {"1", 1.0}, {"0", 0.0}};

Dstring Quoted(const Dstring& text) {
  Dstring out = "\"";
  for (char c : text) {
    out += c;
    if (c == '"') out += c;
  }
  return out + "\"";
}

}  // namespace

bool SimParam::TypeFromName(std::string_view name, SimParamType& out) {
  for (const TypeName& t : kTypeNames) {
    if (name == t.name) {
      out = t.type;
      return true;
    }
  }
  return false;
}

SimParam::SimParam(Dstring header, SimParamType type) : mHeader(std::move(header)), mType(type) {
  SetRange(-HUGE_VAL, HUGE_VAL);
}

void SimParam::SetRange(double lmax, double hmax) {
  mLmax = lmax;
  mHmax = hmax;
  mLlim = lmax;
  mHlim = hmax;
}

int SimParam::ParseValue(std::string_view text, double& number, Dstring& word) const {
  number = 0.0;
  word.clear();
  switch (mType) {
    case SimParamType::Double:
    case SimParamType::Integer:
      return ParseNumber(text, number);
    case SimParamType::Enum:
      return ParseWord(text, word);
    case SimParamType::String:
      return ParseString(text, word);
    case SimParamType::Bool:
      return ParseBool(text, number);
  }
  return kBadType;
}

int SimParam::ParseNumber(std::string_view text, double& number) const {
  if (!Dstring(text).ToDouble(number) || !std::isfinite(number)) return kBadType;
  if (mType == SimParamType::Integer && (number != std::trunc(number) || std::fabs(number) > kMaxInteger)) {
    return kBadType;
  }
  return 0;
}

int SimParam::ParseWord(std::string_view text, Dstring& word) const {
  Dstring upper = Dstring(text).Trimmed().ToUpper();
  for (const Dstring& w : mWords) {
    if (w.ToUpper() == upper) {
      word = w;
      return 0;
    }
  }
  return kBadValue;
}

int SimParam::ParseBool(std::string_view text, double& number) const {
  Dstring upper = Dstring(text).Trimmed().ToUpper();
  for (const BoolWord& b : kBoolWords) {
    if (upper == b.word) {
      number = b.value;
      return 0;
    }
  }
  return kBadValue;
}

int SimParam::ParseString(std::string_view text, Dstring& word) {
  DataParcel items;
  ConditionList ignored;
  if (ParserExpression::Parse(text, items, ignored) != 0 || items.size() != 1) return kBadType;
  if (items[0].GetType() != DataItemType::String) return kBadType;
  word = Dstring(items[0].GetText());
  return 0;
}

Dstring SimParam::FormatValue() const {
  switch (mType) {
    case SimParamType::Double:
    case SimParamType::Integer:
      return FormatNumber(mNumber);
    case SimParamType::Enum:
      return mText;
    case SimParamType::String:
      return Quoted(mText);
    case SimParamType::Bool:
      return mNumber != 0.0 ? "ON" : "OFF";
  }
  return {};
}

Dstring SimParam::FormatNumber(double v) const {
  // Not Dstring::Printf: the replies keep the C library's two-digit exponent.
  char buf[64];
  if (mType == SimParamType::Integer && std::fabs(v) <= kMaxInteger) {
    std::snprintf(buf, sizeof buf, "%lld", static_cast<long long>(v));
  } else {
    std::snprintf(buf, sizeof buf, "%.12E", v);
  }
  return buf;
}

Dstring SimParam::FormatExact() const {
  if (mType != SimParamType::Double) return FormatValue();
  char buf[64];
  const auto result = std::to_chars(buf, buf + sizeof buf, mNumber);
  return Dstring(std::string_view(buf, static_cast<std::size_t>(result.ptr - buf)));
}

double SimParam::Resolve(double number) const {
  if (mResolution <= 0.0) return number;
  const double steps = std::round(number / mResolution);
  // A decimal step (1E-3) has no exact double: steps times it lands beside the value written
  // (1511 * 1E-3 is 1.5110000000000001), steps divided by its whole inverse on it (1.511).
  const double inverse = std::round(1.0 / mResolution);
  return mResolution < 1.0 && std::fabs(inverse * mResolution - 1.0) < 1e-12 ? steps / inverse : steps * mResolution;
}
