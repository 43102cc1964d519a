#include "windows/common/ServerWorkProgress.h"

#include <QCoreApplication>
#include <QProgressDialog>
#include <QPushButton>
#include <QWidget>

#include "support/FWBlocker.h"

ServerWorkProgress::ServerWorkProgress(QWidget* parent, QString label, int showAfterMs)
    : mParent(parent), mLabel(std::move(label)), mShowAfterMs(showAfterMs) {
  mClock.start();
}

ServerWorkProgress::~ServerWorkProgress() = default;

void ServerWorkProgress::Show() {
  mDialog = std::make_unique<QProgressDialog>(mLabel, QStringLiteral("Cancel"), 0, 0, mParent);
  mDialog->setObjectName(QStringLiteral("ServerWorkProgress"));
  mDialog->setWindowTitle(mParent ? mParent->window()->windowTitle() : QString());
  mDialog->setWindowModality(Qt::WindowModal);
  mDialog->setMinimumDuration(0);
  mDialog->setAutoReset(false);
  mDialog->setAutoClose(false);
  // The dialog stays up until the instrument has put everything back and answered.
  QObject::disconnect(mDialog.get(), &QProgressDialog::canceled, mDialog.get(), &QProgressDialog::cancel);
  QObject::connect(mDialog.get(), &QProgressDialog::canceled, mDialog.get(), [this] {
    mCancelled = true;
    mDialog->setLabelText(QStringLiteral("Cancelling…"));
    if (auto* button = mDialog->findChild<QPushButton*>()) button->setEnabled(false);
  });
  mDialog->show();
}

bool ServerWorkProgress::Tick(long long done, long long total) {
  const FWBlocker::WaitScope waiting;
  if (!mDialog && mClock.elapsed() >= mShowAfterMs) Show();
  if (mDialog && total > 0) {
    mDialog->setMaximum(1000);
    mDialog->setValue(static_cast<int>(1000 * done / total));
  }
  QCoreApplication::processEvents();
  return mCancelled;
}
