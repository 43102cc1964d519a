#pragma once

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
};

inline const DataFormatInfo& InfoOf(DataFormat format) {
  static constexpr DataFormatInfo kInfos[] = {
      {4, "0123456789abcdef", "HEX", "H"},
      {1, "01", "BIN", ""},
      {3, "01234567", "OCT", "O"},
  };
  static constexpr DataFormatInfo kNone = {0, "", "", ""};
  const int i = static_cast<int>(format);
  return i >= 0 && i < 3 ? kInfos[i] : kNone;
}
