#include "support/NumberText.h"

#include <charconv>
#include <string>

namespace {

constexpr const char* kThinSpace = "\xE2\x80\x89";
constexpr const char* kMinus = "\xE2\x88\x92";
constexpr const char* kEnDash = "\xE2\x80\x93";

}  // namespace

Dstring NumberText::Digits(unsigned long long magnitude, bool negative) {
  const std::string digits = std::to_string(magnitude);
  Dstring out = negative ? kMinus : "";
  for (std::size_t i = 0; i < digits.size(); ++i) {
    if (i > 0 && (digits.size() - i) % 3 == 0) out += kThinSpace;
    out += digits[i];
  }
  return out;
}

Dstring NumberText::Ratio(unsigned long long errors, unsigned long long bits) {
  if (bits == 0) return kEnDash;
  if (errors == 0) return "0";
  // Two exponent digits, as people write a ratio, not the three of a command; and whatever the
  // locale says, a point.
  char text[32];
  const auto end =
      std::to_chars(text, text + sizeof text, static_cast<double>(errors) / static_cast<double>(bits),
                    std::chars_format::scientific, 2)
          .ptr;
  Dstring out(text, end);
  for (char& c : out) c = c == 'e' ? 'E' : c;
  return out;
}
