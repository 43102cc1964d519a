#include "windows/MainWin.h"

#include <QApplication>
#include <QCloseEvent>
#include <QInputDialog>
#include <QLabel>
#include <QIcon>
#include <QMdiArea>
#include <QPixmap>
#include <QMdiSubWindow>
#include <QMenuBar>
#include <QMessageBox>
#include <QToolBar>
#include <QVBoxLayout>

#include "core/SelfTest.h"
#include "core/uiapp.h"
#include "data/GuiLockDs.h"
#include "data/QenDsView.h"
#include "data/RunStopDs.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "settings/SettingFile.h"
#include "support/ConditionList.h"
#include "toolkit/WaitCursor.h"
#include "windows/LockAware.h"
#include "windows/RefusalText.h"
#include "windows/StateStatusBar.h"
#include "windows/WindowFactory.h"
#include "windows/selftest/SelftestResultWin.h"

namespace {

constexpr const char* kResourceProperty = "qenResource";

void Show(ConditionList& list) {
  if (!list.IsEmpty()) QenGuiInst::ShowErrorDlg(list, 1);
}

}  // namespace

// The lock and the run state decide which commands can work.
class MainWin::StateView : public QenDsView {
 public:
  explicit StateView(MainWin& window) : mWindow(window) {}
  int NfyViewDataUpdated(QenDs* changed, ConditionList&) override {
    if (changed == uiapp::GetGuiLockDs()) {
      mWindow.ShowLock(uiapp::GetGuiLockDs()->IsLocked());
    } else {
      mWindow.UpdateCommands();
    }
    return 0;
  }

 private:
  MainWin& mWindow;
};

MainWin::MainWin(QWidget* parent)
    : QMainWindow(parent), mArea(new QMdiArea), mBanner(new QLabel), mStatus(new StateStatusBar) {
  setObjectName(QStringLiteral("MainWin"));
  auto* central = new QWidget;
  auto* layout = new QVBoxLayout(central);
  layout->setContentsMargins(0, 0, 0, 0);
  layout->setSpacing(0);
  mBanner->setObjectName(QStringLiteral("LockBanner"));
  mBanner->setText(QStringLiteral(
      "Another client holds the instrument: what would change it is off until it lets go; what only reads still works."));
  mBanner->setStyleSheet(QStringLiteral("background: #fff3c4; color: #5c4400; padding: 6px; border-bottom: 1px solid #e0c060"));
  mBanner->hide();
  layout->addWidget(mBanner);
  mArea->setViewMode(QMdiArea::SubWindowView);
  mArea->setBackground(QColor(0x5a, 0x63, 0x70));
  layout->addWidget(mArea, 1);
  setCentralWidget(central);
  setStatusBar(mStatus);
  BuildMenus();
  resize(1280, 800);
  UpdateTitle();
}

// uiapp::DoSelfTest opens the self test window and starts the test there.
class MainWin::SelfTestTool : public SelfTest::Tool {
 public:
  explicit SelfTestTool(MainWin& win) : mWin(win) {}
  int Run(ConditionList& list) override {
    auto* window = qobject_cast<SelftestResultWin*>(mWin.OpenWindow(QStringLiteral("selftest.Result")));
    return window != nullptr ? window->StartTest(list) : 1;
  }

 private:
  MainWin& mWin;
};

MainWin::~MainWin() {
  if (SelfTest::GetTool() == mSelfTestTool.get()) SelfTest::SetTool(nullptr);
  if (mStateView) RefusalText::Uninstall();
  ConditionList list;
  if (mStateView && uiapp::GetGuiLockDs() != nullptr) uiapp::GetGuiLockDs()->UnregisterView(mStateView.get(), list);
  if (mStateView && uiapp::GetRunStopDs() != nullptr) uiapp::GetRunStopDs()->UnregisterView(mStateView.get(), list);
}

