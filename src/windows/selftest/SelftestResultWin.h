#pragma once

#include <QTimer>
#include <QWidget>

#include "core/SelfTest.h"
#include "support/ConditionList.h"

class QLabel;
class QProgressBar;
class QPushButton;
class QTableWidget;

// The self test window ("selftest.Result"): starts the instrument's self test, shows its
// progress module by module with a cancel button, and then the outcome of every module, a
// failed one in red with what it reported. The test runs on the instrument; the window asks
// how far it is five times a second, so the program stays responsive meanwhile.
class SelftestResultWin : public QWidget {
  Q_OBJECT

 public:
  static constexpr int kPollMs = 200;

  explicit SelftestResultWin(QWidget* parent = nullptr);

  int Load(ConditionList& list);
  int StartTest(ConditionList& list);
  int CancelTest(ConditionList& list);
  // Asks the progress once, and reads the results when the test has ended.
  int PollProgress(ConditionList& list);
  bool IsTesting() const { return mTimer.isActive(); }
  QTableWidget* Table() const { return mTable; }
  QString StateText() const;

 private:
  void ShowResults(const std::vector<SelfTest::ModuleResult>& results, const SelfTest::Progress& progress);
  void SetTesting(bool testing);
  void HitPButStart();
  void HitPButCancel();
  void NfyTimer();

  QTableWidget* mTable = nullptr;
  QProgressBar* mBar = nullptr;
  QLabel* mState = nullptr;
  QPushButton* mStart = nullptr;
  QPushButton* mCancel = nullptr;
  QTimer mTimer;
};
