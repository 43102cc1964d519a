#pragma once

#include "params/UnitsRecord.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

class DsBinding;

// What a parameter field (QenParEd, QenParLb) knows besides its widget: the value last read
// in base units, the no-value flag, the unit attribute, and the last text sent, which keeps a
// commit of an unchanged value off the wire.
class ParFieldState {
 public:
  // Reads the value through the binding; a reply of 9.91e37 or "CLAS" sets the no-value flag.
  // A reply that is no number adds "GUI_PARED_BAD_VALUE", keeps the value, and the binding
  // shows why until a value reads again.
  int ReadValue(DsBinding& binding, ConditionList& list);
  // Reads the unit attribute. A malformed reply leaves the record as it was, and the binding
  // shows why until the attribute reads again.
  int ReadUnits(DsBinding& binding, ConditionList& list);

  // The text the field shows: empty while there is no value.
  Dstring DisplayText() const;
  // Parses the text the user proposes, adds `steps` steps and writes the value when its text
  // differs from the last one sent. An empty text, design mode or a missing source send
  // nothing and give 0; a number too large for a double adds "GUI_PARED_BAD_NUMBER". Text
  // without a number reads as 0, and anything after the number is ignored.
  int AdjustAndSend(const Dstring& text, int steps, DsBinding& binding, ConditionList& list);
  // What the last AdjustAndSend made of text it could not take whole: "2 MHz sent; "G"
  // ignored: this field is in MHz". Empty when the text was a number, alone or followed by the
  // field's own unit, and when nothing was read.
  const Dstring& GetNotice() const { return mNotice; }

  // After a read that followed a write: whether the server holds another value than the one
  // asked (clamped or rounded). Cleared by the call.
  bool TakeAdjusted(double& asked, double& held);

  double GetValue() const { return mValue; }
  bool IsNoValue() const { return mNoValue; }
  const Dstring& GetLastSent() const { return mLastSent; }
  const UnitsRecord& GetUnits() const { return mUnits; }
  // The exponent the value is shown in: 0 until the attribute is known.
  int DisplayExp() const { return mUnits.curExp == UnitsRecord::kExpNotSet ? 0 : mUnits.curExp; }

 private:
  Dstring MakeNotice(const Dstring& text, double value, bool sent) const;
  void ShowReadFailure(DsBinding& binding) const;

  UnitsRecord mUnits;
  double mValue = 0.0;
  bool mNoValue = true;
  Dstring mLastSent;
  bool mAskPending = false;
  bool mAdjusted = false;
  double mAsked = 0.0;
  Dstring mNotice;
  Dstring mValueFailure;
  Dstring mUnitsFailure;
};
