#include "windows/bconnect/BconnectConnectWin.h"

#include <QFileDialog>
#include <QGraphicsScene>
#include <QLabel>
#include <QLayout>
#include <QPushButton>
#include <functional>

#include "core/uiapp.h"
#include "data/DirtyFlagDs.h"
#include "data/GuiLockDs.h"
#include "data/QenDsView.h"
#include "params/ui/BoundControl.h"
#include "sequences/CFrontendInfo.h"
#include "sequences/CPortInfo.h"
#include "sequences/ui/SchemeView.h"
#include "support/FWBlocker.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "ui_bconnect.ConnectWin.h"

namespace {

const QString kHint = QStringLiteral(
    "Drag from a generator port to an analyser port to connect them; select a line and press Delete to "
    "remove it.");
const QString kLocked = QStringLiteral(
    "Read-only: another client holds the instrument. The scheme shows the connections as last read.");

bool IsLocked() {
  return uiapp::GetGuiLockDs() != nullptr && uiapp::GetGuiLockDs()->IsLocked();
}

QString PortName(const Dstring& path) {
  return QString::fromStdString(path).mid(1).replace(QLatin1Char(':'), QLatin1Char(' '));
}

}  // namespace

class BconnectConnectWin::LockView : public QenDsView {
 public:
  explicit LockView(BconnectConnectWin& win) : mWin(win) {}
  int NfyViewDataUpdated(QenDs*, ConditionList&) override {
    mWin.ShowLock();
    return 0;
  }

 private:
  BconnectConnectWin& mWin;
};

BconnectConnectWin::BconnectConnectWin(QWidget* parent)
    : QWidget(parent), mLockView(std::make_unique<LockView>(*this)), mUi(std::make_unique<Ui::BconnectConnectWin>()) {
  setObjectName(QStringLiteral("BconnectConnectWin"));
}

BconnectConnectWin::~BconnectConnectWin() {
  // The view and its scene die after this window's part of the object: no more news from them.
  if (mView != nullptr) mView->scene()->disconnect(this);
  ConditionList list;
  if (mRegistered && uiapp::GetDirtyFlagDs() != nullptr)
    uiapp::GetDirtyFlagDs()->UnregisterProc(&DirtyFlagProc, &DirtyFlagMatch, this);
  if (uiapp::GetGuiLockDs() != nullptr) uiapp::GetGuiLockDs()->UnregisterView(mLockView.get(), list);
}

int BconnectConnectWin::Load(ConditionList& list) {
  mUi->setupUi(this);
  ResourceLibrary::InitWidgets(this);
  auto* area = mUi->SchemeArea;
  mState = mUi->LabelState;
  mSummary = mUi->LabelSummary;
  mView = new SchemeView(area);
  area->layout()->addWidget(mView);
  setFocusProxy(mView);
  const std::pair<QPushButton*, std::function<void()>> buttons[] = {
      {mUi->PButZoomIn, [this] { mView->ZoomBy(1.25); }},
      {mUi->PButZoomOut, [this] { mView->ZoomBy(1 / 1.25); }},
      {mUi->PButFit, [this] { mView->Fit(); }},
      {mUi->PButExportPng, [this] { HitPButExport(false); }},
      {mUi->PButExportSvg, [this] { HitPButExport(true); }},
  };
  for (const auto& [button, hit] : buttons) connect(button, &QPushButton::clicked, this, hit);
  connect(mView, &SchemeView::ConnectRequested, this,
          [this](const QString& generator, const QString& analyser) {
            ConditionList l;
            Connect(generator.toStdString(), analyser.toStdString(), l);
            BoundControl::Report(l);
          });
  connect(mView, &SchemeView::RemoveRequested, this,
          [this](const QString& generator, const QString& analyser) {
            ConditionList l;
            Disconnect(generator.toStdString(), analyser.toStdString(), l);
            BoundControl::Report(l);
          });
  connect(mView->scene(), &QGraphicsScene::selectionChanged, this, &BconnectConnectWin::ShowSelection);
  if (DirtyFlagDs* dirty = uiapp::GetDirtyFlagDs()) {
    dirty->RegisterProc(&DirtyFlagProc, &DirtyFlagMatch, this);
    mRegistered = true;
  }
  if (uiapp::GetGuiLockDs() != nullptr) uiapp::GetGuiLockDs()->RegisterView(mLockView.get(), list);
  const int status = Refresh(list);
  ShowLock();
  return status == FWBlocker::kLocked ? 0 : status;
}

