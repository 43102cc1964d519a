#pragma once

#include <string_view>

#include "support/ConditionList.h"
#include "support/DataParcel.h"
#include "support/Dstring.h"
#include "support/LispList.h"

// The typed value texts of the three profiles. A number carries its type in a one-letter
// suffix ("12i", "7u", "1.500000f", "2.5e-09d"), inside parentheses for the server profiles
// ("(12i)"). Floats and doubles are written with six fixed decimals ("1.500000f") when that
// reads back to the very same value, and otherwise with the fewest digits that do: six fixed
// decimals would store a delay of 1.5E-9 s as 0. A list is written as
// its expression, always in parentheses, so a list of one number reads like that number.
class ProfileValue {
 public:
  enum class Outcome { kRead, kUnparsable, kWrongType };

  static Dstring Format(long v, bool parens);
  static Dstring Format(unsigned long v, bool parens);
  static Dstring Format(float v, bool parens);
  static Dstring Format(double v, bool parens);
  static Dstring Format(const DataParcel& v);
  static Dstring Format(const LispList& v);

  // The type must be the one written: "(12u)" is no signed long, "(1.5d)" no float.
  static Outcome Read(std::string_view text, long& v);
  static Outcome Read(std::string_view text, unsigned long& v);
  static Outcome Read(std::string_view text, float& v);
  static Outcome Read(std::string_view text, double& v);
  // A flat list; a nested one is of the wrong type.
  static Outcome Read(std::string_view text, DataParcel& v);
  static Outcome Read(std::string_view text, LispList& v);
  // One quoted string or bare word, without its quotes.
  static Outcome ReadText(std::string_view text, Dstring& v);

  // Infinities and NaN have no value text: 0, or nonzero with "GUI_PROFILE_VALUE_NOT_FINITE".
  static int CheckFinite(double v, const Dstring& name, ConditionList& list);
};
