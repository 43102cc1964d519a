#pragma once

#include <QMainWindow>
#include <memory>
#include <vector>

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
// holds the instrument every window is read-only and a banner says so; it clears by itself.
// The title names the setting the instrument holds, with " *" while it is modified; New, Open
// and Quit ask to save a modified setting first.
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
  InstrumentWaitView* WaitView() const { return mWait; }
  // Whether the window closed because the user gave up the connection and wants another.
  bool EndedToReconnect() const { return mEndedToReconnect; }

 protected:
  void closeEvent(QCloseEvent* event) override;
  bool eventFilter(QObject* watched, QEvent* event) override;

 private:
  class LockView;
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
  void EnableSettingActions(bool on);
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

  QMdiArea* mArea;
  QLabel* mBanner;
  StateStatusBar* mStatus;
  InstrumentWaitView* mWait;
  QMenu* mRecent = nullptr;
  QAction* mSaveSetting = nullptr;
  // New, Open, Recent, Save and Save As: off while another client holds the instrument.
  std::vector<QAction*> mSettingActions;
  std::unique_ptr<LockView> mLockView;
  std::unique_ptr<SelfTestTool> mSelfTest;
  bool mEndedToReconnect = false;
};
