#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <vector>

#include "common/SimProcess.h"
#include "instrument/AppHandle.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "instrument/QenTcpInstrument.h"
#include "support/FWBlocker.h"
#include "toolkit/HeadlessToolkit.h"
#include "toolkit/Toolkit.h"

namespace {

// A host's waiter: runs what the test gives it on every slice of a wait.
class ScriptedWaiter : public CallWaiter {
 public:
  bool Wait(const Dstring& cmd, long long waitedMs) override {
    ++mSlices;
    mLastWaitedMs = waitedMs;
    mCommands.push_back(cmd);
    return mOnSlice ? mOnSlice() : false;
  }
  void WaitEnded() override { ++mEnded; }

  std::function<bool()> mOnSlice;
  int mSlices = 0;
  int mEnded = 0;
  long long mLastWaitedMs = 0;
  std::vector<Dstring> mCommands;
};

class CallWaitTest : public testing::Test {
 protected:
  static void SetUpTestSuite() { sSim = new SimProcess(); }
  static void TearDownTestSuite() {
    delete sSim;
    sSim = nullptr;
  }
  void SetUp() override {
    ASSERT_NE(sSim->Port(), 0);
    Toolkit::Install(&mToolkit);
    QenGuiInst::Init();
    QenGuiInst::SetServerDeathHandler([this](const Dstring& m) { mDeaths.push_back(m); });
    auto inst = std::make_unique<QenTcpInstrument>();
    ASSERT_EQ(inst->Connect("127.0.0.1", sSim->Port()), 0);
    mTcp = inst.get();
    Dstring handle = "_W";
    ASSERT_EQ(AppHandle::Create(inst.get(), handle, "W", mList), 0);
    QenGuiInst::SetInstrument(std::move(inst));
    QenGuiInst::SetAppHandle(handle);
    QenGuiInst::SetCallWaiter(&mWaiter);
  }
  void TearDown() override {
    QenGuiInst::SetCallWaiter(nullptr);
    QenGuiInst::End();
    Toolkit::Install(nullptr);
  }
  int Call(const Dstring& cmd, Dstring& reply) { return QenGuiInst::Call(cmd, reply, mList); }
  // The next reply of this connection comes `ms` late.
  void DelayNext(int ms) {
    Dstring reply;
    ASSERT_EQ(Call(Dstring::Format(":TEST:DELAY %d,1", ms), reply), 0);
  }

