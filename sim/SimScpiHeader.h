#pragma once

#include <string_view>

#include "support/Dstring.h"

// The program headers of the SCPI socket in the form the command language knows. Each node
// may be written in its short form (`TRIG`) or its long form (`TRIGger`), in any case, with
// its numeric suffix (`CGRoup1`); optional nodes (`SYSTem:ERRor[:NEXT]?`) may be left out.
// A node that is neither form passes unchanged, so the language itself refuses it.
class SimScpiHeader {
 public:
  // The header in short forms and upper case, without a leading colon, the "?" kept.
  static Dstring Canonical(std::string_view header);
};
