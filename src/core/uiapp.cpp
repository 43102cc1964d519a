#include "core/uiapp.h"

#include "core/MeasconfMeasMode.h"
#include "core/SelfTest.h"
#include "core/ServerDeathRescue.h"
#include "data/BerSvr.h"
#include "data/ConnectDs.h"
#include "data/DataPortOneLockDs.h"
#include "data/DirtyFlagDs.h"
#include "data/Dte.h"
#include "data/GuiLockDs.h"
#include "data/PLLStateDs.h"
#include "data/QenParamDs.h"
#include "data/RunStopDs.h"
#include "data/SystemStateDs.h"
#include "instrument/AppHandle.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "segments/QenSegmentPool.h"
#include "sequences/CFrontendInfo.h"
#include "sequences/CPortInfo.h"
#include "sequences/CSequence.h"
#include "sequences/SegmentPoolSync.h"
#include "sequences/SequenceService.h"
#include "settings/OpenSettingDs.h"
#include "settings/QENSettingProfile.h"
#include "settings/SettingStartUp.h"
#include "settings/SettingsStatus.h"
#include "support/ConditionListLoader.h"
#include "support/ErrorMgr.h"
#include "support/FWBlocker.h"
#include "support/MessageCatalogue.h"
#include "support/QenEnvironment.h"
#include "toolkit/Toolkit.h"

RunStopDs* uiapp::mRunStopDs = nullptr;
SystemStateDs* uiapp::mSystemStateDs = nullptr;
PLLStateDs* uiapp::mPLLStateDs = nullptr;
DataPortOneLockDs* uiapp::mDataPortOneLockDs = nullptr;
ConnectDs* uiapp::mConnectDs = nullptr;
DirtyFlagDs* uiapp::mDirtyFlagDs = nullptr;
GuiLockDs* uiapp::mGuiLockDs = nullptr;
OpenSettingDs* uiapp::mOpenSettingDs = nullptr;
BerSvr* uiapp::mBerSvr = nullptr;
ErrorMgr* uiapp::mErrorMgr = nullptr;
SettingMRU uiapp::mSettingMRU;
unsigned long uiapp::mConfigParamSet = 0;
Dstring uiapp::mResource = "QEN1";
MeasTimer uiapp::mTime;
double uiapp::mTimeOfLastTimeOut = 0.0;
double uiapp::mExpectedTimeOfNextTimeOut = 1.0;
unsigned uiapp::inMainLoop = 0;
unsigned uiapp::callSyncAlarmProc = 0;
unsigned uiapp::isProcessingSyncAlarmProc = 0;

// Script items handed to the toolkit: the state words a script may compare with, the events a
// script may wait for, and the actions it may call.
std::vector<Dstring> uiapp::mConstants = {"PROG", "RUNN", "HALT", "FIN", "SAB", "SYNC",
                                          "LOCK", "UNKN", "UCDR", "UDAT", "FREE", "DMUX"};
std::vector<Dstring> uiapp::mEvents = {"RunStopChanged", "SystemStateChanged", "PLLStateChanged",
                                       "DataPortOneLockChanged", "ConnectChanged", "GuiLockChanged"};
std::vector<Dstring> uiapp::mVerbs = {"uiapp.Run", "uiapp.Stop", "uiapp.SequenceForce", "uiapp.CheckTriggerMode",
                                      "uiapp.Connect", "uiapp.Disconnect"};

namespace {

SegmentPoolSync gSegmentPoolSync;

constexpr double kPollSeconds = 1.0;
constexpr double kShortestPollSeconds = 0.5;

// The five sources that re-read their values when the server reports changes, in the order
// they are registered on the dirty-flag source.
template <typename F>
void ForEachStateView(F f, RunStopDs* r, SystemStateDs* s, PLLStateDs* p, DataPortOneLockDs* d, ConnectDs* c) {
  f(static_cast<QenDsView*>(r));
  f(static_cast<QenDsView*>(s));
  f(static_cast<QenDsView*>(p));
  f(static_cast<QenDsView*>(d));
  f(static_cast<QenDsView*>(c));
}

}  // namespace

