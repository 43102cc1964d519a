#pragma once

#include <vector>

#include "support/Dstring.h"

// One value-coded item of a bound combo box. The resource writes an item as a kind
// character, the value, "=" and the text shown: "#1e-9=1 ns" stands for the number 1e-9,
// "$SEQ=Sequence" for the text SEQ.
class CBoxItem {
 public:
  enum Kind { kString = 0, kNumber = 1 };

  // The item of a resource label. A label without "#" or "$" stands for its own text.
  static CBoxItem FromLabel(const Dstring& label);
  // The item a reply selects: the first text item equal to it, else the numeric item nearest
  // to its number (a later one only when strictly nearer); -1 when none fits.
  static int Choose(const std::vector<CBoxItem>& items, const Dstring& reply);

  Kind kind = kString;
  Dstring text;
  double number = 0.0;
  // The label shown, after "=".
  Dstring shown;
  // The value as the resource wrote it: what a choice of this item writes.
  Dstring ValueText() const { return text; }
};
