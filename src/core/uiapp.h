#pragma once

#include <vector>

#include "core/WindowResource.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"
#include "settings/SettingMRU.h"
#include "support/MeasTimer.h"

class BerSvr;
class ConnectDs;
class DataPortOneLockDs;
class DirtyFlagDs;
class ErrorMgr;
class GuiLockDs;
class OpenSettingDs;
class PLLStateDs;
class QenDs;
class RunStopDs;
class SystemStateDs;
enum DataPortOneLockEnum : int;
enum PLLStateEnum : int;
enum SysStateEnum : int;

// The application: starts and ends the library, owns the process-wide state sources and the
// error manager, registers windows and script items with the toolkit, runs the main loop and
// the one-second poll, and offers the instrument-wide actions. All static.
//
// Order of calls over the life of the application: LoadDatLib, RegisterClasses, RegisterConstants/RegisterEvents/
// RegisterVerbs, RegisterWindows, Init, connection and
// CreateAppHandle, RegistrationFinished, StartPolling, MainLoop, EndPolling, End,
// UnregisterWindows.
class uiapp {
 public:
  static int Init(ConditionList& list);
  static int End(ConditionList& list);

  // Opens the resource library "uiapp" through the toolkit.
  static int LoadDatLib(ConditionList& list);
  // Makes every widget class of the library known to the toolkit's resource loader.
  static int RegisterClasses(ConditionList& list);
  static const std::vector<Dstring>& ClassNames();
  static void RegisterConstants();
  static void RegisterEvents();
  static void RegisterVerbs();
  static void RegisterWindows();
  static void UnregisterWindows();
  // How the start treats the instrument's setting: as the start-up configuration says, or only
  // looking (a screenshot or headless host), which never loads or starts a setting.
  enum class StartUse { kConfigured, kOnlyLook };
  // The start-up configuration and the first setting; then the setting is followed. 0, or
  // SettingsStatus::kStartCancelled when the user cancelled the start-up dialog: the start ends.
  static int RegistrationFinished(StartUse use = StartUse::kConfigured);
  // Every window of the library, in the order of the Windows menu: RegisterWindows binds those
  // marked bound, the main window's menu shows those on the menu, and the window factory builds
  // any of them.
  static const std::vector<WindowResource>& WindowResources();

  static int CreateAppHandle(Dstring& handle, const Dstring& resource, ConditionList& list);
  static int DestroyAppHandle(const Dstring& handle, ConditionList& list);
  static void MakeAppHandleFromResourceName(Dstring& handle, const Dstring& resource);
  static int GetCurrentResource(Dstring& resource, ConditionList& list);
  static void SetCurrentResource(const Dstring& resource) { mResource = resource; }

  static int Connect(ConditionList& list);
  static int Disconnect(ConditionList& list);
  static int Run(ConditionList& list);
  static int Stop(ConditionList& list);
  static void NfyDelayedStop(void*);
  static int SequenceForce(ConditionList& list);
  // Runs the instrument's self test in the self test window (the tool the window layer
  // registers); without one, GUI_SELFTEST_NO_WINDOW.
  static int DoSelfTest(ConditionList& list);
  static int CheckTriggerMode(ConditionList& list);

  static void StartPolling();
  static void EndPolling();
  static void MainLoop();
  static void MainLoopExit();
  static int NfyViewDataUpdatedSysState(QenDs*, void*, ConditionList&);

  static RunStopDs* GetRunStopDs() { return mRunStopDs; }
  static SystemStateDs* GetSystemStateDs() { return mSystemStateDs; }
  static PLLStateDs* GetPLLStateDs() { return mPLLStateDs; }
  static DataPortOneLockDs* GetDataPortOneLockStateDs() { return mDataPortOneLockDs; }
  static ConnectDs* GetConnectDs() { return mConnectDs; }
  static DirtyFlagDs* GetDirtyFlagDs() { return mDirtyFlagDs; }
  static GuiLockDs* GetGuiLockDs() { return mGuiLockDs; }
  static OpenSettingDs* GetOpenSettingDs() { return mOpenSettingDs; }
  static BerSvr* GetBerSvr() { return mBerSvr; }
  static ErrorMgr* GetErrorMgr() { return mErrorMgr; }
  static SettingMRU& GetSettingMRU() { return mSettingMRU; }
  static unsigned long GetConfigParamSet() { return mConfigParamSet; }
  static void SetConfigParamSet(unsigned long set) { mConfigParamSet = set; }
  static SysStateEnum GetSystemState();
  static PLLStateEnum GetPLLState();
  static DataPortOneLockEnum GetDataPortOneLockState();
  static unsigned IsConnected();

  // The poller's clock; tests replace it with a manual one.
  static MeasTimer& GetTime() { return mTime; }
  static double GetExpectedTimeOfNextTimeOut() { return mExpectedTimeOfNextTimeOut; }
  static unsigned IsSyncAlarmPending() { return callSyncAlarmProc; }
  static unsigned IsProcessingSyncAlarm() { return isProcessingSyncAlarmProc; }

  // One tick of the poll as the alarm runs it, and the synchronous part as the main loop runs
  // it; public so that a host without the main loop can drive them.
  static void AsyncAlarmProc(void*);
  static void SyncTimeOut();

 private:
  static void AsyncTimeOut();
  // The poll that came due while a call waited for its reply, run once the wait is over.
  static void NfyHeldPoll(void*);
  static int AfterLockReleased(ConditionList& list);

  static RunStopDs* mRunStopDs;
  static SystemStateDs* mSystemStateDs;
  static PLLStateDs* mPLLStateDs;
  static DataPortOneLockDs* mDataPortOneLockDs;
  static ConnectDs* mConnectDs;
  static DirtyFlagDs* mDirtyFlagDs;
  static GuiLockDs* mGuiLockDs;
  static OpenSettingDs* mOpenSettingDs;
  static BerSvr* mBerSvr;
  static ErrorMgr* mErrorMgr;
  static SettingMRU mSettingMRU;
  static unsigned long mConfigParamSet;
  static Dstring mResource;
  static std::vector<Dstring> mConstants;
  static std::vector<Dstring> mEvents;
  static std::vector<Dstring> mVerbs;
  static MeasTimer mTime;
  static double mTimeOfLastTimeOut;
  static double mExpectedTimeOfNextTimeOut;
  static unsigned inMainLoop;
  static unsigned callSyncAlarmProc;
  static unsigned isProcessingSyncAlarmProc;
};
