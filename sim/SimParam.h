#pragma once

#include <string_view>

#include "SimUnitAttr.h"
#include "support/Dstring.h"
#include "support/DstringList.h"

enum class SimParamType { Double, Integer, Enum, String, Bool };

// One instrument parameter: its header without handle (upper case, ":CGR1:PER"), type,
// value, absolute limits (LMAX/HMAX), current limits (LLIM/HLIM) and display attribute.
// Numbers live in mNumber (a bool as 0 or 1), words and strings in mText.
class SimParam {
 public:
  // The type named as the configuration writes it ("double", "enum", ...).
  static bool TypeFromName(std::string_view name, SimParamType& out);

  SimParam(Dstring header, SimParamType type);

  const Dstring& GetHeader() const { return mHeader; }
  SimParamType GetType() const { return mType; }
  bool IsNumeric() const { return mType == SimParamType::Double || mType == SimParamType::Integer; }

  // Reads a value text of this parameter's type without storing it: 0, -104 (not a number,
  // not a quoted string) or -224 (not one of the allowed words).
  int ParseValue(std::string_view text, double& number, Dstring& word) const;
  // The value as the instrument replies it: "%.12E", an integer, a word or a quoted string.
  Dstring FormatValue() const;
  Dstring FormatNumber(double v) const;
  // The value as a setting keeps it: as FormatValue, but a double with the fewest digits that
  // read back to the very same number ("1.511", "1e-09").
  Dstring FormatExact() const;

  double GetNumber() const { return mNumber; }
  const Dstring& GetText() const { return mText; }
  void SetValue(double number, const Dstring& text) {
    mNumber = number;
    mText = text;
  }
  void SetNumber(double number) { mNumber = number; }
  bool HasValue(double number, const Dstring& text) const { return mNumber == number && mText == text; }

  // Absolute limits; the current ones start equal and are narrowed by couplings.
  void SetRange(double lmax, double hmax);
  double GetLmax() const { return mLmax; }
  double GetHmax() const { return mHmax; }
  // The step the instrument sets a numeric value in (0: any value); a write is rounded to it.
  void SetResolution(double resolution) { mResolution = resolution; }
  double Resolve(double number) const;
  double GetLlim() const { return mLlim; }
  double GetHlim() const { return mHlim; }
  void SetLimits(double llim, double hlim) {
    mLlim = llim;
    mHlim = hlim;
  }
  bool IsWithinLimits(double v) const { return v >= mLlim && v <= mHlim; }

  void SetWords(DstringList words) { mWords = std::move(words); }
  const SimUnitAttr& GetAttr() const { return mAttr; }
  void SetAttr(const SimUnitAttr& attr) { mAttr = attr; }
  bool IsReadOnly() const { return mReadOnly; }
  void SetReadOnly(bool on) { mReadOnly = on; }
  // A change of this parameter makes the clock PLL lose its lock for a moment.
  bool IsRelock() const { return mRelock; }
  void SetRelock(bool on) { mRelock = on; }

 private:
  int ParseNumber(std::string_view text, double& number) const;
  int ParseWord(std::string_view text, Dstring& word) const;
  int ParseBool(std::string_view text, double& number) const;
  static int ParseString(std::string_view text, Dstring& word);

  Dstring mHeader;
  SimParamType mType;
  double mNumber = 0.0;
  Dstring mText;
  double mLmax;
  double mHmax;
  double mResolution = 0.0;
  double mLlim;
  double mHlim;
  DstringList mWords;
  SimUnitAttr mAttr;
  bool mReadOnly = false;
  bool mRelock = false;
};
