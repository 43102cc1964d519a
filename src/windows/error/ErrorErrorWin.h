#pragma once

#include <QWidget>

#include "support/ConditionList.h"
#include "windows/common/LockAware.h"

class QLabel;
class QTreeWidget;

// The error list ("error.ErrorWin"): every condition of this session, newest first, with its
// time, code, text and the command that caused it; copy (the selected rows, or all) and clear.
// While it is open, a new condition raises it.
class ErrorErrorWin : public QWidget, public LockAware {
  Q_OBJECT

 public:
  explicit ErrorErrorWin(QWidget* parent = nullptr);
  ~ErrorErrorWin() override;

  int Load(ConditionList& list);
  // The rows as tab-separated text: the selected ones, or all when none is selected.
  QString RowsAsText() const;
  QTreeWidget* Tree() const { return mTree; }
  // Nothing here asks the instrument: it all stays on while another client holds it.
  void ShowLock(bool) override {}

 private:
  void ShowEntries();
  void HitPButCopy();
  void HitPButClear();

  QTreeWidget* mTree = nullptr;
  QLabel* mCount = nullptr;
  std::size_t mShown = 0;
};
