#include <gtest/gtest.h>

#include <algorithm>
#include <map>

#include "common/InstrumentFixture.h"
#include "common/WireTable.h"
#include "core/uiapp.h"
#include "data/BerSvr.h"
#include "data/DirtyFlagDs.h"
#include "data/GuiLockDs.h"
#include "data/RunStopDs.h"
#include "data/SystemStateDs.h"
#include "instrument/QenStatus.h"
#include "toolkit/HeadlessToolkit.h"
#include "toolkit/Toolkit.h"

namespace {

// The application started against a scripted instrument, with time in the test's hands.
class UiappTest : public InstrumentFixture {
 protected:
  void SetUp() override {
    Toolkit::Install(&mToolkit);
    mToolkit.UseManualClock(&mNow);
    ASSERT_EQ(uiapp::Init(mList), 0);
    InstrumentFixture::SetUp();
    uiapp::GetTime().SetClock([this] { return mNow; });
  }
  void TearDown() override {
    EXPECT_TRUE(Inst().AllConsumed()) << "the script expected more commands";
    uiapp::EndPolling();
    QenGuiInst::SetAppHandle("");
    Inst().SetHandler([](const Dstring&, Dstring&) { return 0; });
    uiapp::End(mList);
    Toolkit::Install(nullptr);
  }
  // One tick of the alarm, `late` seconds after it was due (early when negative), then the
  // synchronous part as the main loop would run it.
  void Tick(double late = 0.0) {
    ASSERT_TRUE(mToolkit.IsAlarmArmed());
    mNow = mToolkit.AlarmDue() + late;
    mToolkit.StopCBackAlarm();
    uiapp::AsyncAlarmProc(nullptr);
    if (uiapp::IsSyncAlarmPending()) uiapp::SyncTimeOut();
  }

  HeadlessToolkit mToolkit;

 public:
  double mNow = 1000.0;
};

// What the built-in rack answers to the reads that follow a full refresh.
bool AnswerAsServer(const Dstring& cmd, Dstring& reply) {
  static const std::map<Dstring, Dstring> kReplies = {
      {"_H:SGEN:GLOB:INIT:CONT?", "ON"},
      {"_H:SGEN:GLOB:SYST:STAT?", "RUNN"},
      {"_H:SGEN:GLOB:PLL:STAT?", "LOCK"},
      {":SR:_H:CGR@:MOD1:CONN1:PULS:DEL", "1"},
      {":SR:_H:CGR1:MOD@:CONN1:PULS:DEL", "1"},
      {":_H:CGR1:MOD1:TYPE?", "\"K2268A\""},
      {":_H:CGR1:MOD1:UCAS?", "FREE"},
      {"_H:SGEN:GLOB:CONN?", "ON"},
      {"_H:SGEN:GLOB:CONF?", "\"PATT\",\"\",(\":CGR1:MOD1:CONN1\",\"PDAT\",\"OUTPUT_PORT\",\"K2268A\")"},
      {":_H:SGEN:GLOB:SEQ?", "(3.0,\"\",(BLOCK,0,512,0,\"\",(),PAUSE,0,0))"},
      {"_H:CONF:CSET:PROF:EXPR?", "(2.0)"}};
  auto it = kReplies.find(cmd);
  reply = it == kReplies.end() ? Dstring() : it->second;
  return it != kReplies.end();
}

}  // namespace

TEST_F(UiappTest, LateTickIsMadeUpButNeverBelowHalfASecond) {
  uiapp::StartPolling();
  EXPECT_DOUBLE_EQ(mToolkit.AlarmDue(), 1001.0);
  Inst().SetHandler([](const Dstring&, Dstring& reply) { return reply.clear(), 0; });
  Tick(0.7);
  EXPECT_NEAR(mToolkit.AlarmDue() - mNow, 0.5, 1e-9);
  Tick(-0.2);
  EXPECT_NEAR(mToolkit.AlarmDue() - mNow, 1.2, 1e-3);
  Tick(0.0);
  EXPECT_NEAR(mToolkit.AlarmDue() - mNow, 1.0, 1e-3);
}

TEST_F(UiappTest, IdleTickCostsOneRoundTripAndTellsNobody) {
  uiapp::StartPolling();
  Inst().Expect("_H:DFL?", "");
  Tick();
  EXPECT_EQ(Inst().Sent(), DstringList{"_H:DFL?"});
}

