#include "windows/selftest/SelftestResultWin.h"

#include <QHeaderView>
#include <QLabel>
#include <QProgressBar>
#include <QPushButton>
#include <QTableWidget>
#include <algorithm>

#include "params/ui/BoundControl.h"
#include "support/FWBlocker.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "windows/PlaceName.h"

SelftestResultWin::SelftestResultWin(QWidget* parent) : QWidget(parent) {
  setObjectName(QStringLiteral("SelftestResultWin"));
  mTimer.setInterval(kPollMs);
  connect(&mTimer, &QTimer::timeout, this, &SelftestResultWin::NfyTimer);
}

int SelftestResultWin::Load(ConditionList& list) {
  if (int status = ResourceLibrary::LoadInto("selftest.Result", this, list)) return status;
  mTable = findChild<QTableWidget*>(QStringLiteral("TableResults"));
  mBar = findChild<QProgressBar*>(QStringLiteral("BarProgress"));
  mState = findChild<QLabel*>(QStringLiteral("LabelState"));
  mStart = findChild<QPushButton*>(QStringLiteral("PButStart"));
  mCancel = findChild<QPushButton*>(QStringLiteral("PButCancel"));
  if (mTable == nullptr || mBar == nullptr || mState == nullptr || mStart == nullptr || mCancel == nullptr) {
    list.Add(1, "The window resource \"selftest.Result\" lacks its table, progress bar or buttons.");
    return 1;
  }
  mTable->verticalHeader()->setVisible(false);
  mTable->horizontalHeader()->setSectionResizeMode(3, QHeaderView::Stretch);
  for (int c = 0; c < 3; ++c) mTable->horizontalHeader()->setSectionResizeMode(c, QHeaderView::ResizeToContents);
  connect(mStart, &QPushButton::clicked, this, &SelftestResultWin::HitPButStart);
  connect(mCancel, &QPushButton::clicked, this, &SelftestResultWin::HitPButCancel);
  // A test that ran before the window opened (or runs now) is shown; without an answer the
  // window just opens empty.
  ConditionList ignored;
  SelfTest::Progress progress;
  if (SelfTest::Ask(progress, ignored) == 0 && progress.state != SelfTest::State::Idle) {
    SetTesting(true);
    PollProgress(ignored);
  }
  return 0;
}

int SelftestResultWin::StartTest(ConditionList& list) {
  if (IsTesting()) return 0;
  if (int status = SelfTest::Start(list)) return status;
  mTable->setRowCount(0);
  mBar->setValue(0);
  mState->setText(QStringLiteral("Starting the self test…"));
  SetTesting(true);
  return PollProgress(list);
}

int SelftestResultWin::CancelTest(ConditionList& list) {
  if (!IsTesting()) return 0;
  if (int status = SelfTest::Cancel(list)) return status;
  return PollProgress(list);
}

int SelftestResultWin::PollProgress(ConditionList& list) {
  SelfTest::Progress progress;
  if (int status = SelfTest::Ask(progress, list)) {
    // Held by another client, the test goes on there and is followed again once it is free.
    if (status == FWBlocker::kLocked) {
      mState->setText(QStringLiteral("Another client holds the instrument; the self test is followed again when it lets go."));
      return status;
    }
    // Without an answer the test cannot be followed; the user may start it again.
    SetTesting(false);
    mState->setText(QStringLiteral("The self test could not be followed; see the error list."));
    return status;
  }
  mBar->setMaximum(static_cast<int>(std::max(progress.total, 1UL)));
  mBar->setValue(static_cast<int>(progress.done));
  if (progress.state == SelfTest::State::Running) {
    mState->setText(QStringLiteral("Testing module %1 of %2…").arg(progress.done + 1).arg(progress.total));
    return 0;
  }
  SetTesting(false);
  std::vector<SelfTest::ModuleResult> results;
  if (int status = SelfTest::Results(results, list)) return status;
  ShowResults(results, progress);
  return 0;
}

void SelftestResultWin::ShowResults(const std::vector<SelfTest::ModuleResult>& results, const SelfTest::Progress& progress) {
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
  if (progress.state == SelfTest::State::Aborted) {
    mState->setText(QStringLiteral("Cancelled after %1 of %2 modules.").arg(progress.done).arg(progress.total));
  } else if (failed.isEmpty()) {
    mState->setText(QStringLiteral("All %1 modules passed.").arg(results.size()));
  } else {
    mState->setText(QStringLiteral("%1 of %2 modules failed: %3.").arg(failed.size()).arg(results.size()).arg(failed.join(QStringLiteral(", "))));
  }
}

QString SelftestResultWin::StateText() const { return mState->text(); }

void SelftestResultWin::SetTesting(bool testing) {
  if (testing) {
    mTimer.start();
  } else {
    mTimer.stop();
  }
  mStart->setEnabled(!testing);
  mCancel->setEnabled(testing);
}

void SelftestResultWin::HitPButStart() {
  ConditionList list;
  StartTest(list);
  BoundControl::Report(list);
}

void SelftestResultWin::HitPButCancel() {
  ConditionList list;
  CancelTest(list);
  BoundControl::Report(list);
}

void SelftestResultWin::NfyTimer() {
  ConditionList list;
  PollProgress(list);
  BoundControl::Report(list);
}