void MainWin::Attach() {
  mStatus->Attach();
  RefusalText::Install();
  mSelfTestTool = std::make_unique<SelfTestTool>(*this);
  SelfTest::SetTool(mSelfTestTool.get());
  mStateView = std::make_unique<StateView>(*this);
  ConditionList list;
  uiapp::GetGuiLockDs()->RegisterView(mStateView.get(), list);
  uiapp::GetRunStopDs()->RegisterView(mStateView.get(), list);
  ShowLock(uiapp::GetGuiLockDs()->IsLocked());
  UpdateTitle();
}

void MainWin::BuildMenus() {
  BuildFileMenu();
  BuildInstrumentMenu();
  BuildWindowsMenu();
  QMenu* help = menuBar()->addMenu(QStringLiteral("&Help"));
  help->addAction(QStringLiteral("&About qengui"), this, &MainWin::HitAbout);
}

void MainWin::BuildFileMenu() {
  QMenu* file = menuBar()->addMenu(QStringLiteral("&File"));
  mInstrumentCommands << file->addAction(QStringLiteral("&New Setting"), QKeySequence::New, this, &MainWin::HitNewSetting);
  mInstrumentCommands << file->addAction(QStringLiteral("&Open Setting..."), QKeySequence::Open, this, &MainWin::HitOpenSetting);
  mRecent = file->addMenu(QStringLiteral("Recent &Settings"));
  mInstrumentCommands << mRecent->menuAction();
  connect(mRecent, &QMenu::aboutToShow, this, &MainWin::FillRecentMenu);
  mInstrumentCommands << file->addAction(QStringLiteral("&Save Setting"), QKeySequence::Save, this, &MainWin::HitSaveSetting);
  mInstrumentCommands << file->addAction(QStringLiteral("Save Setting &As..."), QKeySequence::SaveAs, this, &MainWin::HitSaveSettingAs);
  file->addSeparator();
  file->addAction(QStringLiteral("&Quit"), QKeySequence::Quit, this, &QWidget::close);
}

void MainWin::BuildInstrumentMenu() {
  QMenu* menu = menuBar()->addMenu(QStringLiteral("&Instrument"));
  QToolBar* bar = addToolBar(QStringLiteral("Run"));
  bar->setObjectName(QStringLiteral("RunToolBar"));
  bar->setToolButtonStyle(Qt::ToolButtonTextBesideIcon);
  auto add = [&](const QString& text, QKeySequence key, int (*action)(ConditionList&), bool onBar) {
    QAction* a = menu->addAction(text, this, [this, action] { RunAction(action); });
    a->setShortcut(key);
    if (onBar) bar->addAction(a);
    mInstrumentCommands << a;
    return a;
  };
  add(QStringLiteral("\u25B6 &Run"), QKeySequence(Qt::Key_F5), &uiapp::Run, true);
  add(QStringLiteral("\u25A0 S&top"), QKeySequence(Qt::SHIFT | Qt::Key_F5), &uiapp::Stop, true);
  add(QStringLiteral("Sequence &Force"), QKeySequence(Qt::Key_F6), &uiapp::SequenceForce, true);
  menu->addSeparator();
  add(QStringLiteral("Outputs &On"), QKeySequence(), &uiapp::Connect, false);
  add(QStringLiteral("Outputs O&ff"), QKeySequence(), &uiapp::Disconnect, false);
  menu->addSeparator();
  add(QStringLiteral("Check &Trigger Mode"), QKeySequence(), &uiapp::CheckTriggerMode, false);
  mSelfTest = add(QStringLiteral("Self &Test..."), QKeySequence(), &uiapp::DoSelfTest, false);
}

