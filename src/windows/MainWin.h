#pragma once

#include <QList>
#include <QMainWindow>
#include <QPair>
#include <memory>

#include "windows/common/WindowOpener.h"

class QAction;
class QLabel;
class QenDs;
class QMdiArea;
class QMdiSubWindow;
class QMenu;
class InstrumentWaitView;
class StateStatusBar;
class ConditionList;
class Dstring;

// The frame of the program: the windows in an MDI area, the File, Instrument, Windows and Help
// menus, the run toolbar and the status bar of the instrument's state. While another client
// holds the instrument a banner says so and what cannot work is off: every command that needs
// the instrument, the windows that must read it to open, and the windows' parts that write (a
// window that knows which of its parts only read is a LockAware; any other is disabled whole).
// It all comes back by itself when the lock goes. The self test is also off while the
// instrument runs, as the instrument refuses it then. The title names the setting the
// instrument holds, with " *" while it is modified; New, Open and Quit ask to save a modified
// setting first. It is the opener every window asks for another window.
class MainWin : public QMainWindow, public WindowOpener {
  Q_OBJECT

 public:
  explicit MainWin(QWidget* parent = nullptr);
  ~MainWin() override;

  // Registers with the state sources; call after uiapp::Init.
  void Attach();
  // Opens the window of a resource, or raises it when it is open; null when it cannot be built
  // (the condition has been shown).
  QWidget* OpenWindow(const QString& resource) override;
  QWidget* OpenSequence() override;
  QWidget* OpenEvents(unsigned long block) override;
  QWidget* OpenSegment(unsigned long block, unsigned long port) override;
  QWidget* ShowSegment(const Dstring& name) override;
  QWidget* FindWindow(const QString& resource) const;
  // Shows a built window in the area as a window of the resource, under the title.
  QMdiSubWindow* Adopt(QWidget* window, const QString& resource, const QString& title);
  QMdiArea* Area() const { return mArea; }
  StateStatusBar* StatusBarView() const { return mStatus; }
  bool IsShowingLock() const;
  // Follows the lock state of the instrument.
  void ShowLock(bool locked);
  InstrumentWaitView* WaitView() const { return mWait; }
  // Whether the window closed because the user gave up the connection and wants another.
  bool EndedToReconnect() const { return mEndedToReconnect; }
  // Every command of the menus and the toolbar.
  QList<QAction*> Commands() const;

 protected:
  void closeEvent(QCloseEvent* event) override;
  bool eventFilter(QObject* watched, QEvent* event) override;

 private:
  class StateView;
  class SelfTestTool;

  void BuildMenus();
  void BuildFileMenu();
  void BuildInstrumentMenu();
  void BuildWindowsMenu();
  void ListOpenWindows(QMenu* menu);
  void FillRecentMenu();
  // Runs an action of the instrument with the wait cursor and shows what went wrong.
  void RunAction(int (*action)(ConditionList&));
  void HitNewSetting();
  void HitOpenSetting();
  void OpenSetting(const Dstring& name);
  void HitSaveSetting();
  void HitSaveSettingAs();
  void HitExportSetting();
  void HitImportSetting();
  // Each true when the setting was saved; false when the user went back or the save failed
  // (and said why).
  bool SaveSetting();
  bool SaveSettingAs();
  // Before the setting is left ("quitting"): true when it may go, asking first to save a
  // modified one (Save, Discard, Cancel).
  bool ConfirmLeaveSetting(const char* doing);
  static int NfyOpenSetting(QenDs*, void* client, ConditionList&);
  void HitAbout();
  void UpdateTitle();
  void NfyWaitAbandoned();
  // A window closed while a command waits for the instrument would be freed under the code
  // that waits: it closes once the reply is in.
  bool HoldCloseDuringWait(QWidget* window, QEvent* event);
  static void NfyCloseHeld(void*);
  // The active window's own Ctrl+S, when it has one, wins over the setting's.
  void FollowActiveWindow(QMdiSubWindow* sub);
  // Turns each command on or off for the lock and the run state.
  void UpdateCommands();
  void ShowLockIn(QWidget* window, bool locked);

  QMdiArea* mArea;
  QLabel* mBanner;
  StateStatusBar* mStatus;
  InstrumentWaitView* mWait;
  QMenu* mRecent = nullptr;
  QAction* mSaveSetting = nullptr;
  // The commands that send something to the instrument.
  QList<QAction*> mInstrumentCommands;
  // The Windows menu's entries of windows that read the instrument to open, by resource.
  QList<QPair<QAction*, QString>> mReadingWindows;
  QAction* mOpenWindows = nullptr;
  QAction* mSelfTest = nullptr;
  std::unique_ptr<StateView> mStateView;
  std::unique_ptr<SelfTestTool> mSelfTestTool;
  bool mEndedToReconnect = false;
};