TEST_F(UiappTest, LockIsNoticedThenReleasedAndTheStateReadAnew) {
  uiapp::StartPolling();
  Inst().Expect("_H:DFL?", "", QenStatus::kLocked);
  Tick();
  EXPECT_FALSE(uiapp::GetGuiLockDs()->IsLocked());
  Inst().Expect("_H:SGEN:GLOB:INIT:CONT?", "", QenStatus::kLocked);
  Tick();
  EXPECT_TRUE(uiapp::GetGuiLockDs()->IsLocked());
  // Free again: the probe passes, the loop levels are read, the service is set up anew with
  // the counts the other client's run left ...
  Inst().Expect("_H:SGEN:GLOB:INIT:CONT?", "OFF");
  Inst().Expect(":_H:SGEN:GLOB:SEQ:LLEV?", "3");
  Inst().Expect(":L:_H:CGR?", "\":_H:CGR1:MOD3:CONN1:BER\",\":_H:CGR1:PER\"");
  Inst().Expect(":_H:CGR1:MOD3:CONN1:BER?", "1000000,2,2.000000000000E-006");
  // ... and everything that follows the dirty flag reads anew, answered as a server would.
  Inst().SetHandler([](const Dstring& cmd, Dstring& reply) {
    EXPECT_TRUE(AnswerAsServer(cmd, reply)) << "unexpected command: " << cmd;
    return 0;
  });
  Tick();
  EXPECT_FALSE(uiapp::GetGuiLockDs()->IsLocked());
  EXPECT_TRUE(uiapp::GetRunStopDs()->IsRunning());
  EXPECT_EQ(uiapp::GetSystemState(), kSysRunning);
  ASSERT_EQ(uiapp::GetBerSvr()->GetResults().size(), 1u);
  EXPECT_EQ(uiapp::GetBerSvr()->GetResults()[0].errors, 2u);
  // Running: the next tick also reads the error counts.
  Inst().Expect("_H:DFL?", "");
  Inst().Expect(":_H:CGR1:MOD3:CONN1:BER?", "1000000,3,3.000000000000E-006");
  Tick();
  EXPECT_EQ(uiapp::GetBerSvr()->GetResults()[0].errors, 3u);
  // A view of the error state adds each port's channels to the same frame.
  uiapp::GetBerSvr()->WantChannels(true);
  Inst().Expect("_H:DFL?", "");
  Inst().Expect(":_H:CGR1:MOD3:CONN1:BER?;:_H:CGR1:MOD3:CONN1:BER:CHAN?", "1000000,4,4.000000000000E-006;1,0,3");
  Tick();
  EXPECT_EQ(uiapp::GetBerSvr()->GetResults()[0].channels, (std::vector<unsigned long long>{1, 0, 3}));
  uiapp::GetBerSvr()->WantChannels(false);
}

TEST_F(UiappTest, TickDuringTheSynchronousPartNeitherSetsTheFlagNorPolls) {
  uiapp::StartPolling();
  uiapp::GetDirtyFlagDs()->ForceUpdate();
  // Told during the synchronous part: the next tick comes right then, and the loop ends.
  struct Reentry {
    static int Proc(QenDs*, void* self, ConditionList&) {
      static_cast<UiappTest*>(self)->mNow += 1.0;
      uiapp::AsyncAlarmProc(nullptr);
      uiapp::MainLoopExit();
      return 0;
    }
  };
  uiapp::GetDirtyFlagDs()->RegisterProc(&Reentry::Proc, this);
  int calls = 0;
  Inst().SetHandler([&calls](const Dstring& cmd, Dstring& reply) {
    // A loop that never ends would otherwise hang the test.
    if (++calls > 100) uiapp::MainLoopExit();
    AnswerAsServer(cmd, reply);
    return 0;
  });
  uiapp::MainLoop();
  EXPECT_LT(calls, 100);
  EXPECT_FALSE(uiapp::IsSyncAlarmPending());
  EXPECT_FALSE(uiapp::IsProcessingSyncAlarm());
  EXPECT_EQ(std::count(Inst().Sent().begin(), Inst().Sent().end(), "_H:DFL?"), 0);
  EXPECT_TRUE(mToolkit.IsAlarmArmed());
  uiapp::GetDirtyFlagDs()->UnregisterProc(&Reentry::Proc, this);
}

TEST_F(UiappTest, TriggerModeOtherThanSequenceAsksOnce) {
  ExpectRead(":_H:TRIG:MODE", "SEQ");
  EXPECT_EQ(uiapp::CheckTriggerMode(mList), 0);
  EXPECT_TRUE(mToolkit.Questions().empty());

  ExpectRead(":_H:TRIG:MODE", "CLOC");
  mToolkit.QueueAnswer(ToolkitPort::kYes);
  Inst().Expect(":_H:TRIG:MODE SEQ", "");
  Inst().Expect(":VC:_H:TRIG:MODE SEQ", "\":_H:TRIG:MODE\"");
  Inst().Expect(":RC:_H:TRIG:MODE SEQ", "");
  ExpectRead(":_H:TRIG:MODE", "SEQ");
  EXPECT_EQ(uiapp::CheckTriggerMode(mList), 0);
  ASSERT_EQ(mToolkit.Questions().size(), 1u);

  ExpectRead(":_H:TRIG:MODE", "CLOC");
  mToolkit.QueueAnswer(ToolkitPort::kNo);
  EXPECT_EQ(uiapp::CheckTriggerMode(mList), 0);
  EXPECT_EQ(mToolkit.Questions().size(), 2u);
}