void MainWin::BuildWindowsMenu() {
  QMenu* menu = menuBar()->addMenu(QStringLiteral("&Windows"));
  int index = 1;
  for (const WindowFactory::Entry& entry : WindowFactory::Entries()) {
    const QString resource = QString::fromStdString(entry.resource);
    QAction* action = menu->addAction(QString::fromStdString(entry.title), this, [this, resource] { OpenWindow(resource); });
    if (index <= 9) action->setShortcut(QKeySequence(Qt::CTRL | (Qt::Key_0 + index)));
    if (entry.needsInstrument) mReadingWindows.append({action, resource});
    ++index;
  }
  menu->addSeparator();
  menu->addAction(QStringLiteral("&Cascade"), mArea, &QMdiArea::cascadeSubWindows);
  menu->addAction(QStringLiteral("&Tile"), mArea, &QMdiArea::tileSubWindows);
}

QList<QAction*> MainWin::Commands() const {
  QList<QAction*> commands;
  for (QAction* top : menuBar()->actions()) {
    for (QAction* action : top->menu()->actions()) {
      if (!action->isSeparator()) commands << action;
    }
  }
  for (auto* bar : findChildren<QToolBar*>()) {
    for (QAction* action : bar->actions()) {
      if (!commands.contains(action)) commands << action;
    }
  }
  return commands;
}

void MainWin::UpdateCommands() {
  const bool locked = IsShowingLock();
  for (QAction* action : mInstrumentCommands) action->setEnabled(!locked);
  // A window that is open only needs raising.
  for (const auto& [action, resource] : mReadingWindows) action->setEnabled(!locked || FindWindow(resource) != nullptr);
  const RunStopDs* run = uiapp::GetRunStopDs();
  const bool running = run != nullptr && run->IsRunning();
  mSelfTest->setEnabled(!locked && !running);
  mSelfTest->setStatusTip(running ? QStringLiteral("The self test cannot start while the instrument runs.") : QString());
}

void MainWin::FillRecentMenu() {
  mRecent->clear();
  for (const Dstring& name : uiapp::GetSettingMRU().GetNames()) {
    const QString text = QString::fromStdString(name);
    mRecent->addAction(text, this, [this, name] {
      ConditionList list;
      WaitCursor wait;
      SettingFile::Open(name, false, uiapp::GetSettingMRU(), list);
      Show(list);
      UpdateTitle();
    });
  }
  if (mRecent->isEmpty()) mRecent->addAction(QStringLiteral("(none)"))->setEnabled(false);
}

QWidget* MainWin::FindWindow(const QString& resource) const {
  for (QMdiSubWindow* sub : mArea->subWindowList()) {
    if (sub->property(kResourceProperty).toString() == resource) return sub->widget();
  }
  return nullptr;
}

QWidget* MainWin::OpenWindow(const QString& resource) {
  if (QWidget* open = FindWindow(resource)) {
    mArea->setActiveSubWindow(qobject_cast<QMdiSubWindow*>(open->parentWidget()));
    open->parentWidget()->raise();
    open->setFocus();
    return open;
  }
  const WindowFactory::Entry* entry = WindowFactory::Find(resource.toStdString());
  ConditionList list;
  QWidget* window = nullptr;
  if (entry == nullptr) {
    list.Add(1, "There is no window \"" + resource.toStdString() + "\" in this program.");
  } else {
    WaitCursor wait;
    window = entry->make(nullptr, list);
  }
  if (window == nullptr) {
    // Refused by the lock, a window's reads add no condition: say why it did not open.
    if (list.IsEmpty() && uiapp::GetGuiLockDs()->IsLocked()) {
      list.Add(QenStatus::kLocked, "The window \"" + entry->title + "\" reads the instrument to open; another client holds it now.");
    }
    Show(list);
    return nullptr;
  }
  Adopt(window, resource, QString::fromStdString(entry->title));
  Show(list);
  return window;
}

QMdiSubWindow* MainWin::Adopt(QWidget* window, const QString& resource, const QString& title) {
  window->setAttribute(Qt::WA_DeleteOnClose);
  QMdiSubWindow* sub = mArea->addSubWindow(window);
  sub->setProperty(kResourceProperty, resource);
  sub->setWindowTitle(title);
  sub->setWindowIcon(QIcon(QPixmap(1, 1)));
  sub->resize(window->sizeHint().expandedTo(window->size()));
  ShowLockIn(window, IsShowingLock());
  // Queued: the window is gone from the area's list by then.
  connect(sub, &QObject::destroyed, this, &MainWin::UpdateCommands, Qt::QueuedConnection);
  sub->show();
  window->setFocus();
  UpdateCommands();
  return sub;
}

