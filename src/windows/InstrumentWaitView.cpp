#include "windows/InstrumentWaitView.h"

#include <QApplication>
#include <QHBoxLayout>
#include <QLabel>
#include <QPushButton>
#include <QStatusBar>
#include <utility>

#include "instrument/QenGuiInst.h"

namespace {

constexpr int kShownCommandChars = 60;

// The command as the user knows it: without the handle, and short.
QString ShownCommand(const Dstring& cmd) {
  QString text = QString::fromStdString(cmd);
  // Commands name the handle first, with or without the leading colon.
  const QString handle = QString::fromStdString(QenGuiInst::GetAppHandle()) + QLatin1Char(':');
  const int colon = text.startsWith(QLatin1Char(':')) ? 1 : 0;
  if (handle.size() > 1 && text.mid(colon).startsWith(handle, Qt::CaseInsensitive)) text.remove(0, colon + handle.size() - 1);
  // A data block is bytes, not words.
  const int block = text.indexOf(QLatin1Char('#'));
  text.truncate(block < 0 ? kShownCommandChars : qMin(block, kShownCommandChars));
  for (QChar& c : text) {
    if (!c.isPrint()) c = QLatin1Char(' ');
  }
  return text.trimmed();
}

}  // namespace

InstrumentWaitView::InstrumentWaitView(QStatusBar* statusBar, QWidget* parent)
    : QWidget(parent), mStatusBar(statusBar), mText(new QLabel) {
  setObjectName(QStringLiteral("InstrumentWaitBar"));
  setAttribute(Qt::WA_StyledBackground);
  setStyleSheet(QStringLiteral("#InstrumentWaitBar { background: #fde2e1; border-bottom: 1px solid #d9a09c; }"));
  auto* layout = new QHBoxLayout(this);
  layout->setContentsMargins(8, 4, 8, 4);
  mText->setObjectName(QStringLiteral("InstrumentWaitText"));
  layout->addWidget(mText, 1);
  auto* disconnect = new QPushButton(QStringLiteral("&Disconnect"));
  disconnect->setObjectName(QStringLiteral("PButDisconnect"));
  connect(disconnect, &QPushButton::clicked, this, &InstrumentWaitView::HitPButDisconnect);
  layout->addWidget(disconnect);
  hide();
}

InstrumentWaitView::~InstrumentWaitView() {
  if (mBusyShown) QApplication::restoreOverrideCursor();
}

QString InstrumentWaitView::WaitingText(const Dstring& cmd, long long waitedMs) {
  return QStringLiteral("Waiting for the instrument: %1… %2 s").arg(ShownCommand(cmd)).arg(waitedMs / 1000);
}

bool InstrumentWaitView::Wait(const Dstring& cmd, long long waitedMs) {
  if (waitedMs >= kBusyAfterMs) ShowBusy(cmd, waitedMs);
  QCoreApplication::processEvents(QEventLoop::AllEvents);
  return mAbandon;
}

void InstrumentWaitView::ShowBusy(const Dstring& cmd, long long waitedMs) {
  if (!mBusyShown) {
    mBusyShown = true;
    QApplication::setOverrideCursor(Qt::BusyCursor);
  }
  const long long seconds = waitedMs / 1000;
  if (seconds == mShownSeconds) return;
  mShownSeconds = seconds;
  if (mStatusBar) mStatusBar->showMessage(WaitingText(cmd, waitedMs));
  if (waitedMs >= kOfferDisconnectAfterMs) {
    mText->setText(QStringLiteral("The instrument has not answered %1 for %2 s. Wait on, or disconnect and choose "
                                  "another server.")
                       .arg(ShownCommand(cmd))
                       .arg(seconds));
    show();
  }
}

void InstrumentWaitView::WaitEnded() {
  if (mBusyShown) QApplication::restoreOverrideCursor();
  if (mBusyShown && mStatusBar) mStatusBar->clearMessage();
  mBusyShown = false;
  mShownSeconds = -1;
  hide();
  if (std::exchange(mAbandon, false)) emit Abandoned();
}

void InstrumentWaitView::HitPButDisconnect() { mAbandon = true; }
