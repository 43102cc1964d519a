#include "windows/MainWin.h"

#include <QApplication>
#include <QCloseEvent>
#include <QInputDialog>
#include <QLabel>
#include <QIcon>
#include <QMdiArea>
#include <QPixmap>
#include <QPointer>
#include <QMdiSubWindow>
#include <QMenuBar>
#include <QMessageBox>
#include <QToolBar>
#include <QVBoxLayout>
#include <utility>
#include <vector>

#include "core/SelfTest.h"
#include "core/uiapp.h"
#include "data/GuiLockDs.h"
#include "data/QenDsView.h"
#include "data/RunStopDs.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "settings/OpenSettingDs.h"
#include "settings/SettingFile.h"
#include "settings/SettingTransfer.h"
#include "settings/StartUpConfig.h"
#include "support/ConditionList.h"
#include "toolkit/Toolkit.h"
#include "toolkit/WaitCursor.h"
#include "toolkit/qt/HelpKey.h"
#include "toolkit/qt/HelpWindow.h"
#include "toolkit/qt/StatusNotice.h"
#include "windows/common/FileChoice.h"
#include "windows/InstrumentWaitView.h"
#include "windows/common/LockAware.h"
#include "windows/RefusalText.h"
#include "windows/SequenceWindows.h"
#include "windows/StateStatusBar.h"
#include "windows/WindowFactory.h"
#include "windows/selftest/SelftestResultWin.h"

