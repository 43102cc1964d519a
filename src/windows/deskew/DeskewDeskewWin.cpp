#include "windows/deskew/DeskewDeskewWin.h"

#include <QGridLayout>
#include <QLabel>
#include <QProgressBar>
#include <QPushButton>

#include "instrument/QenGuiInst.h"
#include "params/ui/BoundControl.h"
#include "params/ui/QenParEd.h"
#include "sequences/CPortInfo.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "windows/PlaceName.h"
#include "windows/TaskFollower.h"

DeskewDeskewWin::DeskewDeskewWin(QWidget* parent) : QWidget(parent) { setObjectName(QStringLiteral("DeskewDeskewWin")); }

DeskewDeskewWin::~DeskewDeskewWin() {
  ConditionList list;
  BoundControl::SetDsBaseNameAll(this, "", list);
}

int DeskewDeskewWin::Load(ConditionList& list) {
  if (int status = ResourceLibrary::LoadInto("deskew.DeskewWin", this, list)) return status;
  auto* area = findChild<QWidget*>(QStringLiteral("PortArea"));
  auto* bar = findChild<QProgressBar*>(QStringLiteral("BarProgress"));
  auto* start = findChild<QPushButton*>(QStringLiteral("PButStart"));
  auto* cancel = findChild<QPushButton*>(QStringLiteral("PButCancel"));
  mState = findChild<QLabel*>(QStringLiteral("LabelState"));
  if (area == nullptr || qobject_cast<QGridLayout*>(area->layout()) == nullptr || bar == nullptr || start == nullptr ||
      cancel == nullptr || mState == nullptr) {
    list.Add(1, "The window resource \"deskew.DeskewWin\" lacks its port grid, progress bar or buttons.");
    return 1;
  }
  TaskFollower::Hooks hooks;
  hooks.running = [this](const InstrumentTask::Progress& p) {
    mState->setText(QStringLiteral("Measuring port %1 of %2…").arg(p.done + 1).arg(p.total));
  };
  hooks.ended = [this](const InstrumentTask::Progress& p) {
    mState->setText(p.state == InstrumentTask::State::Aborted
                        ? QStringLiteral("Cancelled; the delays are as they were before.")
                        : QStringLiteral("All %1 ports deskewed.").arg(p.total));
  };
  hooks.say = [this](const QString& text) { mState->setText(text); };
  mFollower = new TaskFollower(InstrumentTask(":SYST:DESK"), bar, start, cancel, hooks, this);
  const int status = AddPortFields(area, list);
  mFollower->Resume();
  return status;
}

// A row per data port, in configuration order: its name and its delay.
int DeskewDeskewWin::AddPortFields(QWidget* area, ConditionList& list) {
  auto* grid = static_cast<QGridLayout*>(area->layout());
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

QString DeskewDeskewWin::StateText() const { return mState->text(); }