const std::vector<WindowResource>& uiapp::WindowResources() {
  // Editors first, then the tools used all day: the first nine on the menu have Ctrl+1 … Ctrl+9.
  static const std::vector<WindowResource> resources = {
      {"paramedit.ParamEd", "Parameter Editor", true, true, true},
      {"dataedit.SegmentEditWin", "Segment Editor", true, true, true},
      {"smseqedit.Win", "Simple Sequence", true, true, true},
      {"LoopGridEdit.Win", "Loop Grid", true, true, true},
      {"seqedit.SeqEdWin", "Sequence", true, true, true},
      {"bconnect.ConnectWin", "System Scheme", true, true, false},
      {"dtecmd.CmdWin", "Command Window", true, true, false},
      {"error.ErrorWin", "Error List", true, true, false},
      {"ber.BerWin", "Bit Error Rate", true, true, false},
      {"errstate.ErrStateWin", "Error State", true, true, false},
      {"wavewin.WaveWin", "Waveform", true, true, false},
      {"measconf.MeasMode", "Measurement Mode", true, true, true},
      {"deskew.DeskewWin", "Deskew", true, true, false},
      // The self test's window: on the menu, and opened by DoSelfTest.
      {"selftest.Result", "Self Test", false, true, false},
      // A block's events: opened from the sequence windows, one per block.
      {"seqedit.EventWin", "Events", false, false, false},
  };
  return resources;
}

int uiapp::Init(ConditionList& list) {
  mConfigParamSet = QenEnvironment::GetConfigParamSet();
  mErrorMgr = new ErrorMgr;
  mDirtyFlagDs = new DirtyFlagDs;
  mRunStopDs = new RunStopDs;
  mSystemStateDs = new SystemStateDs;
  mPLLStateDs = new PLLStateDs;
  mDataPortOneLockDs = new DataPortOneLockDs;
  mConnectDs = new ConnectDs;
  mGuiLockDs = new GuiLockDs;
  mBerSvr = new BerSvr;
  mOpenSettingDs = new OpenSettingDs;
  ForEachStateView([&](QenDsView* v) { mDirtyFlagDs->RegisterView(v, list); }, mRunStopDs, mSystemStateDs,
                   mPLLStateDs, mDataPortOneLockDs, mConnectDs);
  mSystemStateDs->RegisterProc(&uiapp::NfyViewDataUpdatedSysState, nullptr);
  QenGuiInst::Init();
  CPortInfo::Init(mDirtyFlagDs, &SequenceService::NfyPortInfo);
  SequenceService::Init(mDirtyFlagDs, &CPortInfo::GetSequencePorts);
  Dte::Init(mDirtyFlagDs, mErrorMgr);
  QenSegmentPool::Init(mDirtyFlagDs);
  SequenceService::GetSequence()->SetSegmentSync(&gSegmentPoolSync);
  QENSettingProfile::Init(mDirtyFlagDs);
  ServerDeathRescue::Install();
  return 0;
}

int uiapp::End(ConditionList& list) {
  const Dstring handle = QenGuiInst::GetAppHandle();
  if (!handle.empty()) {
    Toolkit::Get().StopCBackAlarm();
    callSyncAlarmProc = 0;
    mBerSvr->End();
    mOpenSettingDs->EndFollow(list);
    DestroyAppHandle(handle, list);
  }
  ServerDeathRescue::Uninstall();
  SequenceService::End();
  CPortInfo::End();
  CFrontendInfo::Invalidate();
  QenSegmentPool::End();
  Dte::End();
  QENSettingProfile::End();
  if (QenGuiInst::IsConnectedToServer()) QenGuiInst::DisconnectFromServer(list);
  QenGuiInst::End();
  delete mErrorMgr;
  mErrorMgr = nullptr;
  mSystemStateDs->UnregisterProc(&uiapp::NfyViewDataUpdatedSysState, nullptr);
  ForEachStateView([&](QenDsView* v) { mDirtyFlagDs->UnregisterView(v, list); }, mRunStopDs, mSystemStateDs,
                   mPLLStateDs, mDataPortOneLockDs, mConnectDs);
  for (QenDs* source : std::initializer_list<QenDs*>{mDirtyFlagDs, mRunStopDs, mSystemStateDs, mPLLStateDs,
                                                     mDataPortOneLockDs, mConnectDs, mGuiLockDs, mBerSvr}) {
    source->Release();
  }
  mDirtyFlagDs = nullptr;
  mRunStopDs = nullptr;
  mSystemStateDs = nullptr;
  mPLLStateDs = nullptr;
  mDataPortOneLockDs = nullptr;
  mConnectDs = nullptr;
  mGuiLockDs = nullptr;
  mBerSvr = nullptr;
  mOpenSettingDs->Release();
  mOpenSettingDs = nullptr;
  return 0;
}

int uiapp::LoadDatLib(ConditionList& list) { return Toolkit::Get().LoadResourceLibrary("uiapp", list); }

const std::vector<Dstring>& uiapp::ClassNames() {
  static const std::vector<Dstring> kClasses = {"UnitEd",      "LbUnitEd",  "QenDsCBut", "QenDsRBut", "QenDsCBox",
                                                "QenDsSlidr",  "QenDsSTEd", "QenParEd",  "QenParLb",  "GridManager",
                                                "AddrDisp",    "DigitDisp", "NameDisp",  "ErrStateGridManager", "SegmentGridManager",
                                                "LoopGridManager"};
  return kClasses;
}

