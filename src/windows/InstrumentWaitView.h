#pragma once

#include <QWidget>

#include "instrument/CallWaiter.h"

class QLabel;
class QStatusBar;

// What the user sees while a command waits for the instrument: the windows stay alive (their
// events run between short waits), after half a second the busy cursor and a line in the status
// bar name the command, and after five seconds this bar offers to disconnect.
class InstrumentWaitView : public QWidget, public CallWaiter {
  Q_OBJECT

 public:
  static constexpr long long kBusyAfterMs = 500;
  static constexpr long long kOfferDisconnectAfterMs = 5000;

  explicit InstrumentWaitView(QStatusBar* statusBar, QWidget* parent = nullptr);
  ~InstrumentWaitView() override;

  bool Wait(const Dstring& cmd, long long waitedMs) override;
  void WaitEnded() override;

  // The status bar's text for a wait of `cmd` (without the application handle).
  static QString WaitingText(const Dstring& cmd, long long waitedMs);
  void HitPButDisconnect();

 signals:
  // The user gave up a wait: the connection is closed.
  void Abandoned();

 private:
  void ShowBusy(const Dstring& cmd, long long waitedMs);

  QStatusBar* mStatusBar;
  QLabel* mText;
  bool mBusyShown = false;
  long long mShownSeconds = -1;
  bool mAbandon = false;
};
