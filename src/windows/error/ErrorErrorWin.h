#pragma once

#include <QWidget>
#include <memory>

#include "support/ConditionList.h"
#include "windows/common/LockAware.h"

class ErrorJournalModel;
class QLabel;
class QTableView;

namespace Ui {
class ErrorWin;
}

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
  QTableView* Table() const { return mTable; }
  ErrorJournalModel* Model() const { return mModel; }
  // Nothing here asks the instrument: it all stays on while another client holds it.
  void ShowLock(bool) override {}

 private:
  void ShowCount();
  void Raise();
  void HitPButCopy();
  void HitPButClear();

  std::unique_ptr<Ui::ErrorWin> mUi;
  QTableView* mTable = nullptr;
  QLabel* mCount = nullptr;
  ErrorJournalModel* mModel = nullptr;
};