int BconnectConnectWin::Refresh(ConditionList& list) {
  int status = CFrontendInfo::Update(list);
  if (status == 0) status = mConnections.Read(list);
  Draw();
  if (status != 0 && status != FWBlocker::kLocked)
    Say(QStringLiteral("The scheme could not be read; see the error list."));
  return status;
}

void BconnectConnectWin::Draw() {
  mView->SetScheme(CFrontendInfo::GetGroups(), mConnections.Get());
  int analysers = 0;
  for (const CFrontendInfo::Group& g : CFrontendInfo::GetGroups()) {
    for (const CFrontendInfo::Module& m : g.modules) {
      for (const CFrontendInfo::Port& p : m.ports) analysers += !m.generator && p.portClass == "PDAT";
    }
  }
  mSummary->setText(
      analysers == 0
          ? QStringLiteral("No analyser ports.")
          : QStringLiteral("%1 of %2 analyser ports driven").arg(mConnections.Get().size()).arg(analysers));
}

template <class Edit>
int BconnectConnectWin::RunEdit(const char* guard, const QString& done, Edit edit, ConditionList& list) {
  FWBlocker blocker(guard, list);
  if (int status = blocker.Block()) {
    ShowLock();
    return status;
  }
  const int status = edit();
  Draw();
  if (status == FWBlocker::kLocked) {
    ShowLock();
  } else if (status != 0 && !list.IsEmpty()) {
    Say(QStringLiteral("Refused: %1").arg(QString::fromStdString(list.Last().GetMessage())));
  } else {
    Say(status == 0 ? done : QStringLiteral("Refused; see the error list."));
  }
  return status;
}

int BconnectConnectWin::Connect(const Dstring& generator, const Dstring& analyser, ConditionList& list) {
  return RunEdit(
      "BconnectConnectWin::Connect",
      QStringLiteral("Connected %1 to %2.").arg(PortName(generator), PortName(analyser)),
      [&] { return mConnections.Add(generator, analyser, list); }, list);
}

int BconnectConnectWin::Disconnect(const Dstring& generator, const Dstring& analyser, ConditionList& list) {
  return RunEdit(
      "BconnectConnectWin::Disconnect",
      QStringLiteral("Removed the connection %1 to %2.").arg(PortName(generator), PortName(analyser)),
      [&] { return mConnections.Remove(generator, analyser, list); }, list);
}

void BconnectConnectWin::ShowLock() {
  mView->SetReadOnly(IsLocked());
  ShowSelection();
}

void BconnectConnectWin::ShowSelection() {
  CPortConnections::Connection selected;
  if (IsLocked()) {
    Say(kLocked);
  } else if (mView->SelectedConnection(selected)) {
    Say(QStringLiteral("Selected: %1 drives %2. Delete removes the connection.")
            .arg(PortName(selected.generator), PortName(selected.analyser)));
  } else {
    Say(kHint);
  }
}

void BconnectConnectWin::Say(const QString& text) {
  mState->setText(text);
}
QString BconnectConnectWin::StateText() const {
  return mState->text();
}
QString BconnectConnectWin::SummaryText() const {
  return mSummary->text();
}

int BconnectConnectWin::ExportPng(const Dstring& path, ConditionList& list) {
  return mView->ExportPng(path, list);
}
int BconnectConnectWin::ExportSvg(const Dstring& path, ConditionList& list) {
  return mView->ExportSvg(path, list);
}

void BconnectConnectWin::HitPButExport(bool svg) {
  const QString path = QFileDialog::getSaveFileName(
      this, svg ? QStringLiteral("Export SVG") : QStringLiteral("Export PNG"),
      svg ? QStringLiteral("scheme.svg") : QStringLiteral("scheme.png"),
      svg ? QStringLiteral("Scalable Vector Graphics (*.svg)") : QStringLiteral("PNG image (*.png)"));
  if (path.isEmpty()) return;
  ConditionList list;
  const int status = svg ? ExportSvg(path.toStdString(), list) : ExportPng(path.toStdString(), list);
  if (status == 0) Say(QStringLiteral("Exported to %1.").arg(path));
  BoundControl::Report(list);
}

int BconnectConnectWin::DirtyFlagProc(QenDs*, void* client, ConditionList& list) {
  auto* win = static_cast<BconnectConnectWin*>(client);
  const int status = win->Refresh(list);
  return status == FWBlocker::kLocked ? 0 : status;
}

int BconnectConnectWin::DirtyFlagMatch(QenDs*, void*, const Dstring& name) {
  return CPortConnections::NfyMatchDirtyFlag(name) || CPortInfo::NfyMatchDirtyFlag(name) ? 1 : 0;
}
