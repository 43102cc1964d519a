#pragma once

#include <QObject>
#include <QTimer>
#include <deque>
#include <functional>
#include <set>

#include "toolkit/ToolkitPort.h"

// The toolkit port on Qt Widgets: the alarm is a single-shot timer, the event pump is the
// application's event loop, alerts and questions are message boxes. Tests set a sink and
// scripted answers so that nothing modal opens.
class QtToolkit : public QObject, public ToolkitPort {
  Q_OBJECT

 public:
  QtToolkit();
  ~QtToolkit() override;

  void StartCBackAlarm(unsigned ms, Proc proc, void* client) override;
  void StopCBackAlarm() override;
  void ProcessNext() override;
  void Update() override;
  void CallDeferred(Proc proc, void* client) override;
  void Alert(const Dstring& text, Icon icon) override;
  int AskYesNo(const Dstring& text) override;
  int AskYesNoCancel(const Dstring& text) override;
  int AskChoice(const Dstring& text, const Dstring& yes, const Dstring& no) override;
  void SetWaitCursor(bool on) override;
  bool IsShiftDown() override;
  int LoadResourceLibrary(const Dstring& name, ConditionList& list) override;
  int RegisterClass(const Dstring& className, ConditionList& list) override;
  void RegisterWindow(const Dstring& resource) override { mWindows.insert(resource); }
  void UnregisterWindow(const Dstring& resource) override { mWindows.erase(resource); }
  void RegisterScriptItems(const char* kind, const std::vector<Dstring>& names, unsigned flag) override;

  // Alerts go to `sink` instead of a message box; questions take the queued answers (a
  // question without one, asked while a sink is set, is told to the sink and answered kNo, or
  // kCancel where it offers that).
  void SetAlertSink(std::function<void(const Dstring&, Icon)> sink) { mAlertSink = std::move(sink); }
  void QueueAnswer(int answer) { mAnswers.push_back(answer); }
  bool IsAlarmArmed() const { return mAlarm.isActive(); }
  int WaitCursorDepth() const { return mWaitDepth; }
  const std::set<Dstring>& Windows() const { return mWindows; }

 private:
  void FireAlarm();

  QTimer mAlarm;
  Proc mAlarmProc = nullptr;
  void* mAlarmClient = nullptr;
  std::function<void(const Dstring&, Icon)> mAlertSink;
  std::deque<int> mAnswers;
  std::set<Dstring> mWindows;
  int mWaitDepth = 0;
  unsigned mScriptItems = 0;
};
