// Long segment work followed over the real socket: progress frames, cancel, and the segment
// left exactly as it was when the client cancels.
#include <gtest/gtest.h>

#include <functional>
#include <utility>
#include <vector>

#include "common/SimProcess.h"
#include "instrument/QenStatus.h"
#include "instrument/QenTcpInstrument.h"
#include "support/Dstring.h"

namespace {

constexpr long kVectors = 4L << 20;  // four steps of work
constexpr long kTraces = 40;         // 20 MiB of states: more than one data block may carry

class Follower : public CallProgress {
 public:
  explicit Follower(std::function<bool(long long, long long)> decide) : mDecide(std::move(decide)) {}
  bool Tick(long long done, long long total) override {
    mTicks.emplace_back(done, total);
    return mDecide(done, total);
  }
  std::vector<std::pair<long long, long long>> mTicks;

 private:
  std::function<bool(long long, long long)> mDecide;
};

class SimLongWorkTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_NE(mSim.Port(), 0);
    ASSERT_EQ(mClient.Connect("127.0.0.1", mSim.Port()), QenStatus::kOk);
    ASSERT_EQ(Call(":QEN:INST:HAND:CRE? _H,\"PSX\",\"SIM\""), 0);
    ASSERT_EQ(Call(":_H:EDIT:SEGM:CRE? \"Long\",MEM"), 0);
    mSegment = Dstring::Format(":_H:EDIT:SEGM%s:PATT", mReply.c_str());
    ASSERT_EQ(Call(mSegment + Dstring::Format(":MOD:INS 0,TRAC,BEF,%ld", kTraces)), 0);
    ASSERT_EQ(Call(mSegment + Dstring::Format(":MOD:INS 0,VECT,BEF,%ld", kVectors)), 0);
    // Some contents that a fill or an insert would visibly change.
    ASSERT_EQ(Call(mSegment + Dstring::Format(":MOD:FILL 0,0,3,%ld,1", kVectors - 1)), 0);
  }

  int Call(const Dstring& cmd) { return mClient.Call(cmd, mReply); }

  // All states, in blocks of eight traces (4 MiB) each.
  Dstring Contents() {
    Dstring all;
    for (long t0 = 0; t0 < kTraces; t0 += 8) {
      Dstring data;
      const Dstring read = Dstring::Format(":DATA? %ld,0,%ld,%ld,BIN", t0, t0 + 7, kVectors - 1);
      EXPECT_EQ(mClient.Call(mSegment + read, data), 0);
      all += data;
    }
    return all;
  }

  Dstring NextError() {
    Dstring error;
    mClient.Call(":_H:SYST:ERR?", error);
    return error;
  }

  SimProcess mSim;
  QenTcpInstrument mClient;
  Dstring mReply;
  Dstring mSegment;
};

struct LongCommand {
  const char* name;
  const char* command;  // after the segment's ":PATT"
};

class SimLongWorkCancel : public SimLongWorkTest, public ::testing::WithParamInterface<LongCommand> {};

TEST_P(SimLongWorkCancel, CancelledWorkLeavesTheSegmentAsItWas) {
  ASSERT_EQ(Call(":_H:EDIT:SEGM:PACE 20"), 0);
  const Dstring before = Contents();
  Follower cancelAtFirstNews([](long long done, long long) { return done > 0; });
  mClient.SetCallProgress(&cancelAtFirstNews);
  const int status = Call(mSegment + GetParam().command);
  mClient.SetCallProgress(nullptr);
  EXPECT_EQ(status, 1);
  EXPECT_EQ(NextError(), Dstring::Format("%d,\"Cancelled by the client\"", QenStatus::kCancelledError));
  // Ticks before the first progress frame know nothing yet (-1); the one that cancelled knew.
  ASSERT_FALSE(cancelAtFirstNews.mTicks.empty());
  EXPECT_GT(cancelAtFirstNews.mTicks.back().first, 0);
  EXPECT_LT(cancelAtFirstNews.mTicks.back().first, cancelAtFirstNews.mTicks.back().second);
  ASSERT_EQ(Call(mSegment + ":LENG?;" + mSegment + ":WIDT?"), 0);
  EXPECT_EQ(mReply, Dstring::Format("%ld;%ld", kVectors, kTraces));
  EXPECT_TRUE(Contents() == before) << "the cancelled work was not put back";
}

INSTANTIATE_TEST_SUITE_P(
    Commands, SimLongWorkCancel,
    ::testing::Values(LongCommand{"Fill", ":MOD:FILL 0,0,39,4194303,0"}, LongCommand{"Invert", ":MOD:INV 0,0,39,4194303"},
                      LongCommand{"InsertVectors", ":MOD:INS 100,VECT,AFT,4194304"},
                      LongCommand{"InsertTraces", ":MOD:INS 3,TRAC,BEF,3"},
                      LongCommand{"Find", ":FIND:FIRS? \"FFH\", VECT, RVS"}),
    [](const ::testing::TestParamInfo<LongCommand>& info) { return info.param.name; });

TEST_F(SimLongWorkTest, AFollowedFillReportsEveryStepAndEndsLikeAnUnfollowedOne) {
  Follower watch([](long long, long long) { return false; });
  mClient.SetCallProgress(&watch);
  ASSERT_EQ(Call(mSegment + Dstring::Format(":MOD:FILL 0,0,%ld,%ld,1", kTraces - 1, kVectors - 1)), 0);
  mClient.SetCallProgress(nullptr);
  ASSERT_FALSE(watch.mTicks.empty());
  for (std::size_t i = 1; i < watch.mTicks.size(); ++i) EXPECT_GE(watch.mTicks[i].first, watch.mTicks[i - 1].first);
  EXPECT_EQ(watch.mTicks.back().first, kVectors);
  EXPECT_EQ(watch.mTicks.back().second, kVectors);
  const Dstring block = "#74194304" + Dstring(static_cast<std::size_t>(kVectors), '\xff');
  EXPECT_TRUE(Contents() == block + block + block + block + block);
}

TEST_F(SimLongWorkTest, ACallMadeWhileAnotherWaitsIsRefusedAndTheFirstCompletes) {
  ASSERT_EQ(Call(":_H:EDIT:SEGM:PACE 20"), 0);
  int nested = 0;
  Dstring nestedReply;
  Follower reenter([&](long long, long long) {
    if (nested == 0) nested = mClient.Call(":_H:SYST:ERR?", nestedReply);
    return false;
  });
  mClient.SetCallProgress(&reenter);
  const int status = Call(mSegment + ":MOD:FILL 4,0,39,4194303,1");
  mClient.SetCallProgress(nullptr);
  EXPECT_EQ(nested, QenStatus::kCallBusy);
  EXPECT_EQ(status, 0);
  ASSERT_EQ(Call(mSegment + ":DATA? 0,4194303,7,4194303,BIN"), 0);
  // The last vector of each trace as the most significant bit of its row's byte.
  EXPECT_EQ(mReply, "#500008" + Dstring(8, '\x80'));
  EXPECT_EQ(NextError(), "0,\"No error\"");
}

}  // namespace
