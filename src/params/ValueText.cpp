#include "params/ValueText.h"

#include <cctype>
#include <cmath>
#include <cstdlib>
#include <limits>

namespace {

std::size_t SkipDigits(const Dstring& text, std::size_t i) {
  while (i < text.size() && std::isdigit(static_cast<unsigned char>(text[i]))) ++i;
  return i;
}

// The length of the leading decimal number from `start`, 0 when there is none. Hexadecimal
// forms, "inf" and "nan" are no decimal numbers and are not taken, unlike with strtod.
std::size_t LeadingNumberEnd(const Dstring& text, std::size_t start) {
  std::size_t i = start;
  if (i < text.size() && (text[i] == '+' || text[i] == '-')) ++i;
  const std::size_t intStart = i;
  i = SkipDigits(text, i);
  std::size_t digits = i - intStart;
  if (i < text.size() && text[i] == '.') {
    const std::size_t fracStart = i + 1;
    const std::size_t fracEnd = SkipDigits(text, fracStart);
    digits += fracEnd - fracStart;
    i = fracEnd;
  }
  if (digits == 0) return start;
  if (i < text.size() && (text[i] == 'e' || text[i] == 'E')) {
    std::size_t j = i + 1;
    if (j < text.size() && (text[j] == '+' || text[j] == '-')) ++j;
    const std::size_t expEnd = SkipDigits(text, j);
    if (expEnd > j) i = expEnd;
  }
  return i;
}

}  // namespace

Dstring ValueText::FormatDisplay(double value, std::int32_t curExp) {
  const double scaled = value / std::pow(10.0, curExp);
  const Dstring full = Dstring::Format("%.12E", scaled);
  const auto ePos = full.find('E');
  const auto e = static_cast<std::int16_t>(std::strtol(full.c_str() + ePos + 1, nullptr, 10));
  if (e >= -3 && e <= 3) return Dstring::Format("%.12G", scaled);
  Dstring mantissa = full.substr(0, ePos);
  while (!mantissa.empty() && mantissa.back() == '0') mantissa.pop_back();
  if (!mantissa.empty() && mantissa.back() == '.') mantissa.pop_back();
  if (mantissa.empty()) return Dstring::Format("0e%i", e);
  return Dstring::Format("%se%i", mantissa.c_str(), e);
}

Dstring ValueText::FormatSent(double value) { return Dstring::Format("%.12E", value); }

std::size_t ValueText::LeadingNumberLength(const Dstring& text) {
  std::size_t start = 0;
  while (start < text.size() && std::isspace(static_cast<unsigned char>(text[start]))) ++start;
  const std::size_t end = LeadingNumberEnd(text, start);
  return end == start ? 0 : end;
}

double ValueText::ReadLeadingNumber(const Dstring& text) {
  const std::size_t end = LeadingNumberLength(text);
  if (end == 0) return 0.0;
  const double value = std::strtod(text.substr(0, end).c_str(), nullptr);
  return std::isfinite(value) ? value : std::numeric_limits<double>::quiet_NaN();
}

double ValueText::ReadReplyNumber(const Dstring& reply) {
  const Dstring trimmed = reply.Trimmed();
  const std::size_t end = LeadingNumberEnd(trimmed, 0);
  if (end == 0 || end != trimmed.size()) return std::numeric_limits<double>::quiet_NaN();
  return std::strtod(trimmed.c_str(), nullptr);
}

bool ValueText::IsNoValue(const Dstring& reply) {
  return reply.Trimmed() == "CLAS" || ReadReplyNumber(reply) == kNoValue;
}
