#include "windows/deskew/DeskewDeskewWin.h"

#include "instrument/QenGuiInst.h"
#include "params/ui/BoundControl.h"
#include "params/ui/QenParEd.h"
#include "sequences/CPortInfo.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "ui_deskew.DeskewWin.h"
#include "windows/PlaceName.h"
#include "windows/TaskFollower.h"

DeskewDeskewWin::DeskewDeskewWin(QWidget* parent) : QWidget(parent), mUi(std::make_unique<Ui::DeskewWin>()) {
  setObjectName(QStringLiteral("DeskewDeskewWin"));
}

DeskewDeskewWin::~DeskewDeskewWin() {
  ConditionList list;
  BoundControl::SetDsBaseNameAll(this, "", list);
}

int DeskewDeskewWin::Load(ConditionList& list) {
  mUi->setupUi(this);
  ResourceLibrary::InitWidgets(this);
  TaskFollower::Hooks hooks;
  hooks.running = [this](const InstrumentTask::Progress& p) {
    mUi->LabelState->setText(QStringLiteral("Measuring port %1 of %2…").arg(p.done + 1).arg(p.total));
  };
  hooks.ended = [this](const InstrumentTask::Progress& p) {
    mUi->LabelState->setText(p.state == InstrumentTask::State::Aborted
                                 ? QStringLiteral("Cancelled; the delays are as they were before.")
                                 : QStringLiteral("All %1 ports deskewed.").arg(p.total));
  };
  hooks.say = [this](const QString& text) { mUi->LabelState->setText(text); };
  mFollower = new TaskFollower(InstrumentTask(":SYST:DESK"), mUi->BarProgress, mUi->PButStart,
                               mUi->PButCancel, hooks, this);
  const int status = AddPortFields(list);
  mFollower->Resume();
  return status;
}

// A row per data port, in configuration order: its name and its delay.
int DeskewDeskewWin::AddPortFields(ConditionList& list) {
  QWidget* area = mUi->PortArea;
  QGridLayout* grid = mUi->PortGrid;
  if (!CPortInfo::IsKnown()) CPortInfo::Update(list);
  int row = 0;
  for (const CPortInfo::Port& port : CPortInfo::GetPorts()) {
    if (port.portClass != "PDAT") continue;
    auto* label = new QLabel(PlaceName(port.path), area);
    auto* field = new QenParEd(area);
    field->setObjectName(QStringLiteral("FieldDelay%1").arg(row + 1));
    field->SetDsCmdNameProperty(QString::fromStdString(port.path + ":PULS:DEL"));
    field->NfyInit();
    label->setBuddy(field);
    grid->addWidget(label, row, 0);
    grid->addWidget(field, row, 1);
    ++row;
  }
  grid->setRowStretch(row, 1);
  return BoundControl::SetDsBaseNameAll(area, ":" + QenGuiInst::GetAppHandle(), list);
}

QString DeskewDeskewWin::StateText() const {
  return mUi->LabelState->text();
}
