#pragma once

#include <concepts>

#include "support/Dstring.h"

// The forms in which the program writes numbers for people, one each, so that a count or a
// ratio reads the same in every window, line and message.
class NumberText {
 public:
  // A whole number, its digits in groups of three from the right with a thin space between
  // ("1 234 567"), a minus sign before a negative one ("−12 345"). UTF-8.
  template <std::integral T>
  static Dstring Grouped(T value) {
    if constexpr (std::signed_integral<T>) {
      if (value < 0) return Digits(0ull - static_cast<unsigned long long>(value), true);
    }
    return Digits(static_cast<unsigned long long>(value), false);
  }
  // A bit error ratio: errors over bits with three figures and an exponent ("1.00E-04"),
  // "0" when no bit was in error and "–" when no bit was compared. UTF-8.
  static Dstring Ratio(unsigned long long errors, unsigned long long bits);

 private:
  static Dstring Digits(unsigned long long magnitude, bool negative);
};
