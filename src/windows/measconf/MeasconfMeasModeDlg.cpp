#include "windows/measconf/MeasconfMeasModeDlg.h"

#include <QApplication>

#include "instrument/QenGuiInst.h"
#include "params/ui/BoundControl.h"
#include "params/ui/QenParField.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "ui_measconf.MeasMode.h"

MeasconfMeasModeDlg::MeasconfMeasModeDlg(QWidget* parent)
    : QWidget(parent), mUi(std::make_unique<Ui::MeasMode>()) {
  setObjectName(QStringLiteral("MeasconfMeasModeDlg"));
}

MeasconfMeasModeDlg::~MeasconfMeasModeDlg() {
  if (MeasconfMeasMode::GetEditor() == this) MeasconfMeasMode::SetEditor(nullptr);
  ConditionList list;
  BoundControl::SetDsBaseNameAll(this, "", list);
}

int MeasconfMeasModeDlg::Load(ConditionList& list) {
  mUi->setupUi(this);
  // The bound controls register with the engine once the form has set their attributes.
  ResourceLibrary::InitWidgets(this);
  connect(mUi->BoxMode, &QComboBox::currentIndexChanged, this, &MeasconfMeasModeDlg::ShowModeGroups);
  const int status = BoundControl::SetDsBaseNameAll(this, ":" + QenGuiInst::GetAppHandle(), list);
  ShowModeGroups();
  MeasconfMeasMode::SetEditor(this);
  return status;
}

// The items are in the order of the mode's words: PATT, CAPT, BER.
void MeasconfMeasModeDlg::ShowModeGroups() {
  mUi->GroupCapture->setEnabled(mUi->BoxMode->currentIndex() == 1);
  mUi->GroupGate->setEnabled(mUi->BoxMode->currentIndex() == 2);
}

int MeasconfMeasModeDlg::CommitPendingEdit(ConditionList& list) {
  for (QWidget* w = QApplication::focusWidget(); w != nullptr && w != this; w = w->parentWidget()) {
    if (auto* field = qobject_cast<QenParField*>(w); field != nullptr && isAncestorOf(field)) {
      return field->AdjustAndSend(0, list);
    }
  }
  return 0;
}
