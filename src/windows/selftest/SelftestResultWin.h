#pragma once

#include <QWidget>
#include <memory>

#include "core/SelfTest.h"
#include "support/ConditionList.h"

class QLabel;
class QTableWidget;
class TaskFollower;

namespace Ui {
class SelfTestResult;
}

// The self test window ("selftest.Result"): starts the instrument's self test, shows its
// progress module by module with a cancel button, and then the outcome of every module, a
// failed one in red with what it reported. The instrument refuses the test while it runs, so
// the start button is off then.
class SelftestResultWin : public QWidget {
  Q_OBJECT

 public:
  explicit SelftestResultWin(QWidget* parent = nullptr);
  ~SelftestResultWin() override;

  int Load(ConditionList& list);
  int StartTest(ConditionList& list);
  TaskFollower* Follower() const { return mFollower; }
  QTableWidget* Table() const { return mTable; }
  QString StateText() const;

 private:
  class RunView;

  void ShowResults(const InstrumentTask::Progress& progress);

  QTableWidget* mTable = nullptr;
  QLabel* mState = nullptr;
  TaskFollower* mFollower = nullptr;
  std::unique_ptr<RunView> mRunView;
  std::unique_ptr<Ui::SelfTestResult> mUi;
};
