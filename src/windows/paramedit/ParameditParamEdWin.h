#pragma once

#include <QWidget>
#include <memory>
#include <map>
#include <set>

#include "support/ConditionList.h"
#include "support/Dstring.h"
#include "windows/common/LockAware.h"

class QLabel;
class QStackedWidget;
class QTreeWidget;
class QTreeWidgetItem;

namespace Ui {
class ParamEd;
}

// The parameter editor ("paramedit.ParamEd"): the instrument as a tree of clock groups,
// modules and ports, and beside it the panel of the selected item. There is one panel per kind
// of item, from its own resource; selecting an item moves the panel's bound controls to the
// item's parameters (their base name), reading every value first in joined queries, and hides
// the rows of parameters that the item does not have. While another client holds the
// instrument the tree still moves, but the panel is read-only, and an item whose values were
// not read yet shows a line saying that they are read once the instrument is free. The panels
// stay loaded by name at run time: the tree item names its panel's resource, and the panel is
// built on first use into the stack, so the tree and the panels meet only through that name.
class ParameditParamEdWin : public QWidget, public LockAware {
  Q_OBJECT

 public:
  explicit ParameditParamEdWin(QWidget* parent = nullptr);
  ~ParameditParamEdWin() override;

  int Load(ConditionList& list);
  // Builds the tree anew from the port information.
  int Rebuild(ConditionList& list);
  // Selects the item of a path (":CGR1", ":CGR1:MOD2", ":CGR1:MOD2:CONN1"); false when the
  // tree has no such item.
  bool SelectPath(const Dstring& path);
  QWidget* CurrentPanel() const;
  QTreeWidget* Tree() const { return mTree; }
  // What the panel area shows: the bound panel, or the line of an item not read yet.
  QWidget* ShownPage() const;
  void ShowLock(bool locked) override;

  static void FormatMemory(unsigned long bits, Dstring& number, Dstring& unit);

 private:
  void NfySelectionChanged();
  int ShowItem(const Dstring& path, const Dstring& panelResource, ConditionList& list);
  QWidget* Panel(const Dstring& resource, ConditionList& list);
  int ReadHeaders(const Dstring& path, std::set<Dstring>& headers, ConditionList& list);
  void ShowRows(QWidget* panel, const Dstring& base, const std::set<Dstring>& headers);
  void ShowMemory(QWidget* panel, const Dstring& base, const std::set<Dstring>& headers);

  QTreeWidget* mTree = nullptr;
  QStackedWidget* mStack = nullptr;
  QLabel* mTitle = nullptr;
  QLabel* mUnread = nullptr;
  bool mLocked = false;
  std::map<Dstring, QWidget*> mPanels;
  QWidget* mBound = nullptr;
  std::unique_ptr<Ui::ParamEd> mUi;
};
