#include <gtest/gtest.h>

#include "common/InstrumentFixture.h"
#include "data/DataPortOneLockDs.h"
#include "data/DirtyFlagDs.h"
#include "data/PLLStateDs.h"
#include "data/RunStopDs.h"
#include "data/SystemStateDs.h"

namespace {

class CountingView : public QenDsView {
 public:
  int NfyViewDataUpdated(QenDs*, ConditionList&) override { return ++mTold, 0; }
  int Match(const Dstring& name) override { return name == ":_H:WATCHED"; }
  int mTold = 0;
};

using StateSourcesTest = InstrumentFixture;

}  // namespace

TEST_F(StateSourcesTest, SystemStateNotifiesOnlyOnChangeAndIgnoresUnknownWords) {
  auto* state = new SystemStateDs;
  CountingView view;
  state->RegisterView(&view, mList);
  for (const char* reply : {"RUNN", "RUNN", "BOGUS", "HALT"}) Inst().Expect("_H:SGEN:GLOB:SYST:STAT?", reply);
  for (int i = 0; i < 4; ++i) EXPECT_EQ(state->UpdateFromFW(mList), 0);
  EXPECT_EQ(view.mTold, 2);
  EXPECT_EQ(state->GetState(), kSysHalt);
  state->UnregisterView(&view, mList);
  state->Release();
}

struct PllCase {
  const char* reply;
  PLLStateEnum state;
};

class PllMapping : public testing::TestWithParam<PllCase> {};

TEST_P(PllMapping, Table) { EXPECT_EQ(PLLStateDs::FromReply(GetParam().reply), GetParam().state); }

INSTANTIATE_TEST_SUITE_P(Table, PllMapping,
                         testing::Values(PllCase{"LOCK", kPllLock}, PllCase{"UNKN", kPllUnknown},
                                         PllCase{"UCDR", kPllUnlockedCdr}, PllCase{"UDAT", kPllUnlockedData},
                                         PllCase{"lock", kPllUnlocked}, PllCase{"", kPllUnlocked}));

TEST_F(StateSourcesTest, FailedQueryLeavesTheValue) {
  auto* run = new RunStopDs;
  Inst().Expect("_H:SGEN:GLOB:INIT:CONT?", "ON");
  Inst().Expect("_H:SGEN:GLOB:INIT:CONT?", "", -3);
  EXPECT_EQ(run->UpdateFromFW(mList), 0);
  EXPECT_EQ(run->UpdateFromFW(mList), -3);
  EXPECT_TRUE(run->IsRunning());
  Inst().Expect("_H:SGEN:GLOB:INIT:CONT OFF", "");
  EXPECT_EQ(run->Stop(mList), 0);
  EXPECT_FALSE(run->IsRunning());
  run->Release();
}

TEST_F(StateSourcesTest, DirtyFlagTellsAMatchingViewOnceAndOthersNever) {
  auto* dirty = new DirtyFlagDs;
  CountingView watched;
  auto* run = new RunStopDs;
  dirty->RegisterView(&watched, mList);
  dirty->RegisterView(run, mList);
  Inst().Expect("_H:DFL?", "");
  Inst().Expect("_H:DFL?", "\":_H:WATCHED\",\":_H:WATCHED\"");
  Inst().Expect("_H:DFL?", "\":_H:SGEN:GLOB:INIT:CONT\"");
  Inst().Expect("_H:SGEN:GLOB:INIT:CONT?", "ON");
  for (int i = 0; i < 3; ++i) EXPECT_EQ(dirty->UpdateFromFW(mList), 0);
  EXPECT_EQ(watched.mTold, 1);
  EXPECT_TRUE(run->IsRunning());

  dirty->ForceUpdate();
  EXPECT_TRUE(dirty->IsDirty());
  Inst().Expect("_H:SGEN:GLOB:INIT:CONT?", "ON");
  EXPECT_EQ(dirty->Update(mList), 0);
  EXPECT_FALSE(dirty->IsDirty());
  EXPECT_FALSE(dirty->IsInFWUpdate());
  EXPECT_EQ(watched.mTold, 2);
  dirty->UnregisterView(&watched, mList);
  dirty->UnregisterView(run, mList);
  run->Release();
  dirty->Release();
}

TEST_F(StateSourcesTest, DataPortOneLockFollowsTheLockableModule) {
  auto* lock = new DataPortOneLockDs;
  Inst().Expect(":SR:_H:CGR@:MOD1:CONN1:PULS:DEL", "2");
  Inst().Expect(":SR:_H:CGR2:MOD@:CONN1:PULS:DEL", "3");
  Inst().Expect(":_H:CGR2:MOD3:TYPE?", "\"K2269B\"");
  Inst().Expect(":_H:CGR2:MOD3:UCAS?", "DMUX");
  EXPECT_EQ(lock->UpdateFromFW(mList), 0);
  EXPECT_EQ(lock->GetState(), kDataPortDemux);
  EXPECT_EQ(lock->getFoundCmdPath(), ":CGR2:MOD3:UCAS");
  EXPECT_TRUE(lock->Match(":_H:CGR2:MOD3:UCAS"));

  Inst().Expect(":SR:_H:CGR@:MOD1:CONN1:PULS:DEL", "1");
  Inst().Expect(":SR:_H:CGR1:MOD@:CONN1:PULS:DEL", "1");
  Inst().Expect(":_H:CGR1:MOD1:TYPE?", "\"K2270A\"");
  EXPECT_EQ(lock->UpdateFromFW(mList), 0);
  EXPECT_EQ(lock->GetState(), kDataPortNotLockable);

  Inst().Expect(":SR:_H:CGR@:MOD1:CONN1:PULS:DEL", "one");
  EXPECT_EQ(lock->UpdateFromFW(mList), 1);
  EXPECT_TRUE(mList.HasKey("GUI_STATE_BAD_REPLY"));
  EXPECT_EQ(lock->GetState(), kDataPortNotLockable);
  lock->Release();
}
