#pragma once

#include <QList>
#include <QMainWindow>
#include <QPair>
#include <memory>

class QAction;
class QLabel;
class QMdiArea;
class QMdiSubWindow;
class QMenu;
class StateStatusBar;
class ConditionList;

// The frame of the program: the windows in an MDI area, the File, Instrument, Windows and Help
// menus, the run toolbar and the status bar of the instrument's state. While another client
// holds the instrument a banner says so and what cannot work is off: every command that needs
// the instrument, the windows that must read it to open, and the windows' parts that write (a
// window that knows which of its parts only read is a LockAware; any other is disabled whole).
// It all comes back by itself when the lock goes. The self test is also off while the
// instrument runs, as the instrument refuses it then.
class MainWin : public QMainWindow {
  Q_OBJECT

 public:
  explicit MainWin(QWidget* parent = nullptr);
  ~MainWin() override;

  // Registers with the state sources; call after uiapp::Init.
  void Attach();
  // Opens the window of a resource, or raises it when it is open; null when it cannot be built
  // (the condition has been shown).
  QWidget* OpenWindow(const QString& resource);
  QWidget* FindWindow(const QString& resource) const;
  // Shows a built window in the area as a window of the resource, under the title.
  QMdiSubWindow* Adopt(QWidget* window, const QString& resource, const QString& title);
  QMdiArea* Area() const { return mArea; }
  StateStatusBar* StatusBarView() const { return mStatus; }
  bool IsShowingLock() const;
  // Follows the lock state of the instrument.
  void ShowLock(bool locked);
  // Every command of the menus and the toolbar.
  QList<QAction*> Commands() const;

 protected:
  void closeEvent(QCloseEvent* event) override;

 private:
  class StateView;
  class SelfTestTool;

  void BuildMenus();
  void BuildFileMenu();
  void BuildInstrumentMenu();
  void BuildWindowsMenu();
  void FillRecentMenu();
  // Runs an action of the instrument with the wait cursor and shows what went wrong.
  void RunAction(int (*action)(ConditionList&));
  void HitNewSetting();
  void HitOpenSetting();
  void HitSaveSetting();
  void HitSaveSettingAs();
  void HitAbout();
  void UpdateTitle();
  // Turns each command on or off for the lock and the run state.
  void UpdateCommands();
  void ShowLockIn(QWidget* window, bool locked);

  QMdiArea* mArea;
  QLabel* mBanner;
  StateStatusBar* mStatus;
  QMenu* mRecent = nullptr;
  // The commands that send something to the instrument.
  QList<QAction*> mInstrumentCommands;
  // The Windows menu's entries of windows that read the instrument to open, by resource.
  QList<QPair<QAction*, QString>> mReadingWindows;
  QAction* mSelfTest = nullptr;
  std::unique_ptr<StateView> mStateView;
  std::unique_ptr<SelfTestTool> mSelfTestTool;
};
