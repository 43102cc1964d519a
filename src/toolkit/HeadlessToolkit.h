#pragma once

#include <atomic>
#include <deque>
#include <functional>
#include <set>

#include "toolkit/ToolkitPort.h"

// The toolkit without a display. Time comes from a clock that a test can replace: with a
// manual clock, ProcessNext jumps straight to the alarm instead of sleeping. Alerts and
// questions go to a sink and to scripted answers.
class HeadlessToolkit : public ToolkitPort {
 public:
  using Clock = std::function<double()>;

  HeadlessToolkit();

  void StartCBackAlarm(unsigned ms, Proc proc, void* client) override;
  void StopCBackAlarm() override;
  void ProcessNext() override;
  void Update() override;
  void CallDeferred(Proc proc, void* client) override;
  void Alert(const Dstring& text, Icon icon) override;
  int AskYesNo(const Dstring& text) override;
  int AskYesNoCancel(const Dstring& text) override { return AskYesNo(text); }
  // Without an answer queued: kCancel, the answer that changes nothing.
  int AskChoice(const Dstring& text, const Dstring& yes, const Dstring& no) override;
  void SetWaitCursor(bool on) override { mWaitCursor = on; }
  bool IsShiftDown() override { return mShiftDown; }
  // Without a display there are no resources to read: the names are only recorded.
  int LoadResourceLibrary(const Dstring& name, ConditionList&) override {
    mLibraries.insert(name);
    return 0;
  }
  int RegisterClass(const Dstring& className, ConditionList&) override {
    mClasses.insert(className);
    return 0;
  }
  void RegisterWindow(const Dstring& resource) override { mWindows.insert(resource); }
  void UnregisterWindow(const Dstring& resource) override { mWindows.erase(resource); }
  void RegisterScriptItems(const char* kind, const std::vector<Dstring>& names, unsigned flag) override;

  // A manual clock in seconds: ProcessNext sets `now` to the alarm's time instead of sleeping.
  void UseManualClock(double* now);
  // Ends a ProcessNext that is waiting (from a signal handler too).
  void Interrupt() { mInterrupted = true; }
  // Runs after every ProcessNext: where a host looks at its own reasons to end the loop.
  void SetAfterEvent(std::function<void()> check) { mAfterEvent = std::move(check); }

  void SetShiftDown(bool down) { mShiftDown = down; }
  void QueueAnswer(int answer) { mAnswers.push_back(answer); }
  void SetAlertSink(std::function<void(const Dstring&, Icon)> sink) { mAlertSink = std::move(sink); }

  const std::deque<Dstring>& Alerts() const { return mAlerts; }
  const std::deque<Dstring>& Questions() const { return mQuestions; }
  const std::set<Dstring>& Windows() const { return mWindows; }
  const std::set<Dstring>& Classes() const { return mClasses; }
  const std::set<Dstring>& Libraries() const { return mLibraries; }
  bool IsAlarmArmed() const { return mAlarmProc != nullptr; }
  double AlarmDue() const { return mAlarmDue; }
  bool IsWaitCursorOn() const { return mWaitCursor; }
  unsigned ScriptItemCount() const { return mScriptItems; }

 private:
  double Now() const;
  void WaitAndHandleOne();
  bool RunOneDeferred();
  bool FireAlarmIfDue();

  double* mManualNow = nullptr;
  Proc mAlarmProc = nullptr;
  void* mAlarmClient = nullptr;
  double mAlarmDue = 0.0;
  std::deque<std::pair<Proc, void*>> mDeferred;
  std::deque<int> mAnswers;
  std::deque<Dstring> mAlerts;
  std::deque<Dstring> mQuestions;
  std::set<Dstring> mWindows;
  std::set<Dstring> mClasses;
  std::set<Dstring> mLibraries;
  std::function<void(const Dstring&, Icon)> mAlertSink;
  std::function<void()> mAfterEvent;
  std::atomic<bool> mInterrupted{false};
  bool mShiftDown = false;
  bool mWaitCursor = false;
  unsigned mScriptItems = 0;
};
