#include "windows/measconf/MeasconfMeasModeDlg.h"

#include <QApplication>
#include <QComboBox>
#include <QGroupBox>

#include "instrument/QenGuiInst.h"
#include "params/ui/BoundControl.h"
#include "params/ui/QenParField.h"
#include "toolkit/qt/ResourceLibrary.h"

MeasconfMeasModeDlg::MeasconfMeasModeDlg(QWidget* parent) : QWidget(parent) {
  setObjectName(QStringLiteral("MeasconfMeasModeDlg"));
}

MeasconfMeasModeDlg::~MeasconfMeasModeDlg() {
  if (MeasconfMeasMode::GetEditor() == this) MeasconfMeasMode::SetEditor(nullptr);
  ConditionList list;
  BoundControl::SetDsBaseNameAll(this, "", list);
}

int MeasconfMeasModeDlg::Load(ConditionList& list) {
  if (int status = ResourceLibrary::LoadInto("measconf.MeasMode", this, list)) return status;
  mMode = findChild<QComboBox*>(QStringLiteral("BoxMode"));
  mGate = findChild<QGroupBox*>(QStringLiteral("GroupGate"));
  mCapture = findChild<QGroupBox*>(QStringLiteral("GroupCapture"));
  if (mMode == nullptr || mGate == nullptr || mCapture == nullptr) {
    list.Add(1, "The window resource \"measconf.MeasMode\" lacks its mode, gate or capture group.");
    return 1;
  }
  connect(mMode, &QComboBox::currentIndexChanged, this, &MeasconfMeasModeDlg::ShowModeGroups);
  const int status = BoundControl::SetDsBaseNameAll(this, ":" + QenGuiInst::GetAppHandle(), list);
  ShowModeGroups();
  MeasconfMeasMode::SetEditor(this);
  return status;
}

// The items are in the order of the mode's words: PATT, CAPT, BER.
void MeasconfMeasModeDlg::ShowModeGroups() {
  mCapture->setEnabled(mMode->currentIndex() == 1);
  mGate->setEnabled(mMode->currentIndex() == 2);
}

int MeasconfMeasModeDlg::CommitPendingEdit(ConditionList& list) {
  for (QWidget* w = QApplication::focusWidget(); w != nullptr && w != this; w = w->parentWidget()) {
    if (auto* field = qobject_cast<QenParField*>(w); field != nullptr && isAncestorOf(field)) {
      return field->AdjustAndSend(0, list);
    }
  }
  return 0;
}
