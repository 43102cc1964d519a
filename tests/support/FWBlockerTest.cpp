#include <gtest/gtest.h>

#include "support/FWBlocker.h"

namespace {

class FakeProbe : public FWBlocker::LockProbe {
 public:
  bool IsInstrumentLocked() override {
    ++mAsked;
    return mLocked;
  }
  bool mLocked = false;
  int mAsked = 0;
};

class FWBlockerTest : public testing::Test {
 protected:
  void SetUp() override { FWBlocker::SetLockProbe(&mProbe); }
  void TearDown() override { FWBlocker::SetLockProbe(nullptr); }
  FakeProbe mProbe;
  ConditionList mList;
};

}  // namespace

TEST_F(FWBlockerTest, LockedInstrumentBlocksWithoutACondition) {
  mProbe.mLocked = true;
  FWBlocker guard("uiapp::Run", mList);
  EXPECT_EQ(guard.Block(), -19);
  EXPECT_EQ(guard.Block(), -19);
  EXPECT_EQ(mProbe.mAsked, 1);
  EXPECT_TRUE(mList.IsEmpty());
}

TEST_F(FWBlockerTest, ReentryUnderTheSameNameIsRefused) {
  FWBlocker outer("CSequence::DeleteBlock", mList);
  ASSERT_EQ(outer.Block(), 0);
  {
    FWBlocker other("uiapp::Run", mList);
    EXPECT_EQ(other.Block(), 0);
    FWBlocker inner("CSequence::DeleteBlock", mList);
    EXPECT_EQ(inner.Block(), FWBlocker::kBusy);
  }
  ASSERT_EQ(mList.Size(), 1u);
  EXPECT_EQ(mList[0].GetKey(), "GUI_OPERATION_BUSY");
}

TEST_F(FWBlockerTest, SameNameRunsAgainOnceTheOuterCallEnded) {
  { FWBlocker first("UnitEd::Refresh", mList); EXPECT_EQ(first.Block(), 0); }
  FWBlocker second("UnitEd::Refresh", mList);
  EXPECT_EQ(second.Block(), 0);
}

TEST_F(FWBlockerTest, NotificationAndWriteNestByDesignButStillSeeTheLock) {
  FWBlocker outerUpdate("QenDs::Update", mList);
  FWBlocker outerWrite("Dte::Write", mList);
  FWBlocker innerUpdate("QenDs::Update", mList);
  FWBlocker innerWrite("Dte::Write", mList);
  EXPECT_EQ(innerUpdate.Block(), 0);
  EXPECT_EQ(innerWrite.Block(), 0);
  mProbe.mLocked = true;
  FWBlocker lockedUpdate("QenDs::Update", mList);
  EXPECT_EQ(lockedUpdate.Block(), -19);
  EXPECT_TRUE(mList.IsEmpty());
}

TEST_F(FWBlockerTest, WhileACommandWaitsEveryOperationIsBusyButTheLockStillWins) {
  FWBlocker running("QenSegmentDs::ModifyFill", mList);
  ASSERT_EQ(running.Block(), 0);
  {
    const FWBlocker::WaitScope waiting;
    FWBlocker poll("uiapp::AsyncTimeOut", mList);
    EXPECT_EQ(poll.Block(), FWBlocker::kBusy);
    FWBlocker update("QenDs::Update", mList);
    EXPECT_EQ(update.Block(), FWBlocker::kBusy);
    mProbe.mLocked = true;
    FWBlocker locked("uiapp::Run", mList);
    EXPECT_EQ(locked.Block(), -19);
    mProbe.mLocked = false;
  }
  ASSERT_EQ(mList.Size(), 2u);
  EXPECT_EQ(mList[0].GetKey(), "GUI_INSTRUMENT_BUSY");
  FWBlocker after("uiapp::AsyncTimeOut", mList);
  EXPECT_EQ(after.Block(), 0);
}
