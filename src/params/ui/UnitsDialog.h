#pragma once

#include <QDialog>

#include "params/UnitsRecord.h"
#include "support/ConditionList.h"

// The units dialog: one button per prefix the parameter allows and one per step, built from
// the resource "<library>.UnitsDialog". It edits the record handed to LoadProcess in place.
// UnitsdlgUnitsDialog and LbUnitsdlgUnitsDialog are its two names.
class UnitsDialog : public QDialog {
  Q_OBJECT

 public:
  UnitsDialog(const char* library, QWidget* parent = nullptr);

  // Runs the dialog modally; 0 when ended with OK (the record then holds the choice).
  unsigned LoadProcess(UnitsRecord* units, ConditionList& list);
  // Shows the record: prefix buttons within minExp..maxExp labelled and the current one
  // selected, the others hidden; the step button nearest below the step selected.
  void NfyInit(const UnitsRecord& units);
  // The choice shown, written into `units`.
  void TakeChoice(UnitsRecord& units) const;
  bool IsLoaded() const { return mLoaded; }

 private:
  void HitPButHelp();

  bool mLoaded = false;
  ConditionList mLoadErrors;
};