int uiapp::RegisterClasses(ConditionList& list) {
  int status = 0;
  for (const auto& name : ClassNames()) {
    if (int rc = Toolkit::Get().RegisterClass(name, list); rc != 0 && status == 0) status = rc;
  }
  return status;
}

void uiapp::RegisterConstants() { Toolkit::Get().RegisterScriptItems("constants", mConstants, 1); }
void uiapp::RegisterEvents() { Toolkit::Get().RegisterScriptItems("events", mEvents, 1); }
void uiapp::RegisterVerbs() { Toolkit::Get().RegisterScriptItems("verbs", mVerbs, 1); }

void uiapp::RegisterWindows() {
  for (const WindowResource& window : WindowResources()) {
    if (window.bound) Toolkit::Get().RegisterWindow(window.resource);
  }
}

void uiapp::UnregisterWindows() {
  for (const WindowResource& window : WindowResources()) {
    if (window.bound) Toolkit::Get().UnregisterWindow(window.resource);
  }
}

int uiapp::RegistrationFinished(StartUse use) {
  ConditionList list;
  FWBlocker guard("uiapp::RegistrationFinished", list);
  if (guard.Block()) return 0;
  if (use == StartUse::kOnlyLook) {
    mOpenSettingDs->Read(list);
  } else {
    if (SettingStartUp::Run(mConfigParamSet, Toolkit::Get(), mSettingMRU, *mOpenSettingDs) != 0) {
      return SettingsStatus::kStartCancelled;
    }
    mOpenSettingDs->Follow(mResource, list);
  }
  QenGuiInst::ShowErrorDlg(list, 1);
  list.Clear();
  if (CSequence::InitNumLoopLevels(list) != QenStatus::kLocked && !list.IsEmpty()) QenGuiInst::ShowErrorDlg(list, 1);
  return 0;
}

int uiapp::CreateAppHandle(Dstring& handle, const Dstring& resource, ConditionList& list) {
  return AppHandle::Create(QenGuiInst::GetInstrument(), handle, resource, list);
}

int uiapp::DestroyAppHandle(const Dstring& handle, ConditionList& list) {
  return AppHandle::Destroy(QenGuiInst::GetInstrument(), handle, list);
}

void uiapp::MakeAppHandleFromResourceName(Dstring& handle, const Dstring& resource) {
  handle = AppHandle::MakeFromResourceName(resource);
}

int uiapp::GetCurrentResource(Dstring& resource, ConditionList&) {
  resource = mResource;
  return 0;
}

int uiapp::Connect(ConditionList& list) { return mConnectDs->Connect(list); }
int uiapp::Disconnect(ConditionList& list) { return mConnectDs->Disconnect(list); }

int uiapp::Run(ConditionList& list) {
  FWBlocker guard("uiapp::Run", list);
  if (int status = guard.Block()) return status;
  if (int status = SequenceService::GetSequence()->SyncSegments(list)) return status;
  if (int status = MeasconfMeasMode::UpdateBeforeRun(list)) return status;
  return mRunStopDs->Run(list);
}

int uiapp::Stop(ConditionList& list) { return mRunStopDs->Stop(list); }

int uiapp::DoSelfTest(ConditionList& list) {
  if (SelfTest::GetTool() == nullptr) {
    ConditionListLoader::ConditionToken(list, "GUI_SELFTEST_NO_WINDOW", {}, 1);
    return 1;
  }
  return SelfTest::GetTool()->Run(list);
}

void uiapp::NfyDelayedStop(void*) {
  ConditionList dropped;
  Stop(dropped);
}

int uiapp::SequenceForce(ConditionList& list) {
  FWBlocker guard("uiapp::SequenceForce", list);
  if (int status = guard.Block()) return status;
  if (int status = SequenceService::GetSequence()->SyncSegments(list)) return status;
  Dstring reply;
  return QenGuiInst::Call(Dstring::Format(":%s:SGEN:GLOB:SEQ:FORC", QenGuiInst::GetAppHandle().c_str()), reply, list);
}

int uiapp::CheckTriggerMode(ConditionList& list) {
  FWBlocker guard("uiapp::CheckTriggerMode", list);
  if (int status = guard.Block()) return status;
  QenParamDs* mode = Dte::AllocDsByName(Dstring::Format(":%s:TRIG:MODE", QenGuiInst::GetAppHandle().c_str()), 0);
  Dstring value;
  int status = mode->QueryStrValue(value, list);
  if (status == 0 && value != "SEQ") {
    const Dstring* question = MessageCatalogue::Find("sequence.StrRTriggerModeSetToClock");
    if (Toolkit::Get().AskYesNo(question ? *question : Dstring()) == ToolkitPort::kYes) {
      status = mode->SetStrValue("SEQ", list);
    }
  }
  Dte::FreeDs(mode);
  return status;
}