bool MainWin::IsShowingLock() const { return mBanner->isVisibleTo(this); }

void MainWin::ShowLock(bool locked) {
  mBanner->setVisible(locked);
  for (QMdiSubWindow* sub : mArea->subWindowList()) ShowLockIn(sub->widget(), locked);
  UpdateCommands();
}

void MainWin::ShowLockIn(QWidget* window, bool locked) {
  if (auto* aware = dynamic_cast<LockAware*>(window)) {
    aware->ShowLock(locked);
  } else {
    window->setEnabled(!locked);
  }
}

void MainWin::RunAction(int (*action)(ConditionList&)) {
  ConditionList list;
  {
    WaitCursor wait;
    action(list);
  }
  Show(list);
}

void MainWin::HitNewSetting() {
  ConditionList list;
  SettingFile::New(list);
  Show(list);
  UpdateTitle();
}

void MainWin::HitOpenSetting() {
  ConditionList list;
  DstringList names;
  if (SettingFile::Catalogue(names, list) != 0) return Show(list);
  QStringList items;
  for (const Dstring& name : names) items << QString::fromStdString(name);
  if (items.isEmpty()) {
    QMessageBox::information(this, windowTitle(), QStringLiteral("The instrument keeps no saved settings yet."));
    return;
  }
  bool ok = false;
  const QString name = QInputDialog::getItem(this, QStringLiteral("Open Setting"), QStringLiteral("Setting:"), items, 0,
                                             false, &ok);
  if (!ok) return;
  WaitCursor wait;
  SettingFile::Open(name.toStdString(), false, uiapp::GetSettingMRU(), list);
  Show(list);
  UpdateTitle();
}

void MainWin::HitSaveSetting() {
  const Dstring current = SettingFile::CurrentName();
  if (current.empty()) return HitSaveSettingAs();
  ConditionList list;
  SettingFile::Save(current, uiapp::GetSettingMRU(), list);
  Show(list);
}

void MainWin::HitSaveSettingAs() {
  bool ok = false;
  const QString name = QInputDialog::getText(this, QStringLiteral("Save Setting As"), QStringLiteral("Name:"),
                                             QLineEdit::Normal, QString::fromStdString(SettingFile::CurrentName()), &ok);
  if (!ok) return;
  ConditionList list;
  SettingFile::Save(name.toStdString(), uiapp::GetSettingMRU(), list);
  Show(list);
  UpdateTitle();
}

void MainWin::HitAbout() {
  Dstring identity;
  ConditionList list;
  QenGuiInst::Call(":" + QenGuiInst::GetAppHandle() + ":SYST:VERS?", identity, list);
  QMessageBox::about(this, QStringLiteral("About qengui"),
                     QStringLiteral("<b>qengui %1</b><br>Corvane 71300 user interface<br>Qt %2<br><br>Server: %3")
                         .arg(QStringLiteral(QENGUI_VERSION), QLatin1String(qVersion()),
                              identity.empty() ? QStringLiteral("(not known)") : QString::fromStdString(identity)));
}

void MainWin::UpdateTitle() {
  const Dstring setting = SettingFile::CurrentName();
  setWindowTitle(QStringLiteral("%1 - Corvane 71300").arg(setting.empty() ? QStringLiteral("UNTITLED") : QString::fromStdString(setting)));
}

// Every window is asked first: one with unsaved work may keep the program open.
void MainWin::closeEvent(QCloseEvent* event) {
  mArea->closeAllSubWindows();
  if (!mArea->subWindowList().isEmpty()) return event->ignore();
  uiapp::MainLoopExit();
  QMainWindow::closeEvent(event);
}
