#include "windows/errstate/ErrstateErrStateWin.h"

#include <QLabel>
#include <QPushButton>

#include "core/uiapp.h"
#include "data/BerSvr.h"
#include "data/QenDsView.h"
#include "data/RunStopDs.h"
#include "params/ui/BoundControl.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "windows/common/BerAtStop.h"
#include "windows/errstate/ErrStateGridManager.h"
#include "ui_errstate.ErrStateWin.h"

class ErrstateErrStateWin::View : public QenDsView {
 public:
  explicit View(ErrstateErrStateWin& win) : mWin(win) {}
  int NfyViewDataUpdated(QenDs* changed, ConditionList& list) override {
    mWin.ShowResults();
    ReadBerAtStop(changed, list);
    return 0;
  }

 private:
  ErrstateErrStateWin& mWin;
};

ErrstateErrStateWin::ErrstateErrStateWin(QWidget* parent) : QWidget(parent), mView(std::make_unique<View>(*this)), mUi(std::make_unique<Ui::ErrStateWin>()) {
  setObjectName(QStringLiteral("ErrstateErrStateWin"));
}

ErrstateErrStateWin::~ErrstateErrStateWin() {
  ConditionList list;
  if (BerSvr* svr = uiapp::GetBerSvr()) {
    if (mWantsChannels) svr->WantChannels(false);
    svr->UnregisterView(mView.get(), list);
  }
  if (uiapp::GetRunStopDs() != nullptr) uiapp::GetRunStopDs()->UnregisterView(mView.get(), list);
}

int ErrstateErrStateWin::Load(ConditionList& list) {
  mUi->setupUi(this);
  ResourceLibrary::InitWidgets(this);
  mGrid = mUi->GridErrState;
  mState = mUi->LabelState;
  mCursor = mUi->LabelCursor;
  // The keys move the grid's cursor as soon as the window is active.
  setFocusProxy(mGrid);
  connect(mGrid, &GridManager::StateChanged, this, &ErrstateErrStateWin::ShowCursor);
  connect(mUi->PButReset, &QPushButton::clicked, this, &ErrstateErrStateWin::HitPButReset);
  if (BerSvr* svr = uiapp::GetBerSvr()) {
    // The service is set up by the first window that shows it; one read shows the counts the
    // instrument holds now, running or not.
    if (!svr->IsInitialized()) svr->Init(list);
    svr->WantChannels(true);
    mWantsChannels = true;
    svr->RegisterView(mView.get(), list);
    svr->UpdateFromFW(BerSvr::kReadResults, list);
  }
  if (uiapp::GetRunStopDs() != nullptr) uiapp::GetRunStopDs()->RegisterView(mView.get(), list);
  ShowResults();
  return 0;
}

void ErrstateErrStateWin::ShowResults() {
  const BerSvr* svr = uiapp::GetBerSvr();
  const bool running = uiapp::GetRunStopDs() != nullptr && uiapp::GetRunStopDs()->IsRunning();
  if (svr == nullptr || svr->GetResults().empty()) {
    mState->setText(QStringLiteral("This configuration has no analyser ports."));
    mGrid->SetResults({});
    return;
  }
  mState->setText(running ? QStringLiteral("Running: the error state follows the instrument.")
                          : QStringLiteral("Stopped: the error state changes only while the instrument runs."));
  if (svr->GetResults() != mGrid->GetResults()) mGrid->SetResults(svr->GetResults());
}

void ErrstateErrStateWin::ShowCursor() { mCursor->setText(mGrid->CursorText()); }

void ErrstateErrStateWin::HitPButReset() {
  ConditionList list;
  if (uiapp::GetBerSvr() != nullptr) uiapp::GetBerSvr()->Reset(list);
  ShowResults();
  BoundControl::Report(list);
}
