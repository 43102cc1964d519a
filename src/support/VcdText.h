#pragma once

#include <cstddef>
#include <ostream>

#include "support/Dstring.h"

// The pieces every Value Change Dump written here shares: the signal identifiers, the module
// name, the one-bit wires and the time steps, so that a capture and a segment are written alike.
class VcdText {
 public:
  // The identifier of signal `index`: printable characters from "!".
  static Dstring Identifier(std::size_t index);
  // A module name of `scope` without blanks, colons or slashes; `fallback` when nothing is left.
  static Dstring ScopeName(const Dstring& scope, const char* fallback);
  // Declares a one-bit wire.
  static void Wire(std::ostream& out, const Dstring& id, const Dstring& name);
  // Appends the change of one signal to `value` ('0', '1', 'x' or 'z').
  static void AddChange(Dstring& changes, char value, const Dstring& id);
  // Writes the changes at `time`; those of the first step are the dump's initial values.
  static void Step(std::ostream& out, unsigned long long time, const Dstring& changes, bool first);
};
