#pragma once

#include <string_view>

#include "support/Dstring.h"

// The display attribute of a numeric parameter: unit, the span of decimal exponents a user
// may choose, the exponent in use (kNotSet when none) and the step in displayed units.
class SimUnitAttr {
 public:
  static constexpr int kNotSet = 9999;

  SimUnitAttr() = default;
  SimUnitAttr(Dstring unit, int minExp, int maxExp, int curExp, double step)
      : mUnit(std::move(unit)), mMinExp(minExp), mMaxExp(maxExp), mCurExp(curExp), mStep(step) {}

  // The reply form ("%s",%d,%d,%d,%fd).
  Dstring Format() const;
  // Reads the reply form. Returns 0, -104 when the text is not five items of the right
  // types, or -224 when the values make no sense (exponents not multiples of 3 in -12..9,
  // current exponent outside the span, a step that is not positive) or cannot be written back
  // in the reply form (a quote or control character in the unit, a step it writes as 0.000000).
  static int Parse(std::string_view text, SimUnitAttr& out);
  // -224 when the values make no sense, else 0.
  int Check() const;

  const Dstring& GetUnit() const { return mUnit; }
  // The same with another current exponent (the prefix a value is shown with).
  SimUnitAttr WithCurExp(int exp) const {
    SimUnitAttr out = *this;
    out.mCurExp = exp;
    return out;
  }
  bool operator==(const SimUnitAttr&) const = default;

 private:
  Dstring mUnit;
  int mMinExp = 0;
  int mMaxExp = 0;
  int mCurExp = kNotSet;
  double mStep = 1.0;
};
