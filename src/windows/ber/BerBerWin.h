#pragma once

#include <QElapsedTimer>
#include <QWidget>
#include <memory>

#include "data/BerHistory.h"
#include "support/ConditionList.h"

class QLabel;
class QTableWidget;
class QChart;
class QLogValueAxis;
class QValueAxis;

// The bit error rate window ("ber.BerWin"): every analyser port with its compared bits, errors
// and ratio, a chart of each port's ratio over time on a logarithmic axis, reset of the counts
// and CSV export of the table and of the history. It is a view of the application's BerSvr,
// which the poll reads while the instrument runs, so the window asks the server nothing itself
// but the reset.
class BerBerWin : public QWidget {
  Q_OBJECT

 public:
  explicit BerBerWin(QWidget* parent = nullptr);
  ~BerBerWin() override;

  int Load(ConditionList& list);
  int ExportTable(const Dstring& path, ConditionList& list) const;
  int ExportHistory(const Dstring& path, ConditionList& list) const;
  QTableWidget* Table() const { return mTable; }
  QChart* Chart() const { return mChart; }
  const BerHistory& History() const { return mHistory; }
  // Shows the service's counts and adds them to the history when they changed.
  void ShowResults();

 private:
  class View;

  void ShowChart();
  void HitPButReset();
  void HitPButExportTable();
  void HitPButExportHistory();
  using Export = int (BerBerWin::*)(const Dstring&, ConditionList&) const;
  // Asks for the file and writes it with `write`.
  void ExportTo(const QString& title, const QString& name, Export write);

  QTableWidget* mTable = nullptr;
  QLabel* mState = nullptr;
  QChart* mChart = nullptr;
  QValueAxis* mTimeAxis = nullptr;
  QLogValueAxis* mRatioAxis = nullptr;
  BerHistory mHistory;
  std::vector<BerSvr::PortResult> mShown;
  QElapsedTimer mClock;
  std::unique_ptr<View> mView;
};
