#pragma once

#include <QLabel>

#include "params/UnitsRecord.h"
#include "support/ConditionList.h"
#include "toolkit/WaitCursor.h"

class QenParField;
class QMenu;

// The unit label beside a parameter field: shows prefix and unit, opens the units dialog on
// a click (its item number, 300 by default) and a menu of prefixes and steps on the popup
// gesture. A change is sent to the server's attribute and comes back through its change
// notification; nothing is applied locally. UnitEd and LbUnitEd are its two names.
class UnitLabel : public QLabel {
  Q_OBJECT
  Q_PROPERTY(int ItemNumber MEMBER mItemNumber)

 public:
  void SetParEd(QenParField* field) { mField = field; }
  QenParField* GetParEd() const { return mField; }

  // Shows the bare unit until the first refresh.
  void NfyInit();
  // Reads the attribute into the field, sets the label and redisplays the value.
  int Refresh(ConditionList& list);
  // Writes the attribute; -19 is dropped without a word.
  int SendUnits(const UnitsRecord& units, ConditionList& list);
  // The label's item: 300 opens the units dialog.
  void NfyItemHit(int item);
  // Applies a menu choice (ids of UnitMenu) and sends the record when it changed.
  void NfyPopupMenuItemSelect(int id);
  // The menu as it shows now: prefix items visible and checked by the field's record.
  QMenu* BuildPopupMenu(QWidget* parent);
  // Opens that menu at `global`; nothing for a field without a data source.
  void ShowPopupMenu(const QPoint& global);
  bool IsHighlighted() const { return mHighlighted; }

 protected:
  UnitLabel();
  // Runs this label's own units dialog over `units`; 0 when ended with OK.
  virtual unsigned ProcessUnitsDialog(UnitsRecord& units, ConditionList& list) = 0;
  // The dialog class and record type of one of the two names, over a copy of `units`.
  template <class Dialog, class Record>
  unsigned RunUnitsDialog(UnitsRecord& units, ConditionList& list) {
    Record record;
    static_cast<UnitsRecord&>(record) = units;
    unsigned result = 1;
    {
      WaitCursor wait;
      Dialog dialog(window());
      result = dialog.LoadProcess(&record, list);
    }
    units = record;
    return result;
  }
  void mousePressEvent(QMouseEvent* event) override;
  void mouseMoveEvent(QMouseEvent* event) override;
  void mouseReleaseEvent(QMouseEvent* event) override;
  void contextMenuEvent(QContextMenuEvent* event) override;

 private:
  void SetHighlighted(bool on);
  const UnitsRecord& Units() const;

  QenParField* mField = nullptr;
  int mItemNumber = 300;
  bool mTracking = false;
  bool mHighlighted = false;
};
