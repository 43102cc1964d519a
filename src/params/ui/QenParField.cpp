#include "params/ui/QenParField.h"

#include <QHBoxLayout>
#include <QLineEdit>

#include "params/ValueText.h"
#include "params/ui/ParSpinBox.h"
#include "params/ui/UnitLabel.h"
#include "support/FWBlocker.h"

QenParField::QenParField(QWidget* parent, std::string_view className, UnitLabel* unitLabel)
    : QWidget(parent), BoundControl(this, className, true), mSpin(new ParSpinBox(*this)), mUnitLabel(unitLabel) {
  auto* layout = new QHBoxLayout(this);
  layout->setContentsMargins(0, 0, 0, 0);
  layout->setSpacing(4);
  layout->addWidget(mSpin, 1);
  layout->addWidget(mUnitLabel);
  mUnitLabel->SetParEd(this);
  setFocusProxy(mSpin);
  SetColourTarget(mSpin);
}

QenParField::~QenParField() { NfyEnd(); }

void QenParField::NfyInit() {
  if (IsInitialised()) return;
  ConditionList list;
  FWBlocker blocker("QenParField::NfyInit", list);
  mSpin->ShowText(QString());
  mUnitLabel->NfyInit();
  mUnitLabel->setVisible(mShowUnits);
  SetIsEnabled(mIsEnabled);
  BoundControl::NfyInit();
}

// A value or an attribute that cannot be read leaves the text as it was, shown failed.
int QenParField::Refresh(ConditionList& list) {
  int status = mState.ReadValue(Binding(), list);
  if (status == 0 && Binding().GetDs() != nullptr) {
    status = mUnitLabel->Refresh(list);
    if (status == 0) ShowAdjusted();
  }
  ShowSourceState();
  return status;
}

int QenParField::RefreshUnits(ConditionList& list) {
  const int status = mUnitLabel->Refresh(list);
  ShowSourceState();
  return status;
}

void QenParField::ShowAdjusted() {
  double asked = 0.0;
  double held = 0.0;
  if (!mState.TakeAdjusted(asked, held)) return;
  const QString unit = mUnitLabel->text().trimmed();
  const int exp = mState.DisplayExp();
  MarkAdjusted(QString::fromStdString(ValueText::FormatDisplay(held, exp)) + " " + unit,
               QString::fromStdString(ValueText::FormatDisplay(asked, exp)) + " " + unit);
}

Dstring QenParField::FormatValue(double value) const { return ValueText::FormatDisplay(value, mState.DisplayExp()); }

void QenParField::DisplayValue(double) { mSpin->ShowText(QString::fromStdString(mState.DisplayText())); }

int QenParField::AdjustAndSend(int steps, ConditionList& list) {
  return mState.AdjustAndSend(mSpin->Text().toStdString(), steps, Binding(), list);
}

void QenParField::SetEnabledComplete(bool enabled) {
  mSpin->setEnabled(enabled);
  mUnitLabel->setEnabled(enabled);
}

void QenParField::SetIsEnabled(bool enabled) {
  mIsEnabled = enabled;
  // A field whose value may not be edited keeps its prefix and step changeable, from the
  // start as at run time.
  mSpin->setEnabled(enabled);
  mUnitLabel->setEnabled(true);
}

void QenParField::SetShowUnits(bool show) {
  mShowUnits = show;
  mUnitLabel->setVisible(show);
}

void QenParField::Commit(int steps) {
  ConditionList list;
  mSending = true;
  const int status = AdjustAndSend(steps, list);
  mSending = false;
  // A refused value gives way to the instrument's, and so does text that sent nothing (a
  // cleared field, a value already set).
  if (status != 0 && Binding().GetDs() != nullptr) {
    ConditionList ignored;
    Refresh(ignored);
  } else if (Binding().GetDs() != nullptr) {
    DisplayValue(mState.GetValue());
  }
  ShowNotice(QString::fromStdString(mState.GetNotice()));
  Report(list);
}

void QenParField::CommitOnFocusLoss() {
  if (!DsBinding::IsDesignMode()) Commit(0);
}

void QenParField::CommitOnKey() {
  if (!mSending) Commit(0);
}

void QenParField::GuardUntilFocusLoss() {
  if (!mSending && !DsBinding::IsDesignMode()) mSending = true;
}

bool QenParField::CanStep() const {
  return !mSpin->IsUpdating() && isActiveWindow() && !mState.IsNoValue() && mIsEnabled && !mSending;
}

void QenParField::Step(int steps) {
  if (CanStep()) Commit(steps);
}
