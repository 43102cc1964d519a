#include "windows/ber/BerBerWin.h"

#include <QChartView>
#include <QFileDialog>
#include <QHeaderView>
#include <QLabel>
#include <QLineSeries>
#include <QLogValueAxis>
#include <QPushButton>
#include <QTableView>
#include <QValueAxis>
#include <QVBoxLayout>
#include <algorithm>
#include <cmath>

#include "core/uiapp.h"
#include "data/QenDsView.h"
#include "data/RunStopDs.h"
#include "params/ui/BoundControl.h"
#include "support/ExportFile.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "ui_ber.BerWin.h"
#include "windows/common/BerAtStop.h"
#include "windows/common/PlaceName.h"
#include "windows/ber/BerTableModel.h"

namespace {

// A ratio of 0 has no place on a logarithmic axis: it is drawn at the axis floor.
constexpr double kFloor = 1e-15;

}  // namespace

class BerBerWin::View : public QenDsView {
 public:
  explicit View(BerBerWin& win) : mWin(win) {}
  int NfyViewDataUpdated(QenDs* changed, ConditionList& list) override {
    RunStopDs* run = uiapp::GetRunStopDs();
    // A start counts afresh on the instrument: the chart does too.
    if (changed == run && run->IsRunning() && !mWin.mWasRunning) mWin.Restart(Origin::RunStarted);
    if (changed == run) mWin.mWasRunning = run->IsRunning();
    mWin.ShowResults();
    ReadBerAtStop(changed, list);
    return 0;
  }

 private:
  BerBerWin& mWin;
};

BerBerWin::BerBerWin(QWidget* parent)
    : QWidget(parent), mUi(std::make_unique<Ui::BerWin>()), mView(std::make_unique<View>(*this)) {
  setObjectName(QStringLiteral("BerBerWin"));
  mClock.start();
}

BerBerWin::~BerBerWin() {
  ConditionList list;
  if (uiapp::GetBerSvr() != nullptr) uiapp::GetBerSvr()->UnregisterView(mView.get(), list);
  if (uiapp::GetRunStopDs() != nullptr) uiapp::GetRunStopDs()->UnregisterView(mView.get(), list);
}

int BerBerWin::Load(ConditionList& list) {
  mUi->setupUi(this);
  ResourceLibrary::InitWidgets(this);
  mTable = mUi->TableBer;
  mState = mUi->LabelState;
  mModel = new BerTableModel(this);
  mTable->setModel(mModel);
  mTable->verticalHeader()->setVisible(false);
  mTable->horizontalHeader()->setSectionResizeMode(0, QHeaderView::Stretch);
  for (int c = 1; c < 4; ++c) mTable->horizontalHeader()->setSectionResizeMode(c, QHeaderView::ResizeToContents);

  mChart = new QChart();
  mChart->legend()->setAlignment(Qt::AlignRight);
  mTimeAxis = new QValueAxis(mChart);
  mTimeAxis->setLabelFormat(QStringLiteral("%.0f"));
  mTimeAxis->setRange(0, 60);
  mRatioAxis = new QLogValueAxis(mChart);
  mRatioAxis->setTitleText(QStringLiteral("BER"));
  mRatioAxis->setLabelFormat(QStringLiteral("%.0e"));
  mRatioAxis->setBase(10);
  mRatioAxis->setRange(1e-12, 1e-3);
  mChart->addAxis(mTimeAxis, Qt::AlignBottom);
  mChart->addAxis(mRatioAxis, Qt::AlignLeft);
  auto* view = new QChartView(mChart, mUi->ChartArea);
  view->setObjectName(QStringLiteral("ChartBer"));
  view->setRenderHint(QPainter::Antialiasing);
  mUi->ChartLayout->addWidget(view);

  mReset = mUi->PButReset;
  connect(mReset, &QPushButton::clicked, this, &BerBerWin::HitPButReset);
  connect(mUi->PButExportTable, &QPushButton::clicked, this, &BerBerWin::HitPButExportTable);
  connect(mUi->PButExportHistory, &QPushButton::clicked, this, &BerBerWin::HitPButExportHistory);
  if (BerSvr* svr = uiapp::GetBerSvr()) {
    // The service is set up by the first window that shows it; a failure shows as an empty table.
    if (!svr->IsInitialized()) svr->Init(list);
    svr->RegisterView(mView.get(), list);
  }
  if (uiapp::GetRunStopDs() != nullptr) {
    uiapp::GetRunStopDs()->RegisterView(mView.get(), list);
    mWasRunning = uiapp::GetRunStopDs()->IsRunning();
  }
  ShowResults();
  return 0;
}

void BerBerWin::ShowLock(bool locked) {
  if (mReset != nullptr) mReset->setEnabled(!locked);
}

