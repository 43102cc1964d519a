#pragma once

#include <QElapsedTimer>
#include <QString>
#include <memory>

#include "instrument/CallProgress.h"

class QProgressDialog;
class QWidget;

// Shows how far the instrument is with a long command while a window waits for it: a dialog
// after `showAfterMs`, with Cancel. Events run meanwhile, so the program stays alive, but
// every operation they would start waits its turn (FWBlocker::WaitScope).
class ServerWorkProgress : public CallProgress {
 public:
  static constexpr int kShowAfterMs = 500;

  ServerWorkProgress(QWidget* parent, QString label, int showAfterMs = kShowAfterMs);
  ~ServerWorkProgress() override;
  ServerWorkProgress(const ServerWorkProgress&) = delete;
  ServerWorkProgress& operator=(const ServerWorkProgress&) = delete;

  bool Tick(long long done, long long total) override;
  bool WasCancelled() const { return mCancelled; }

 private:
  void Show();

  QWidget* mParent;
  QString mLabel;
  int mShowAfterMs;
  QElapsedTimer mClock;
  std::unique_ptr<QProgressDialog> mDialog;
  bool mCancelled = false;
};