TEST_F(UiappTest, RunAndSequenceForceSendTheirCommands) {
  Inst().Expect("_H:SGEN:GLOB:INIT:CONT ON", "");
  Inst().Expect(":_H:SGEN:GLOB:SEQ:FORC", "");
  Inst().Expect("_H:SGEN:GLOB:INIT:CONT OFF", "");
  EXPECT_EQ(uiapp::Run(mList), 0);
  EXPECT_TRUE(uiapp::GetRunStopDs()->IsRunning());
  EXPECT_EQ(uiapp::SequenceForce(mList), 0);
  uiapp::NfyDelayedStop(nullptr);
  EXPECT_FALSE(uiapp::GetRunStopDs()->IsRunning());
}

TEST_F(UiappTest, ErrorDialogJoinsTheConditions) {
  ConditionList list;
  list.Add(-222, "Data out of range");
  list.Add(0, "  Unable to parse error message ");
  QenGuiInst::ShowErrorDlg(list, 1);
  ASSERT_EQ(mToolkit.Alerts().size(), 1u);
  EXPECT_EQ(mToolkit.Alerts()[0],
            "ERROR -222\n\nData out of range.\n----------\nERROR 0\n\nUnable to parse error message.");
}

TEST_F(UiappTest, WindowsAndScriptItemsAreRegistered) {
  uiapp::RegisterWindows();
  EXPECT_EQ(mToolkit.Windows().size(), 13u);
  EXPECT_TRUE(mToolkit.Windows().count("errstate.ErrStateWin"));
  uiapp::UnregisterWindows();
  EXPECT_TRUE(mToolkit.Windows().empty());
  uiapp::RegisterConstants();
  uiapp::RegisterEvents();
  uiapp::RegisterVerbs();
  EXPECT_GT(mToolkit.ScriptItemCount(), 10u);
}

namespace {

const std::map<Dstring, WireReply> kCoreReplies = {
    {":QEN:INST:HAND:CRE? _RES,\"PSX\",\"RES\"", {"_RES"}},
    {":_H:TRIG:MODE?;:_H:TRIG:MODE? CLAS", {"SEQ;0"}},
    {":_H:BAD", {"", 1}},
    {":_H:SYST:ERR?", {"0,\"No error\""}},
};

// The application core's command texts, to the byte.
const WireRow kCoreRows[] = {
    {"create handle",
     [](ConditionList& l) {
       Dstring handle = "_RES";
       return uiapp::CreateAppHandle(handle, "RES", l);
     },
     {":QEN:INST:HAND:CRE? _RES,\"PSX\",\"RES\""}},
    {"destroy handle", [](ConditionList& l) { return uiapp::DestroyAppHandle("_H", l); },
     {":QEN:INST:HAND:DEST _H"}},
    {"error queue after a failed command",
     [](ConditionList& l) {
       Dstring reply;
       return QenGuiInst::Call(":_H:BAD", reply, l) == 1 ? 0 : 1;
     },
     {":_H:BAD", ":_H:SYST:ERR?"}},
    {"clear the error queue",
     [](ConditionList&) { return QenGuiInst::ClearErrorQueue(QenGuiInst::GetInstrument(), "_H"); },
     {":_H:SYST:ERR?"}},
    {"run", [](ConditionList& l) { return uiapp::Run(l); }, {"_H:SGEN:GLOB:INIT:CONT ON"}},
    {"stop", [](ConditionList& l) { return uiapp::Stop(l); }, {"_H:SGEN:GLOB:INIT:CONT OFF"}},
    {"force the sequence", [](ConditionList& l) { return uiapp::SequenceForce(l); }, {":_H:SGEN:GLOB:SEQ:FORC"}},
    {"connect", [](ConditionList& l) { return uiapp::Connect(l); }, {"_H:SGEN:GLOB:CONN ON"}},
    {"disconnect", [](ConditionList& l) { return uiapp::Disconnect(l); }, {"_H:SGEN:GLOB:CONN OFF"}},
    {"trigger mode", [](ConditionList& l) { return uiapp::CheckTriggerMode(l); },
     {":_H:TRIG:MODE?;:_H:TRIG:MODE? CLAS"}},
};

class CoreWire : public UiappTest, public testing::WithParamInterface<WireRow> {};

TEST_P(CoreWire, SendsItsTextsToTheByte) { CheckWireRow(GetParam(), Inst(), kCoreReplies, mList); }

INSTANTIATE_TEST_SUITE_P(Table, CoreWire, testing::ValuesIn(kCoreRows), WireRowName);

}  // namespace
