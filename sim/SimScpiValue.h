#pragma once

#include <string_view>

#include "SimParam.h"
#include "support/Dstring.h"

// A parameter value as a SCPI program writes it, turned into the text the command language
// takes: `MINimum`, `MAXimum` and `DEFault` (the current lower and upper limit, the configured
// value), and a number with a unit suffix and SI prefix (`1 ns`, `500 mV`, `1.5GHz`; case does
// not matter, so `M` is milli and `MA` mega, except in `MHZ`). Anything else passes unchanged.
class SimScpiValue {
 public:
  enum class Keyword { None, Min, Max, Def };

  static Keyword KeywordOf(std::string_view text);
  // The value of a keyword for `param`, whose configured value is `initial`.
  static Dstring Of(Keyword keyword, const SimParam& param, const SimParam& initial);
  // The argument of a write to `param` in the language's terms: 0, or -131 "Invalid suffix"
  // for a unit that is not the parameter's, -138 "Suffix not allowed" when it has none.
  static int Resolve(std::string_view text, const SimParam& param, const SimParam& initial, Dstring& out);
};
