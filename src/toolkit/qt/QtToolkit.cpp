#include "toolkit/qt/QtToolkit.h"

#include <QApplication>
#include <QMessageBox>
#include <QPushButton>

#include "toolkit/qt/ResourceLibrary.h"
#include "toolkit/qt/WidgetClassTable.h"

QtToolkit::QtToolkit() {
  mAlarm.setSingleShot(true);
  mAlarm.setTimerType(Qt::PreciseTimer);
  connect(&mAlarm, &QTimer::timeout, this, &QtToolkit::FireAlarm);
}

QtToolkit::~QtToolkit() {
  while (mWaitDepth > 0) SetWaitCursor(false);
}

void QtToolkit::StartCBackAlarm(unsigned ms, Proc proc, void* client) {
  mAlarmProc = proc;
  mAlarmClient = client;
  mAlarm.start(static_cast<int>(ms));
}

void QtToolkit::StopCBackAlarm() {
  mAlarm.stop();
  mAlarmProc = nullptr;
  mAlarmClient = nullptr;
}

void QtToolkit::FireAlarm() {
  Proc proc = mAlarmProc;
  void* client = mAlarmClient;
  mAlarmProc = nullptr;
  if (proc != nullptr) proc(client);
}

void QtToolkit::ProcessNext() { QCoreApplication::processEvents(QEventLoop::WaitForMoreEvents); }

void QtToolkit::Update() { QCoreApplication::processEvents(); }

void QtToolkit::CallDeferred(Proc proc, void* client) {
  QMetaObject::invokeMethod(this, [proc, client] { proc(client); }, Qt::QueuedConnection);
}

void QtToolkit::Alert(const Dstring& text, Icon icon) {
  if (mAlertSink) return mAlertSink(text, icon);
  static const QMessageBox::Icon kIcons[] = {QMessageBox::Information, QMessageBox::Warning, QMessageBox::Critical};
  QMessageBox box(kIcons[static_cast<int>(icon)], QApplication::applicationDisplayName(),
                  QString::fromStdString(text), QMessageBox::Ok, QApplication::activeWindow());
  box.exec();
}

int QtToolkit::AskYesNo(const Dstring& text) {
  if (!mAnswers.empty()) {
    const int answer = mAnswers.front();
    mAnswers.pop_front();
    return answer;
  }
  if (mAlertSink) {
    mAlertSink(text, Icon::Information);
    return kNo;
  }
  const auto answer = QMessageBox::question(QApplication::activeWindow(), QApplication::applicationDisplayName(),
                                            QString::fromStdString(text));
  return answer == QMessageBox::Yes ? kYes : kNo;
}

int QtToolkit::AskYesNoCancel(const Dstring& text) {
  if (!mAnswers.empty() || mAlertSink) return AskYesNo(text);
  const auto answer = QMessageBox::question(QApplication::activeWindow(), QApplication::applicationDisplayName(),
                                            QString::fromStdString(text),
                                            QMessageBox::Yes | QMessageBox::No | QMessageBox::Cancel, QMessageBox::Cancel);
  return answer == QMessageBox::Yes ? kYes : answer == QMessageBox::No ? kNo : kCancel;
}

int QtToolkit::AskChoice(const Dstring& text, const Dstring& yes, const Dstring& no) {
  if (!mAnswers.empty()) return AskYesNo(text);
  if (mAlertSink) {
    mAlertSink(text, Icon::Information);
    return kCancel;
  }
  QMessageBox box(QMessageBox::Question, QApplication::applicationDisplayName(), QString::fromStdString(text),
                  QMessageBox::NoButton, QApplication::activeWindow());
  QPushButton* yesButton = box.addButton(QString::fromStdString(yes), QMessageBox::AcceptRole);
  QPushButton* noButton = no.empty() ? nullptr : box.addButton(QString::fromStdString(no), QMessageBox::DestructiveRole);
  QPushButton* cancel = box.addButton(QMessageBox::Cancel);
  box.setDefaultButton(yesButton);
  box.setEscapeButton(cancel);
  box.exec();
  if (box.clickedButton() == yesButton) return kYes;
  return noButton != nullptr && box.clickedButton() == noButton ? kNo : kCancel;
}

void QtToolkit::SetWaitCursor(bool on) {
  if (on) {
    ++mWaitDepth;
    QApplication::setOverrideCursor(Qt::WaitCursor);
  } else if (mWaitDepth > 0) {
    --mWaitDepth;
    QApplication::restoreOverrideCursor();
  }
}

bool QtToolkit::IsShiftDown() {
  return (QGuiApplication::queryKeyboardModifiers() & Qt::ShiftModifier) != 0;
}

int QtToolkit::LoadResourceLibrary(const Dstring& name, ConditionList& list) {
  return ResourceLibrary::Check(name, list);
}

int QtToolkit::RegisterClass(const Dstring& className, ConditionList& list) {
  return WidgetClassTable::Register(className, list);
}

void QtToolkit::RegisterScriptItems(const char*, const std::vector<Dstring>& names, unsigned) {
  mScriptItems += static_cast<unsigned>(names.size());
}
