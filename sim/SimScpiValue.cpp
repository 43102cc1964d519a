#include "SimScpiValue.h"

#include <cctype>
#include <cstdlib>

namespace {

struct Multiplier {
  const char* prefix;
  int exponent;
};
constexpr Multiplier kMultipliers[] = {{"EX", 18}, {"PE", 15}, {"T", 12}, {"G", 9},    {"MA", 6},   {"K", 3}, {"M", -3},
                                       {"U", -6},  {"N", -9},  {"P", -12}, {"F", -15}, {"A", -18}, {"", 0}};

struct KeywordForm {
  const char* shortForm;
  const char* longForm;
  SimScpiValue::Keyword keyword;
};
constexpr KeywordForm kKeywords[] = {{"MIN", "MINIMUM", SimScpiValue::Keyword::Min},
                                     {"MAX", "MAXIMUM", SimScpiValue::Keyword::Max},
                                     {"DEF", "DEFAULT", SimScpiValue::Keyword::Def}};

// The power of ten of `suffix` (upper case) on `unit` (upper case); false when it is not one.
bool ExponentOf(const Dstring& suffix, const Dstring& unit, int& exponent) {
  if (unit == "HZ" && suffix == "MHZ") {
    exponent = 6;
    return true;
  }
  for (const Multiplier& m : kMultipliers) {
    if (suffix == Dstring(m.prefix) + unit) {
      exponent = m.exponent;
      return true;
    }
  }
  return false;
}

// The number as written, scaled by 10^exponent in its text, so that it is read with one rounding.
Dstring Scaled(std::string_view number, int exponent) {
  const std::size_t e = number.find_first_of("eE");
  const long written = e == std::string_view::npos ? 0 : std::strtol(Dstring(number.substr(e + 1)).c_str(), nullptr, 10);
  return Dstring(number.substr(0, e)) + Dstring::Format("E%ld", written + exponent);
}

Dstring Exact(double v) {
  return Dstring::Format("%.17G", v);
}

}  // namespace

SimScpiValue::Keyword SimScpiValue::KeywordOf(std::string_view text) {
  const Dstring word = Dstring(text).ToUpper();
  for (const KeywordForm& k : kKeywords) {
    if (word == k.shortForm || word == k.longForm) return k.keyword;
  }
  return Keyword::None;
}

Dstring SimScpiValue::Of(Keyword keyword, const SimParam& param, const SimParam& initial) {
  switch (keyword) {
    case Keyword::Min:
      return param.FormatNumber(param.GetLlim());
    case Keyword::Max:
      return param.FormatNumber(param.GetHlim());
    default:
      return initial.FormatValue();
  }
}

int SimScpiValue::Resolve(std::string_view text, const SimParam& param, const SimParam& initial, Dstring& out) {
  out = Dstring(text);
  const Keyword keyword = KeywordOf(text);
  if (keyword == Keyword::Def) {
    out = initial.IsNumeric() ? Exact(initial.GetNumber()) : initial.FormatValue();
    return 0;
  }
  if (keyword != Keyword::None && param.IsNumeric()) {
    out = Exact(keyword == Keyword::Min ? param.GetLlim() : param.GetHlim());
    return 0;
  }
  // A decimal number and then letters: the letters are a suffix.
  const Dstring whole(text);
  char* end = nullptr;
  std::strtod(whole.c_str(), &end);
  const std::size_t length = static_cast<std::size_t>(end - whole.c_str());
  if (length == 0 || whole.find_first_not_of("+-.0123456789eE") < length) return 0;
  const Dstring suffix = Dstring(whole.substr(length)).Trimmed().ToUpper();
  if (suffix.empty() || !std::isalpha(static_cast<unsigned char>(suffix[0]))) return 0;
  const Dstring unit = param.GetAttr().GetUnit().ToUpper();
  if (!param.IsNumeric() || unit.empty()) return -138;
  int exponent = 0;
  if (!ExponentOf(suffix, unit, exponent)) return -131;
  out = Scaled(whole.substr(0, length), exponent);
  return 0;
}
