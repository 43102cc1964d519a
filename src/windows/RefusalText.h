#pragma once

#include "support/Condition.h"
#include "support/Dstring.h"

// What the instrument refused, in the user's words, put before the code and text in the error
// dialog (the call path's refusal describer):
// - a parameter by its place and the label of its row, the value asked and the limits the
//   instrument holds now: "Group 1 › Module 1 › Port 1 · Amplitude: 7 V asked; the instrument
//   takes 0.1 V to 5 V." The limits are asked ("<header>? LLIM", "HLIM") when the dialog is
//   made, in the unit the field shows;
// - the commands of the Instrument menu by their names, the self test with why it cannot start
//   while the instrument runs;
// - any other command as it was sent.
class RefusalText {
 public:
  static void Install();
  static void Uninstall();
  static Dstring Describe(const Condition& condition);
};
