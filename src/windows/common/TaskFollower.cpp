#include "windows/common/TaskFollower.h"

#include <QProgressBar>
#include <QPushButton>
#include <algorithm>

#include "params/ui/BoundControl.h"
#include "support/FWBlocker.h"

TaskFollower::TaskFollower(InstrumentTask task, QProgressBar* bar, QPushButton* start, QPushButton* cancel,
                           Hooks hooks, QObject* parent)
    : QObject(parent), mTask(task), mBar(bar), mStart(start), mCancel(cancel), mHooks(std::move(hooks)) {
  mTimer.setInterval(kPollMs);
  connect(&mTimer, &QTimer::timeout, this, [this] { Report(&TaskFollower::Poll); });
  connect(mStart, &QPushButton::clicked, this, [this] { Report(&TaskFollower::Start); });
  connect(mCancel, &QPushButton::clicked, this, [this] { Report(&TaskFollower::Cancel); });
}

void TaskFollower::Report(int (TaskFollower::*action)(ConditionList&)) {
  ConditionList list;
  (this->*action)(list);
  BoundControl::Report(list);
}

int TaskFollower::Start(ConditionList& list) {
  if (IsActive()) return 0;
  if (mHooks.before) {
    if (int status = mHooks.before(list)) return status;
  }
  if (int status = mTask.Start(list)) return status;
  mBar->setValue(0);
  SetActive(true);
  return Poll(list);
}

int TaskFollower::Cancel(ConditionList& list) {
  if (!IsActive()) return 0;
  if (int status = mTask.Cancel(list)) return status;
  return Poll(list);
}

int TaskFollower::Poll(ConditionList& list) {
  InstrumentTask::Progress progress;
  if (int status = mTask.Ask(progress, list)) {
    // Held by another client, the task goes on there and is followed again once it is free.
    if (status == FWBlocker::kLocked) {
      mHooks.say(QStringLiteral("Another client holds the instrument; followed again when it lets go."));
      return status;
    }
    SetActive(false);
    mHooks.say(QStringLiteral("The instrument's answer could not be read; see the error list."));
    return status;
  }
  mBar->setMaximum(static_cast<int>(std::max(progress.total, 1UL)));
  mBar->setValue(static_cast<int>(progress.done));
  if (progress.state == InstrumentTask::State::Running) {
    SetActive(true);
    mHooks.running(progress);
    return 0;
  }
  SetActive(false);
  mHooks.ended(progress);
  return 0;
}

void TaskFollower::Resume() {
  ConditionList ignored;
  InstrumentTask::Progress progress;
  if (mTask.Ask(progress, ignored) == 0 && progress.state != InstrumentTask::State::Idle) Poll(ignored);
}

void TaskFollower::SetActive(bool active) {
  if (active && !mTimer.isActive()) mTimer.start();
  if (!active) mTimer.stop();
  ShowCanStart();
  mCancel->setEnabled(active);
}

void TaskFollower::ShowCanStart() {
  const QString why = mHooks.unable ? mHooks.unable() : QString();
  mStart->setEnabled(!IsActive() && why.isEmpty());
  mStart->setToolTip(why);
}
