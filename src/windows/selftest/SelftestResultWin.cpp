#include "windows/selftest/SelftestResultWin.h"

#include <QHeaderView>
#include <QLabel>
#include <QProgressBar>
#include <QPushButton>
#include <QTableWidget>
#include <algorithm>

#include "core/uiapp.h"
#include "data/QenDsView.h"
#include "data/RunStopDs.h"
#include "params/ui/BoundControl.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "windows/common/PlaceName.h"
#include "windows/common/TaskFollower.h"
#include "ui_selftest.Result.h"

// Told when the instrument starts or stops, for the start button.
class SelftestResultWin::RunView : public QenDsView {
 public:
  explicit RunView(TaskFollower& follower) : mFollower(follower) {}
  int NfyViewDataUpdated(QenDs*, ConditionList&) override {
    mFollower.ShowCanStart();
    return 0;
  }

 private:
  TaskFollower& mFollower;
};

SelftestResultWin::SelftestResultWin(QWidget* parent) : QWidget(parent), mUi(std::make_unique<Ui::SelfTestResult>()) {
  setObjectName(QStringLiteral("SelftestResultWin"));
}

SelftestResultWin::~SelftestResultWin() {
  ConditionList list;
  if (mRunView && uiapp::GetRunStopDs() != nullptr) uiapp::GetRunStopDs()->UnregisterView(mRunView.get(), list);
}

int SelftestResultWin::Load(ConditionList& list) {
  mUi->setupUi(this);
  ResourceLibrary::InitWidgets(this);
  mTable = mUi->TableResults;
  mState = mUi->LabelState;
  auto* bar = mUi->BarProgress;
  auto* start = mUi->PButStart;
  auto* cancel = mUi->PButCancel;
  mTable->verticalHeader()->setVisible(false);
  mTable->horizontalHeader()->setSectionResizeMode(3, QHeaderView::Stretch);
  for (int c = 0; c < 3; ++c) mTable->horizontalHeader()->setSectionResizeMode(c, QHeaderView::ResizeToContents);
  TaskFollower::Hooks hooks;
  hooks.running = [this](const InstrumentTask::Progress& p) {
    mState->setText(QStringLiteral("Testing module %1 of %2…").arg(p.done + 1).arg(p.total));
  };
  hooks.ended = [this](const InstrumentTask::Progress& p) { ShowResults(p); };
  hooks.say = [this](const QString& text) { mState->setText(text); };
  hooks.unable = [] {
    const RunStopDs* run = uiapp::GetRunStopDs();
    return run != nullptr && run->IsRunning() ? QStringLiteral("The self test cannot start while the instrument runs.") : QString();
  };
  mFollower = new TaskFollower(SelfTest::Task(), bar, start, cancel, hooks, this);
  mFollower->ShowCanStart();
  if (uiapp::GetRunStopDs() != nullptr) {
    mRunView = std::make_unique<RunView>(*mFollower);
    uiapp::GetRunStopDs()->RegisterView(mRunView.get(), list);
  }
  // A test that ran before the window opened (or runs now) is shown.
  mFollower->Resume();
  return 0;
}

int SelftestResultWin::StartTest(ConditionList& list) {
  mTable->setRowCount(0);
  mState->setText(QStringLiteral("Starting the self test…"));
  return mFollower->Start(list);
}

void SelftestResultWin::ShowResults(const InstrumentTask::Progress& progress) {
  std::vector<SelfTest::ModuleResult> results;
  ConditionList list;
  if (SelfTest::Results(results, list) != 0) {
    mState->setText(QStringLiteral("The results could not be read; see the error list."));
    BoundControl::Report(list);
    return;
  }
  mTable->setRowCount(static_cast<int>(results.size()));
  QStringList failed;
  for (int row = 0; row < static_cast<int>(results.size()); ++row) {
    const SelfTest::ModuleResult& r = results[static_cast<std::size_t>(row)];
    const QString module = PlaceName(r.module);
    const bool fail = r.result == "FAIL";
    const QString word = fail ? QStringLiteral("Failed") : r.result == "PASS" ? QStringLiteral("Passed") : QStringLiteral("Not run");
    const QColor colour = fail ? QColor(0xb3, 0x26, 0x1e) : r.result == "PASS" ? QColor(0x1a, 0x7f, 0x37) : palette().color(QPalette::PlaceholderText);
    const QString cells[] = {module, QString::fromStdString(r.model), word, QString::fromStdString(r.detail)};
    for (int c = 0; c < 4; ++c) {
      auto* item = new QTableWidgetItem(cells[c]);
      if (c == 2) item->setForeground(colour);
      if (fail) item->setToolTip(QString::fromStdString(r.detail));
      mTable->setItem(row, c, item);
    }
    if (fail) failed << module;
  }
  if (progress.state == InstrumentTask::State::Aborted) {
    mState->setText(QStringLiteral("Cancelled after %1 of %2 modules.").arg(progress.done).arg(progress.total));
  } else if (failed.isEmpty()) {
    mState->setText(QStringLiteral("All %1 modules passed.").arg(results.size()));
  } else {
    mState->setText(QStringLiteral("%1 of %2 modules failed: %3.").arg(failed.size()).arg(results.size()).arg(failed.join(QStringLiteral(", "))));
  }
}

QString SelftestResultWin::StateText() const { return mState->text(); }
