#pragma once

#include <cstdint>

#include "support/ConditionList.h"
#include "support/Dstring.h"

// The display attribute of a numeric parameter as the server keeps it (the ":ATTR" source):
// the base unit, the decimal exponents the user may choose, the one in use, and the step in
// displayed units. UnitsData and LbUnitsData are the two names under which the fields and
// their list-box twins hold it; the logic lives here once.
class UnitsRecord {
 public:
  static constexpr std::int32_t kExpNotSet = 9999;
  // The instrument's "no value": a step reply that cannot be read counts as this.
  static constexpr double kNoValue = 9.91e37;

  Dstring unitName;
  std::int32_t minExp = 0;
  std::int32_t maxExp = 0;
  std::int32_t curExp = kExpNotSet;
  double step = 1.0;

  // True when anything that would be sent differs; a NaN step is never equal.
  bool operator!=(const UnitsRecord& other) const;
  bool operator==(const UnitsRecord& other) const { return !(*this != other); }

  // The attribute text written to the server: ("V",-3,0,-3,0.100000d).
  Dstring Format() const;
  // Reads an attribute reply. Every item that cannot be read adds "GUI_ATTR_QUERY_BAD_FORMAT"
  // with the reply and the result is nonzero; the readable items are taken all the same. A
  // step of 9.91e37 becomes 1, and an unset exponent the one nearest to the plain unit.
  int Parse(const Dstring& reply, ConditionList& list);

  // " " for exponent 0, so that a label keeps its width without a prefix.
  static const char* PrefixOf(std::int32_t exp);
  // The unit label: prefix and unit, or the empty text while the exponent is unset.
  Dstring LabelText() const;
};
