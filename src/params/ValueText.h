#pragma once

#include <cstddef>
#include <cstdint>

#include "support/Dstring.h"

// The conversions between a parameter's value in base units and the text of its field.
class ValueText {
 public:
  // The instrument's not-a-number value.
  static constexpr double kNoValue = 9.91e37;

  // The value scaled by 10^curExp: "%.12G" while its decimal exponent is within ±3, else the
  // mantissa without trailing zeros and "e" with the exponent (1234567 → "1.234567e6").
  static Dstring FormatDisplay(double value, std::int32_t curExp);
  // The text a value travels in: "%.12E" with a three-digit exponent.
  static Dstring FormatSent(double value);
  // The longest leading decimal floating number of `text` (blanks first are skipped); 0 when
  // there is none, NaN when it overflows a double. A typed unit after the number is ignored.
  static double ReadLeadingNumber(const Dstring& text);
  // Where that number ends in `text` (the blanks before it counted); 0 when there is none.
  static std::size_t LeadingNumberLength(const Dstring& text);
  // Whether a reply reads as the no-value mark ("CLAS", or the number 9.91e37).
  static bool IsNoValue(const Dstring& reply);
  // The number of a reply, or NaN when it has none.
  static double ReadReplyNumber(const Dstring& reply);
};
