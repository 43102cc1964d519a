#include "windows/StateStatusBar.h"

#include <QLabel>

#include "core/uiapp.h"
#include "data/BerSvr.h"
#include "data/ConnectDs.h"
#include "data/DataPortOneLockDs.h"
#include "data/PLLStateDs.h"
#include "data/QenDsView.h"
#include "data/RunStopDs.h"
#include "data/SystemStateDs.h"
#include "support/NumberText.h"

namespace {

const char* SystemText(SysStateEnum s) {
  static const char* const kTexts[] = {"Programming", "Running", "Halted", "Finished", "Stand-alone", "Synchronising"};
  return s >= 0 && s <= 5 ? kTexts[s] : "Unknown";
}

const char* PllText(PLLStateEnum s) {
  switch (s) {
    case kPllLock: return "locked";
    case kPllUnknown: return "unknown";
    case kPllUnlockedCdr: return "unlocked (clock recovery)";
    case kPllUnlockedData: return "unlocked (data)";
    default: return "unlocked";
  }
}

const char* PortLockText(DataPortOneLockEnum s) {
  static const char* const kTexts[] = {"n/a", "free", "demultiplexed", "unknown"};
  return s >= 0 && s <= 3 ? kTexts[s] : "unknown";
}

QLabel* Field(QStatusBar* bar, const char* name) {
  auto* label = new QLabel(bar);
  label->setObjectName(QString::fromLatin1(name));
  label->setContentsMargins(6, 0, 6, 0);
  bar->addPermanentWidget(label);
  return label;
}

}  // namespace

class StateStatusBar::View : public QenDsView {
 public:
  explicit View(StateStatusBar& bar) : mBar(bar) {}
  int NfyViewDataUpdated(QenDs*, ConditionList&) override {
    mBar.ShowState();
    return 0;
  }

 private:
  StateStatusBar& mBar;
};

StateStatusBar::StateStatusBar(QWidget* parent)
    : QStatusBar(parent),
      mRun(Field(this, "StatusRun")),
      mSystem(Field(this, "StatusSystem")),
      mPll(Field(this, "StatusPll")),
      mPortLock(Field(this, "StatusPortLock")),
      mOutputs(Field(this, "StatusOutputs")),
      mBer(Field(this, "StatusBer")),
      mView(std::make_unique<View>(*this)) {}

StateStatusBar::~StateStatusBar() { Detach(); }

void StateStatusBar::Attach() {
  ConditionList list;
  mSources = {uiapp::GetRunStopDs(), uiapp::GetSystemStateDs(), uiapp::GetPLLStateDs(),
              uiapp::GetDataPortOneLockStateDs(), uiapp::GetConnectDs(), uiapp::GetBerSvr()};
  for (QenDs* source : mSources) {
    if (source != nullptr) source->RegisterView(mView.get(), list);
  }
  ShowState();
}

void StateStatusBar::Detach() {
  ConditionList list;
  for (QenDs* source : mSources) {
    if (source != nullptr) source->UnregisterView(mView.get(), list);
  }
  mSources.clear();
}

void StateStatusBar::ShowState() {
  if (uiapp::GetRunStopDs() == nullptr) return;
  const bool running = uiapp::GetRunStopDs()->IsRunning();
  mRun->setText(running ? QStringLiteral("\u25B6 Running") : QStringLiteral("\u25A0 Stopped"));
  mRun->setStyleSheet(running ? QStringLiteral("color: #1a7f37; font-weight: bold") : QString());
  mSystem->setText(QStringLiteral("System: %1").arg(QLatin1String(SystemText(uiapp::GetSystemState()))));
  const bool pllLocked = uiapp::GetPLLState() == kPllLock;
  mPll->setText(QStringLiteral("PLL: %1").arg(QLatin1String(PllText(uiapp::GetPLLState()))));
  mPll->setStyleSheet(pllLocked ? QString() : QStringLiteral("color: #b35900"));
  mPortLock->setText(QStringLiteral("Port 1: %1").arg(QLatin1String(PortLockText(uiapp::GetDataPortOneLockState()))));
  mOutputs->setText(uiapp::IsConnected() ? QStringLiteral("Outputs on") : QStringLiteral("Outputs off"));
  unsigned long long compared = 0;
  unsigned long long errors = 0;
  for (const auto& result : uiapp::GetBerSvr()->GetResults()) {
    compared += result.compared;
    errors += result.errors;
  }
  mBer->setVisible(running);
  mBer->setText(QStringLiteral("BER %1 (%2 errors)")
                    .arg(QString::fromStdString(NumberText::Ratio(errors, compared)),
                         QString::fromStdString(NumberText::Grouped(errors))));
}

QString StateStatusBar::Text() const {
  QStringList parts;
  for (const QLabel* label : {mRun, mSystem, mPll, mPortLock, mOutputs, mBer}) {
    if (label->isVisibleTo(this)) parts << label->text();
  }
  return parts.join(QStringLiteral(" | "));
}
