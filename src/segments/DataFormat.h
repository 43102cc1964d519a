#pragma once

#include <cstring>
#include <string_view>

// How traces are grouped into the digits an editor shows: hexadecimal groups four traces,
// binary one, octal three. Digit d covers traces k*d .. k*d+k-1 (k traces per digit), the
// highest trace of the digit being its most significant bit.
enum class DataFormat : int { kHex = 0, kBin = 1, kOct = 2 };

// What a format means for digits and for the command language.
struct DataFormatInfo {
  int tracesPerDigit;  // 0 for a value outside the enumeration
  const char* digits;  // the digit characters, value order
  const char* word;    // the name in conditions ("HEX")
  const char* suffix;  // the radix suffix of a number on the wire
  const char* name;    // the name people read ("hexadecimal")
  const char* digitsText;  // its digits as people read them ("0–9 and A–F"), UTF-8
};

inline const DataFormatInfo& InfoOf(DataFormat format) {
  static constexpr DataFormatInfo kInfos[] = {
      {4, "0123456789abcdef", "HEX", "H", "hexadecimal", "0\u20139 and A\u2013F"},
      {1, "01", "BIN", "", "binary", "0 and 1"},
      {3, "01234567", "OCT", "O", "octal", "0\u20137"},
  };
  static constexpr DataFormatInfo kNone = {0, "", "", "", "", ""};
  const int i = static_cast<int>(format);
  return i >= 0 && i < 3 ? kInfos[i] : kNone;
}

// Whether `text` is a find pattern in the format: its digits in either case, and 'x' for a
// digit that matches anything.
inline bool IsPatternOf(std::string_view text, DataFormat format) {
  const char* digits = InfoOf(format).digits;
  if (text.empty() || *digits == '\0') return false;
  for (char c : text) {
    const char lower = c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
    if (lower != 'x' && (lower == '\0' || std::strchr(digits, lower) == nullptr)) return false;
  }
  return true;
}