void BerBerWin::Restart(Origin origin) {
  mHistory.Clear();
  mOrigin = origin;
  // The same counts are a first sample of the new history.
  mShown.clear();
}

void BerBerWin::ShowResults() {
  const BerSvr* svr = uiapp::GetBerSvr();
  const std::vector<BerSvr::PortResult> results = svr != nullptr ? svr->GetResults() : std::vector<BerSvr::PortResult>{};
  const bool running = uiapp::GetRunStopDs() != nullptr && uiapp::GetRunStopDs()->IsRunning();
  if (results.empty()) {
    mState->setText(QStringLiteral("This configuration has no analyser ports."));
  } else {
    mState->setText(running ? QStringLiteral("Running: the instrument's counts since the run started or was reset.")
                            : QStringLiteral("Stopped: the counts of the last run; they change only while the instrument runs."));
  }
  mModel->SetResults(results);
  if (results == mShown) return;
  mShown = results;
  if (!results.empty()) {
    if (mHistory.Samples().empty()) mSince = QTime::currentTime();
    mHistory.Add(static_cast<double>(mClock.elapsed()) / 1000.0, results);
  }
  ShowChart();
}

void BerBerWin::ShowChart() {
  static const char* const kWhy[] = {"when this window opened", "when the run started", "when the counts were reset"};
  const QString since = mSince.isValid() ? mSince.toString(QStringLiteral("HH:mm:ss")) : QStringLiteral("--:--:--");
  mChart->setTitle(QStringLiteral("Bit error rate since %1, %2").arg(since, QLatin1String(kWhy[static_cast<int>(mOrigin)])));
  mTimeAxis->setTitleText(QStringLiteral("Seconds since %1").arg(since));
  const auto& samples = mHistory.Samples();
  const auto& ports = mHistory.Ports();
  while (mChart->series().size() > static_cast<int>(ports.size())) {
    QAbstractSeries* last = mChart->series().back();
    mChart->removeSeries(last);
    delete last;
  }
  while (mChart->series().size() < static_cast<int>(ports.size())) {
    auto* series = new QLineSeries(mChart);
    mChart->addSeries(series);
    series->attachAxis(mTimeAxis);
    series->attachAxis(mRatioAxis);
  }
  double lowest = 1e-3;
  double highest = 1e-12;
  for (std::size_t p = 0; p < ports.size(); ++p) {
    auto* series = static_cast<QLineSeries*>(mChart->series()[static_cast<int>(p)]);
    series->setName(PlaceName(ports[p]));
    QList<QPointF> points;
    points.reserve(static_cast<int>(samples.size()));
    for (const BerHistory::Sample& s : samples) {
      const double ratio = std::max(s.ratios[p], kFloor);
      points.append(QPointF(s.seconds, ratio));
      if (s.ratios[p] > 0) {
        lowest = std::min(lowest, ratio);
        highest = std::max(highest, ratio);
      }
    }
    series->replace(points);
    // A line needs two samples: the first one alone is drawn as a point.
    series->setPointsVisible(points.size() == 1);
  }
  const double last = samples.empty() ? 0.0 : samples.back().seconds;
  mTimeAxis->setRange(std::max(0.0, last - 600.0), std::max(60.0, last));
  if (highest >= lowest) {
    mRatioAxis->setRange(std::pow(10.0, std::floor(std::log10(lowest)) - 1), std::pow(10.0, std::ceil(std::log10(highest)) + 1));
  }
}

int BerBerWin::ExportTable(const Dstring& path, ConditionList& list) const {
  return ExportFile::WriteText(path, BerHistory::TableCsv(mShown), list);
}

int BerBerWin::ExportHistory(const Dstring& path, ConditionList& list) const {
  return ExportFile::WriteText(path, mHistory.HistoryCsv(), list);
}

void BerBerWin::HitPButReset() {
  ConditionList list;
  if (uiapp::GetBerSvr() != nullptr && uiapp::GetBerSvr()->Reset(list) == 0) Restart(Origin::Reset);
  ShowResults();
  BoundControl::Report(list);
}

void BerBerWin::HitPButExportTable() {
  ExportTo(QStringLiteral("Export Table"), QStringLiteral("ber.csv"), &BerBerWin::ExportTable);
}

void BerBerWin::HitPButExportHistory() {
  ExportTo(QStringLiteral("Export History"), QStringLiteral("ber-history.csv"), &BerBerWin::ExportHistory);
}

void BerBerWin::ExportTo(const QString& title, const QString& name, Export write) {
  const QString path = QFileDialog::getSaveFileName(this, title, name, QStringLiteral("CSV (*.csv);;All files (*)"));
  if (path.isEmpty()) return;
  ConditionList list;
  (this->*write)(path.toStdString(), list);
  BoundControl::Report(list);
}