void uiapp::StartPolling() {
  callSyncAlarmProc = 0;
  isProcessingSyncAlarmProc = 0;
  mTime.Reset();
  mTimeOfLastTimeOut = 0.0;
  mExpectedTimeOfNextTimeOut = kPollSeconds;
  Toolkit::Get().StartCBackAlarm(1000, &uiapp::AsyncAlarmProc, nullptr);
}

void uiapp::EndPolling() {
  Toolkit::Get().StopCBackAlarm();
  callSyncAlarmProc = 0;
  isProcessingSyncAlarmProc = 0;
}

void uiapp::AsyncAlarmProc(void*) {
  if (!isProcessingSyncAlarmProc) {
    callSyncAlarmProc = 1;
    AsyncTimeOut();
  }
  const double now = mTime.Get();
  mTimeOfLastTimeOut = now;
  // A late tick is made up by a shorter next interval, never shorter than half a second.
  double delay = kPollSeconds - (now - mExpectedTimeOfNextTimeOut);
  if (delay < kShortestPollSeconds) delay = kShortestPollSeconds;
  mExpectedTimeOfNextTimeOut = now + delay;
  Toolkit::Get().StartCBackAlarm(static_cast<unsigned>(delay * 1000.0), &uiapp::AsyncAlarmProc, nullptr);
}

int uiapp::AfterLockReleased(ConditionList& list) {
  int levels = 0;
  if (!CSequence::IsNumLoopLevelsInitialized()) levels = CSequence::InitNumLoopLevels(list);
  // The other client may have changed the sequence: the next read must not take it as known.
  SequenceService::GetSequence()->ClearLastExpression();
  mDirtyFlagDs->ForceUpdate();
  if (levels == 0 && !mBerSvr->IsInitialized()) mBerSvr->Init(list);
  return mGuiLockDs->UnLock(list);
}

void uiapp::AsyncTimeOut() {
  ConditionList dropped;
  FWBlocker guard("uiapp::AsyncTimeOut", dropped);
  const int blocked = guard.Block();
  if (blocked == QenStatus::kLocked) {
    if (!mGuiLockDs->IsLocked()) {
      mGuiLockDs->Lock(dropped);
      // Whatever the other client did, the service is set up anew once the instrument is free.
      mBerSvr->End();
    }
    return;
  }
  if (blocked == FWBlocker::kBusy && QenGuiInst::IsWaiting()) {
    QenGuiInst::RunAfterWait(&uiapp::NfyHeldPoll, nullptr);
    return;
  }
  if (blocked) return;
  if (mGuiLockDs->IsLocked() && AfterLockReleased(dropped) != 0) return;
  if (!mDirtyFlagDs->IsDirty() && mDirtyFlagDs->UpdateFromFW(dropped) != 0) return;
  if (mOpenSettingDs->UpdateFromFW(dropped) != 0) return;
  const SysStateEnum state = mSystemStateDs->GetState();
  if (state >= kSysRunning && state <= kSysSync) mBerSvr->UpdateFromFW(BerSvr::kReadResults, dropped);
}

void uiapp::NfyHeldPoll(void*) {
  if (isProcessingSyncAlarmProc) return;
  callSyncAlarmProc = 1;
  AsyncTimeOut();
}

void uiapp::SyncTimeOut() {
  ConditionList dropped;
  if (mDirtyFlagDs->IsDirty()) mDirtyFlagDs->Update(dropped);
}

void uiapp::MainLoop() {
  ToolkitPort& toolkit = Toolkit::Get();
  toolkit.Update();
  inMainLoop = 1;
  callSyncAlarmProc = 0;
  isProcessingSyncAlarmProc = 0;
  do {
    toolkit.ProcessNext();
    if (callSyncAlarmProc) {
      isProcessingSyncAlarmProc = 1;
      callSyncAlarmProc = 0;
      SyncTimeOut();
      isProcessingSyncAlarmProc = 0;
    }
  } while (inMainLoop);
  toolkit.Update();
}

void uiapp::MainLoopExit() { inMainLoop = 0; }

int uiapp::NfyViewDataUpdatedSysState(QenDs*, void*, ConditionList&) { return 0; }

SysStateEnum uiapp::GetSystemState() { return mSystemStateDs->GetState(); }
PLLStateEnum uiapp::GetPLLState() { return mPLLStateDs->GetState(); }
DataPortOneLockEnum uiapp::GetDataPortOneLockState() { return mDataPortOneLockDs->GetState(); }
unsigned uiapp::IsConnected() { return mConnectDs->IsConnected(); }