  static inline SimProcess* sSim = nullptr;
  HeadlessToolkit mToolkit;
  ScriptedWaiter mWaiter;
  QenTcpInstrument* mTcp = nullptr;
  ConditionList mList;
  std::vector<Dstring> mDeaths;
};

TEST_F(CallWaitTest, AFastReplyNeverWakesTheWaiter) {
  Dstring reply;
  ASSERT_EQ(Call(":_W:TRIG:MODE?", reply), 0);
  EXPECT_EQ(reply, "SEQ");
  EXPECT_EQ(mWaiter.mSlices, 0);
  EXPECT_EQ(mWaiter.mEnded, 1);
}

TEST_F(CallWaitTest, ASlowReplyIsWaitedForInSlicesUnderTheWaitRule) {
  DelayNext(300);
  int blocked = 0;
  mWaiter.mOnSlice = [&] {
    ConditionList list;
    FWBlocker guard("uiapp::Run", list);
    if (guard.Block() == FWBlocker::kBusy && list.Size() == 1) ++blocked;
    return false;
  };
  Dstring reply;
  ASSERT_EQ(Call(":_W:TRIG:MODE?", reply), 0);
  EXPECT_EQ(reply, "SEQ");
  // Slices of about 10 ms: far more than the three a 100 ms slice would give.
  EXPECT_GE(mWaiter.mSlices, 10);
  EXPECT_EQ(blocked, mWaiter.mSlices);
  EXPECT_GE(mWaiter.mLastWaitedMs, 250);
  EXPECT_EQ(mWaiter.mCommands.back(), ":_W:TRIG:MODE?");
  ConditionList after;
  FWBlocker guard("uiapp::Run", after);
  EXPECT_EQ(guard.Block(), 0) << "the rule ends with the wait";
}

TEST_F(CallWaitTest, ACommandTriedDuringTheWaitIsRefusedAndNeverInterleaved) {
  DelayNext(200);
  std::vector<int> nested;
  mWaiter.mOnSlice = [&] {
    if (nested.empty()) {
      Dstring inner;
      ConditionList list;
      nested.push_back(QenGuiInst::Call(":_W:CGR1:PER?", inner, list));
      nested.push_back(static_cast<int>(list.Size()));
      nested.push_back(inner.empty() ? 0 : 1);
    }
    return false;
  };
  Dstring reply;
  ASSERT_EQ(Call(":_W:TRIG:MODE?", reply), 0);
  EXPECT_EQ(reply, "SEQ") << "the outer call gets its own reply";
  ASSERT_EQ(nested.size(), 3u);
  EXPECT_EQ(nested[0], QenStatus::kCallBusy);
  EXPECT_EQ(nested[1], 1);
  EXPECT_EQ(nested[2], 0);
  // The stream is in step: the next exchange is its own.
  ASSERT_EQ(Call(":_W:TRIG:MODE?", reply), 0);
  EXPECT_EQ(reply, "SEQ");
}

TEST_F(CallWaitTest, WhatWasHeldOffRunsOnceAfterTheOutermostWait) {
  static int runs;
  runs = 0;
  auto proc = [](void*) { ++runs; };
  DelayNext(100);
  mWaiter.mOnSlice = [&] {
    QenGuiInst::RunAfterWait(proc, nullptr);
    EXPECT_TRUE(QenGuiInst::IsWaiting());
    return false;
  };
  Dstring reply;
  ASSERT_EQ(Call(":_W:TRIG:MODE?", reply), 0);
  ASSERT_GT(mWaiter.mSlices, 1);
  EXPECT_EQ(runs, 0) << "deferred to the event loop, never inside the caller's call";
  mToolkit.Update();
  EXPECT_EQ(runs, 1);
  EXPECT_FALSE(QenGuiInst::IsWaiting());
}

TEST_F(CallWaitTest, ATimeOutNamesTheCommandAndItsLateReplyIsNeverTakenForTheNext) {
  mTcp->SetReplyTimeoutMs(150);
  DelayNext(600);
  Dstring reply;
  EXPECT_EQ(Call(":_W:CGR1:PER?", reply), QenStatus::kTimeOut);
  ASSERT_EQ(mList.Size(), 1u);
  EXPECT_EQ(mList[0].GetCode(), QenStatus::kTimeOut);
  EXPECT_EQ(mList[0].GetMessage(), "The instrument server did not answer :_W:CGR1:PER? within 0.15 s");
  mTcp->SetReplyTimeoutMs(5000);
  ASSERT_EQ(Call(":_W:TRIG:MODE?", reply), 0);
  EXPECT_EQ(reply, "SEQ") << "not the late period";
  EXPECT_TRUE(mDeaths.empty());
}

TEST_F(CallWaitTest, GivingUpAWaitClosesTheConnectionWithoutCallingTheServerDead) {
  DelayNext(5000);
  mWaiter.mOnSlice = [&] { return mWaiter.mSlices >= 3; };
  Dstring reply;
  EXPECT_EQ(Call(":_W:TRIG:MODE?", reply), QenStatus::kAbandoned);
  ASSERT_EQ(mList.Size(), 1u);
  EXPECT_EQ(mList[0].GetCode(), QenStatus::kAbandoned);
  EXPECT_FALSE(mTcp->IsConnected());
  mList.Clear();
  EXPECT_EQ(Call(":_W:TRIG:MODE?", reply), QenStatus::kNotConnected);
  EXPECT_TRUE(mDeaths.empty());
}

TEST_F(CallWaitTest, ADisconnectAskedDuringTheWaitEndsTheCallWithoutFreeingItsConnection) {
  DelayNext(5000);
  mWaiter.mOnSlice = [&] {
    ConditionList list;
    QenGuiInst::DisconnectFromServer(list);
    return false;
  };
  Dstring reply;
  EXPECT_EQ(Call(":_W:TRIG:MODE?", reply), QenStatus::kNotConnected);
  EXPECT_EQ(QenGuiInst::GetInstrument(), mTcp);
  EXPECT_TRUE(mDeaths.empty());
}

}  // namespace

namespace {

TEST(CallWaitDeath, TheServerDyingDuringAWaitEndsAsAServerDeath) {
  SimProcess sim;
  ASSERT_NE(sim.Port(), 0);
  HeadlessToolkit toolkit;
  Toolkit::Install(&toolkit);
  QenGuiInst::Init();
  std::vector<Dstring> deaths;
  QenGuiInst::SetServerDeathHandler([&](const Dstring& m) { deaths.push_back(m); });
  auto inst = std::make_unique<QenTcpInstrument>();
  ASSERT_EQ(inst->Connect("127.0.0.1", sim.Port()), 0);
  QenGuiInst::SetInstrument(std::move(inst));
  ScriptedWaiter waiter;
  QenTcpInstrument killer;
  ASSERT_EQ(killer.Connect("127.0.0.1", sim.Port()), 0);
  waiter.mOnSlice = [&] {
    Dstring ignored;
    if (waiter.mSlices == 1) killer.Call(":TEST:DIE", ignored);
    return false;
  };
  QenGuiInst::SetCallWaiter(&waiter);
  ConditionList list;
  Dstring reply;
  ASSERT_EQ(QenGuiInst::Call(":TEST:DELAY 10000,1", reply, list), 0);
  EXPECT_EQ(QenGuiInst::Call(":QEN:INST:HAND:CRE? _D,\"PSX\",\"D\"", reply, list), QenStatus::kServerTerminated);
  ASSERT_EQ(deaths.size(), 1u);
  EXPECT_EQ(deaths[0], QenGuiInst::kServerDeathMessage);
  EXPECT_EQ(waiter.mEnded, 2);
  QenGuiInst::SetCallWaiter(nullptr);
  QenGuiInst::End();
  Toolkit::Install(nullptr);
}

}  // namespace
