#pragma once

#include <QObject>
#include <QString>
#include <QTimer>
#include <functional>

#include "core/InstrumentTask.h"
#include "support/ConditionList.h"

class QProgressBar;
class QPushButton;

// Follows an instrument task (self test, automatic deskew) for the window that shows it: its
// start and cancel buttons, a progress bar, and a question to the instrument five times a
// second while the task runs, so the program stays responsive. The window says what the
// progress means through the hooks.
class TaskFollower : public QObject {
  Q_OBJECT

 public:
  static constexpr int kPollMs = 200;

  struct Hooks {
    // Asked before a start: nonzero (with a condition) keeps the task from starting.
    std::function<int(ConditionList&)> before;
    std::function<void(const InstrumentTask::Progress&)> running;
    std::function<void(const InstrumentTask::Progress&)> ended;
    std::function<void(const QString&)> say;
    // Why the task cannot start now, empty when it can: the start button is off while there is
    // a reason, and its tooltip gives it.
    std::function<QString()> unable;
  };

  TaskFollower(InstrumentTask task, QProgressBar* bar, QPushButton* start, QPushButton* cancel, Hooks hooks,
               QObject* parent);

  int Start(ConditionList& list);
  int Cancel(ConditionList& list);
  // Asks the progress once; the `ended` hook runs when the task has ended.
  int Poll(ConditionList& list);
  // At the window's opening: follows a task that runs, or shows how the last one ended.
  void Resume();
  bool IsActive() const { return mTimer.isActive(); }
  // Turns the start button on or off for what `unable` says now.
  void ShowCanStart();

 private:
  void SetActive(bool active);
  void Report(int (TaskFollower::*action)(ConditionList&));

  InstrumentTask mTask;
  QProgressBar* mBar;
  QPushButton* mStart;
  QPushButton* mCancel;
  Hooks mHooks;
  QTimer mTimer;
};
