#pragma once

#include <QElapsedTimer>
#include <QTime>
#include <QWidget>
#include <memory>

#include "data/BerHistory.h"
#include "support/ConditionList.h"
#include "windows/common/LockAware.h"

class QLabel;
class QPushButton;
class BerTableModel;
class QTableView;
class QChart;
class QLogValueAxis;
class QValueAxis;

namespace Ui {
class BerWin;
}

// The bit error rate window ("ber.BerWin"): every analyser port with its compared bits, errors
// and ratio, a chart of each port's ratio over time on a logarithmic axis, reset of the counts
// and CSV export of the table and of the history. It is a view of the application's BerSvr,
// which the poll reads while the instrument runs, so the window asks the server nothing itself
// but the reset. The counts are the instrument's, since its run started or they were reset;
// the chart can only begin when the window saw them first, and its title says when that was
// and why (the window opened, a run started, the counts were reset).
class BerBerWin : public QWidget, public LockAware {
  Q_OBJECT

 public:
  explicit BerBerWin(QWidget* parent = nullptr);
  ~BerBerWin() override;

  int Load(ConditionList& list);
  int ExportTable(const Dstring& path, ConditionList& list) const;
  int ExportHistory(const Dstring& path, ConditionList& list) const;
  QTableView* Table() const { return mTable; }
  BerTableModel* Model() const { return mModel; }
  QChart* Chart() const { return mChart; }
  const BerHistory& History() const { return mHistory; }
  // Shows the service's counts and adds them to the history when they changed.
  void ShowResults();
  // What starts the chart afresh.
  enum class Origin { Opened, RunStarted, Reset };
  Origin GetOrigin() const { return mOrigin; }
  // Only the reset asks the instrument; the table, the chart and the exports stay.
  void ShowLock(bool locked) override;

 private:
  class View;

  // Starts the history afresh for `origin`.
  void Restart(Origin origin);
  void ShowChart();
  void HitPButReset();
  void HitPButExportTable();
  void HitPButExportHistory();
  using Export = int (BerBerWin::*)(const Dstring&, ConditionList&) const;
  // Asks for the file and writes it with `write`.
  void ExportTo(const QString& title, const QString& name, Export write);

  std::unique_ptr<Ui::BerWin> mUi;
  QTableView* mTable = nullptr;
  BerTableModel* mModel = nullptr;
  QLabel* mState = nullptr;
  QPushButton* mReset = nullptr;
  QChart* mChart = nullptr;
  QValueAxis* mTimeAxis = nullptr;
  QLogValueAxis* mRatioAxis = nullptr;
  BerHistory mHistory;
  Origin mOrigin = Origin::Opened;
  QTime mSince;  // the wall-clock time of the history's first sample
  bool mWasRunning = false;
  std::vector<BerSvr::PortResult> mShown;
  QElapsedTimer mClock;
  std::unique_ptr<View> mView;
};