namespace {

constexpr const char* kResourceProperty = "qenResource";
// Long enough to read a sentence after the commit that caused it.
constexpr int kNoticeMs = 15000;
const QString kSettingFilter = QStringLiteral("Setting text (*.qset);;All files (*)");
// How long the status bar says what a file command did.
constexpr int kMessageMs = 8000;

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

namespace {

// Windows whose close waits for a reply; a window freed meanwhile drops out by itself.
std::vector<QPointer<QWidget>>& HeldCloses() {
  static std::vector<QPointer<QWidget>> held;
  return held;
}

}  // namespace

MainWin::MainWin(QWidget* parent)
    : QMainWindow(parent),
      mArea(new QMdiArea),
      mBanner(new QLabel),
      mStatus(new StateStatusBar),
      mWait(new InstrumentWaitView(mStatus)) {
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
  layout->addWidget(mWait);
  connect(mWait, &InstrumentWaitView::Abandoned, this, &MainWin::NfyWaitAbandoned, Qt::QueuedConnection);
  mArea->setViewMode(QMdiArea::SubWindowView);
  // Windows larger than the area scroll: without the bars the area would ask for their size,
  // and Tile would grow the frame past the screen to give it.
  mArea->setHorizontalScrollBarPolicy(Qt::ScrollBarAsNeeded);
  mArea->setVerticalScrollBarPolicy(Qt::ScrollBarAsNeeded);
  connect(mArea, &QMdiArea::subWindowActivated, this, &MainWin::FollowActiveWindow);
  mArea->setBackground(QColor(0x5a, 0x63, 0x70));
  layout->addWidget(mArea, 1);
  setCentralWidget(central);
  setStatusBar(mStatus);
  StatusNotice::Install([this](const QString& text) { mStatus->showMessage(text, kNoticeMs); });
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
  QenGuiInst::SetCallWaiter(nullptr);
  // The area tells of its windows going while the frame's part of the object is already gone.
  disconnect(mArea, nullptr, this, nullptr);
  StatusNotice::Install({});
  if (SelfTest::GetTool() == mSelfTestTool.get()) SelfTest::SetTool(nullptr);
  if (mStateView) RefusalText::Uninstall();
  if (mStateView && uiapp::GetOpenSettingDs() != nullptr) {
    uiapp::GetOpenSettingDs()->UnregisterProc(&MainWin::NfyOpenSetting, this);
  }
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
  uiapp::GetOpenSettingDs()->RegisterProc(&MainWin::NfyOpenSetting, this);
  ShowLock(uiapp::GetGuiLockDs()->IsLocked());
  UpdateTitle();
  QenGuiInst::SetCallWaiter(mWait);
}

void MainWin::NfyWaitAbandoned() {
  mEndedToReconnect = true;
  close();
}

void MainWin::BuildMenus() {
  BuildFileMenu();
  BuildInstrumentMenu();
  BuildWindowsMenu();
  QMenu* help = menuBar()->addMenu(QStringLiteral("&Help"));
  help->addAction(QStringLiteral("&User Guide"), this, [this] { HelpWindow::Show("index", this); });
  help->addAction(QStringLiteral("&Keyboard Shortcuts"), this, [this] { HelpWindow::Show("keyboard", this); });
  help->addSeparator();
  help->addAction(QStringLiteral("&About qengui"), this, &MainWin::HitAbout);
  HelpKey::Install();
}

void MainWin::BuildFileMenu() {
  QMenu* file = menuBar()->addMenu(QStringLiteral("&File"));
  mInstrumentCommands << file->addAction(QStringLiteral("&New Setting"), QKeySequence::New, this, &MainWin::HitNewSetting);
  mInstrumentCommands << file->addAction(QStringLiteral("&Open Setting..."), QKeySequence::Open, this, &MainWin::HitOpenSetting);
  mRecent = file->addMenu(QStringLiteral("Recent &Settings"));
  mInstrumentCommands << mRecent->menuAction();
  connect(mRecent, &QMenu::aboutToShow, this, &MainWin::FillRecentMenu);
  mSaveSetting = file->addAction(QStringLiteral("&Save Setting"), QKeySequence::Save, this, &MainWin::HitSaveSetting);
  mInstrumentCommands << mSaveSetting;
  mInstrumentCommands << file->addAction(QStringLiteral("Save Setting &As..."), QKeySequence::SaveAs, this, &MainWin::HitSaveSettingAs);
  file->addSeparator();
  mInstrumentCommands << file->addAction(QStringLiteral("&Export Setting..."), this, &MainWin::HitExportSetting);
  mInstrumentCommands << file->addAction(QStringLiteral("&Import Setting..."), this, &MainWin::HitImportSetting);
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
  for (const WindowResource& entry : uiapp::WindowResources()) {
    if (!entry.onMenu) continue;
    const QString resource = QString::fromStdString(entry.resource);
    QAction* action = menu->addAction(QString::fromStdString(entry.title), this, [this, resource] { OpenWindow(resource); });
    if (index <= 9) action->setShortcut(QKeySequence(Qt::CTRL | (Qt::Key_0 + index)));
    if (entry.needsInstrument) mReadingWindows.append({action, resource});
    ++index;
  }
  menu->addSeparator();
  QAction* next = menu->addAction(QStringLiteral("&Next Window"), mArea, &QMdiArea::activateNextSubWindow);
  next->setShortcut(QKeySequence(Qt::CTRL | Qt::Key_Tab));
  QAction* previous = menu->addAction(QStringLiteral("&Previous Window"), mArea, &QMdiArea::activatePreviousSubWindow);
  previous->setShortcut(QKeySequence(Qt::CTRL | Qt::SHIFT | Qt::Key_Backtab));
  menu->addAction(QStringLiteral("&Cascade"), mArea, &QMdiArea::cascadeSubWindows);
  menu->addAction(QStringLiteral("&Tile"), mArea, &QMdiArea::tileSubWindows);
  mOpenWindows = menu->addSeparator();
  connect(menu, &QMenu::aboutToShow, this, [this, menu] { ListOpenWindows(menu); });
}

// The open windows under the commands, by their titles (a segment editor's names its segment),
// the active one checked.
void MainWin::ListOpenWindows(QMenu* menu) {
  const QList<QAction*> actions = menu->actions();
  for (qsizetype i = actions.indexOf(mOpenWindows) + 1; i < actions.size(); ++i) delete actions[i];
  int number = 1;
  for (QMdiSubWindow* sub : mArea->subWindowList()) {
    const QString title = QStringLiteral("&%1 %2").arg(number++).arg(sub->windowTitle());
    QAction* action = menu->addAction(title, this, [this, sub] { mArea->setActiveSubWindow(sub); });
    action->setCheckable(true);
    action->setChecked(sub == mArea->activeSubWindow());
  }
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
      if (ConfirmLeaveSetting("opening another")) OpenSetting(name);
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
  const WindowResource* entry = WindowFactory::Find(resource.toStdString());
  ConditionList list;
  QWidget* window = nullptr;
  {
    WaitCursor wait;
    window = WindowFactory::Make(resource.toStdString(), nullptr, list);
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

QWidget* MainWin::OpenSequence() { return SequenceWindows::OpenSequence(*this); }

QWidget* MainWin::OpenEvents(unsigned long block) { return SequenceWindows::OpenEvents(*this, block); }

QWidget* MainWin::OpenSegment(unsigned long block, unsigned long port) {
  return SequenceWindows::OpenSegment(*this, block, port);
}

QWidget* MainWin::ShowSegment(const Dstring& name) { return SequenceWindows::ShowSegment(*this, name); }

QMdiSubWindow* MainWin::Adopt(QWidget* window, const QString& resource, const QString& title) {
  window->setAttribute(Qt::WA_DeleteOnClose);
  QMdiSubWindow* sub = mArea->addSubWindow(window);
  sub->installEventFilter(this);
  sub->setProperty(kResourceProperty, resource);
  sub->setWindowTitle(title);
  sub->setWindowIcon(QIcon(QPixmap(1, 1)));
  // As large as it asks, but no larger than the area shows once it shows (it scrolls beyond).
  const QSize room = mArea->viewport()->isVisible()
                         ? mArea->viewport()->size().expandedTo(sub->minimumSizeHint())
                         : QSize(QWIDGETSIZE_MAX, QWIDGETSIZE_MAX);
  sub->resize(window->sizeHint().expandedTo(window->size()).boundedTo(room));
  ShowLockIn(window, IsShowingLock());
  // Queued: the window is gone from the area's list by then.
  connect(sub, &QObject::destroyed, this, &MainWin::UpdateCommands, Qt::QueuedConnection);
  sub->show();
  window->setFocus();
  UpdateCommands();
  return sub;
}

void MainWin::FollowActiveWindow(QMdiSubWindow* sub) {
  const QKeySequence save(QKeySequence::Save);
  bool ownSave = false;
  if (sub != nullptr && sub->widget() != nullptr) {
    for (const QAction* action : sub->widget()->findChildren<QAction*>())
      ownSave = ownSave || action->shortcuts().contains(save);
  }
  mSaveSetting->setShortcut(ownSave ? QKeySequence() : save);
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
  if (!ConfirmLeaveSetting("starting a new setting")) return;
  ConditionList list;
  WaitCursor wait;
  uiapp::GetOpenSettingDs()->New(list);
  Show(list);
}

void MainWin::HitOpenSetting() {
  if (!ConfirmLeaveSetting("opening another")) return;
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
  if (ok) OpenSetting(name.toStdString());
}

void MainWin::OpenSetting(const Dstring& name) {
  ConditionList list;
  WaitCursor wait;
  uiapp::GetOpenSettingDs()->Load(name, false, uiapp::GetSettingMRU(), list);
  Show(list);
}

void MainWin::HitSaveSetting() { SaveSetting(); }

void MainWin::HitSaveSettingAs() { SaveSettingAs(); }

// A new setting has no name to save under: Save asks for one.
bool MainWin::SaveSetting() {
  const Dstring name = uiapp::GetOpenSettingDs()->GetName();
  if (name.empty()) return SaveSettingAs();
  ConditionList list;
  WaitCursor wait;
  const int status = uiapp::GetOpenSettingDs()->Save(name, uiapp::GetSettingMRU(), list);
  Show(list);
  return status == 0;
}

bool MainWin::SaveSettingAs() {
  bool ok = false;
  const QString text = QInputDialog::getText(this, QStringLiteral("Save Setting As"), QStringLiteral("Name:"), QLineEdit::Normal,
                                             QString::fromStdString(uiapp::GetOpenSettingDs()->GetName()), &ok);
  if (!ok) return false;
  auto replace = [](const Dstring& name) {
    const Dstring question = Dstring::Format("The instrument keeps a setting named \"%s\" already. Replace it?", name.c_str());
    return Toolkit::Get().AskChoice(question, "Replace", "") == ToolkitPort::kYes;
  };
  ConditionList list;
  WaitCursor wait;
  const int status = uiapp::GetOpenSettingDs()->Save(text.trimmed().toStdString(), uiapp::GetSettingMRU(), list, replace);
  Show(list);
  return status == 0;
}

bool MainWin::ConfirmLeaveSetting(const char* doing) {
  const OpenSettingDs& setting = *uiapp::GetOpenSettingDs();
  if (!setting.IsModified()) return true;
  const Dstring name = setting.GetName().empty() ? Dstring(StartUpConfig::kDefaultSettingName) : setting.GetName();
  const int answer = Toolkit::Get().AskChoice(
      Dstring::Format("The setting \"%s\" has changes that are not saved. Save it before %s?", name.c_str(), doing),
      "Save", "Discard");
  if (answer == ToolkitPort::kCancel) return false;
  return answer == ToolkitPort::kNo || SaveSetting();
}

int MainWin::NfyOpenSetting(QenDs*, void* client, ConditionList&) {
  static_cast<MainWin*>(client)->UpdateTitle();
  return 0;
}

// A setting as a local file of text: to keep a test under version control or take it to
// another instrument.
void MainWin::HitExportSetting() {
  const Dstring open = uiapp::GetOpenSettingDs()->GetName();
  const QString path = FileChoice::Ask(this, FileChoice::Mode::kSave, QStringLiteral("Export Setting"),
                                       QString::fromStdString(open.empty() ? Dstring("setting") : open) + ".qset",
                                       kSettingFilter);
  if (path.isEmpty()) return;
  ConditionList list;
  int status = 0;
  {
    WaitCursor wait;
    status = SettingTransfer::Export(SettingText::Kind::kSetting, path.toStdString(), list);
  }
  Show(list);
  if (status == 0) statusBar()->showMessage(QStringLiteral("The setting was exported to %1.").arg(path), kMessageMs);
}

void MainWin::HitImportSetting() {
  const QString path =
      FileChoice::Ask(this, FileChoice::Mode::kOpen, QStringLiteral("Import Setting"), {}, kSettingFilter);
  if (path.isEmpty() || !ConfirmLeaveSetting("importing another")) return;
  // The delays make up for the cables of a rack; a file from elsewhere does not know this one's.
  const int delays = Toolkit::Get().AskYesNoCancel(
      "Take the port delays stored in the file?\n\nYes takes them; No keeps the delays this instrument has now, "
      "which make up for its own cables.");
  if (delays == ToolkitPort::kCancel) return;
  ConditionList list;
  int status = 0;
  {
    WaitCursor wait;
    status = SettingTransfer::ImportSetting(path.toStdString(), delays == ToolkitPort::kYes, list);
  }
  // The instrument holds a setting of no name now; the poll marks it as not saved.
  if (status == 0) uiapp::GetOpenSettingDs()->Read(list);
  Show(list);
  UpdateTitle();
  if (status == 0) statusBar()->showMessage(QStringLiteral("The setting of %1 was imported.").arg(path), kMessageMs);
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
  const OpenSettingDs* setting = uiapp::GetOpenSettingDs();
  const QString name = setting != nullptr ? QString::fromStdString(setting->Title()) : QStringLiteral("UNTITLED");
  setWindowTitle(QStringLiteral("%1 - Corvane 71300").arg(name));
}

// The setting first, then every window: one with unsaved work may keep the program open.
void MainWin::closeEvent(QCloseEvent* event) {
  if (HoldCloseDuringWait(this, event)) return;
  // A connection given up has nothing to save to.
  if (!mEndedToReconnect && !ConfirmLeaveSetting("quitting")) return event->ignore();
  mArea->closeAllSubWindows();
  if (!mArea->subWindowList().isEmpty()) return event->ignore();
  uiapp::MainLoopExit();
  QMainWindow::closeEvent(event);
}

bool MainWin::eventFilter(QObject* watched, QEvent* event) {
  if (event->type() == QEvent::Close && watched->isWidgetType()) {
    return HoldCloseDuringWait(static_cast<QWidget*>(watched), event);
  }
  return QMainWindow::eventFilter(watched, event);
}

bool MainWin::HoldCloseDuringWait(QWidget* window, QEvent* event) {
  if (!QenGuiInst::IsWaiting()) return false;
  event->ignore();
  HeldCloses().emplace_back(window);
  QenGuiInst::RunAfterWait(&MainWin::NfyCloseHeld, nullptr);
  return true;
}

void MainWin::NfyCloseHeld(void*) {
  for (const QPointer<QWidget>& window : std::exchange(HeldCloses(), {})) {
    if (window) window->close();
  }
}
