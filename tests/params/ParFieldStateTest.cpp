#include <gtest/gtest.h>

#include "common/InstrumentFixture.h"
#include "data/Dte.h"
#include "instrument/QenStatus.h"
#include "params/DsBinding.h"
#include "params/ParFieldState.h"

namespace {

// A parameter field without its widget: the binding, and the state it refreshes.
class Field : public DsBinding::Client {
 public:
  Field() : mBinding(*this, "QenParEd", true) {}
  int Refresh(ConditionList& list) override {
    ++mRefreshes;
    return mState.ReadValue(mBinding, list);
  }
  int RefreshUnits(ConditionList& list) override { return mState.ReadUnits(mBinding, list); }

  DsBinding mBinding;
  ParFieldState mState;
  int mRefreshes = 0;
};

class ParFieldStateTest : public InstrumentFixture {
 protected:
  void SetUp() override {
    InstrumentFixture::SetUp();
    Dte::Init();
  }
  void TearDown() override {
    mField.mBinding.NfyEnd();
    Dte::End();
    InstrumentFixture::TearDown();
  }
  // Binds the field to :_H:VOLT, reading the value and then its attribute.
  int Bind(const Dstring& value, const Dstring& attr) {
    ExpectRead(":_H:VOLT", value);
    ExpectRead(":_H:VOLT:ATTR", attr);
    mField.mBinding.SetDsCmdName(":VOLT", mList);
    mField.mBinding.NfyInit();
    return mField.mBinding.SetDsBaseName(":_H", mList);
  }
  void ExpectWrite(const Dstring& cmd) {
    Inst().Expect(cmd, "");
    Inst().Expect(":VC" + cmd, "\":_H:VOLT\"");
    Inst().Expect(":RC" + cmd, "");
  }

  Field mField;
};

}  // namespace

TEST_F(ParFieldStateTest, TypedValueSteppedUpIsSentInBaseUnits) {
  Bind("1.000000000000E-003", "(\"V\",-3,0,-3,0.100000d)");
  EXPECT_EQ(mField.mState.DisplayText(), "1");
  ExpectWrite(":_H:VOLT 2.600000000000E-003");
  ExpectRead(":_H:VOLT", "2.600000000000E-003");
  EXPECT_EQ(mField.mState.AdjustAndSend("2.5", 1, mField.mBinding, mList), 0);
  EXPECT_EQ(mField.mState.GetLastSent(), "2.600000000000E-003");
  EXPECT_TRUE(mList.IsEmpty()) << mList.ToText();
}

// What a commit makes of the text, with the field at 2 mV: what goes out and what it says.
struct CommitCase {
  const char* text;
  const char* sent;  // the value written, or null
  const char* notice;
};

class Commits : public ParFieldStateTest, public testing::WithParamInterface<CommitCase> {};

TEST_P(Commits, SendTheLeadingNumberAndSayWhatWasLeftOut) {
  const CommitCase& c = GetParam();
  Bind("2.000000000000E-003", "(\"V\",-3,0,-3,0.100000d)");
  const std::size_t sent = Inst().Sent().size();
  if (c.sent != nullptr) {
    ExpectWrite(Dstring(":_H:VOLT ") + c.sent);
    ExpectRead(":_H:VOLT", c.sent);
  }
  EXPECT_EQ(mField.mState.AdjustAndSend(c.text, 0, mField.mBinding, mList), 0) << mList.ToText();
  EXPECT_EQ(mField.mState.GetNotice(), c.notice);
  if (c.sent == nullptr) {
    EXPECT_EQ(Inst().Sent().size(), sent);
  }
  EXPECT_TRUE(mList.IsEmpty()) << mList.ToText();
}

INSTANTIATE_TEST_SUITE_P(
    Texts, Commits,
    testing::Values(CommitCase{"", nullptr, ""}, CommitCase{"2", nullptr, ""}, CommitCase{"2 mV", nullptr, ""},
                    CommitCase{"2 V", nullptr, "nothing sent, 2 mV is already set; \"V\" ignored: this field is in mV"},
                    CommitCase{"3  ", "3.000000000000E-003", ""},
                    CommitCase{"2.5x", "2.500000000000E-003", "2.5 mV sent; \"x\" ignored: this field is in mV"},
                    CommitCase{"500m", "5.000000000000E-001", "500 mV sent; \"m\" ignored: this field is in mV"},
                    CommitCase{"abc", "0.000000000000E+000", "0 mV sent; \"abc\" ignored: this field is in mV"},
                    CommitCase{"   ", "0.000000000000E+000", "0 mV sent; \"   \" ignored: this field is in mV"}));

TEST_F(ParFieldStateTest, TextWithoutANumberSendsZeroAndAHugeOneNothing) {
  Bind("2.000000000000E-003", "(\"V\",-3,0,-3,0.100000d)");
  EXPECT_EQ(mField.mState.AdjustAndSend("1e400", 0, mField.mBinding, mList), 1);
  ASSERT_EQ(mList.Size(), 1u);
  EXPECT_NE(mList[0].GetMessage().find("1e400"), Dstring::npos);
  ExpectWrite(":_H:VOLT 0.000000000000E+000");
  ExpectRead(":_H:VOLT", "0.000000000000E+000");
  EXPECT_EQ(mField.mState.AdjustAndSend("volts", 0, mField.mBinding, mList), 0);
}

TEST_F(ParFieldStateTest, AValueTheServerClampedIsReportedOnce) {
  Bind("1.000000000000E+000", "(\"V\",-3,0,0,0.100000d)");
  ExpectWrite(":_H:VOLT 7.000000000000E+000");
  ExpectRead(":_H:VOLT", "5.000000000000E+000");
  ASSERT_EQ(mField.mState.AdjustAndSend("7", 0, mField.mBinding, mList), 0);
  double asked = 0;
  double held = 0;
  ASSERT_TRUE(mField.mState.TakeAdjusted(asked, held));
  EXPECT_DOUBLE_EQ(asked, 7.0);
  EXPECT_DOUBLE_EQ(held, 5.0);
  EXPECT_FALSE(mField.mState.TakeAdjusted(asked, held));
}

TEST_F(ParFieldStateTest, NoValueShowsEmpty) {
  Bind("9.91E37", "(\"V\",-3,0,0,0.100000d)");
  EXPECT_TRUE(mField.mState.IsNoValue());
  EXPECT_EQ(mField.mState.DisplayText(), "");
}

TEST_F(ParFieldStateTest, AMalformedAttributeKeepsTheRecord) {
  EXPECT_EQ(Bind("1.000000000000E-003", "(\"V\",oops,0,-6,0.1)"), 1);
  mList.Clear();
  EXPECT_EQ(mField.mState.ReadUnits(mField.mBinding, mList), 1);
  ASSERT_EQ(mList.Size(), 1u);
  EXPECT_NE(mList[0].GetMessage().find("oops"), Dstring::npos);
  EXPECT_EQ(mField.mState.GetUnits().curExp, UnitsRecord::kExpNotSet);
  EXPECT_EQ(mField.mState.DisplayText(), "0.001");
  EXPECT_TRUE(mField.mBinding.IsFailed());
  EXPECT_NE(mField.mBinding.GetReadFailure().find("oops"), Dstring::npos);
  ExpectRead(":_H:VOLT:ATTR", "(\"V\",-3,0,-3,0.100000d)");
  EXPECT_EQ(Dte::UpdateDsByName(":_H:VOLT:ATTR", mList), 0) << mList.ToText();
  EXPECT_FALSE(mField.mBinding.IsFailed());
}

TEST_F(ParFieldStateTest, LockDuringACommitIsPassedUpWithoutACondition) {
  Bind("1.000000000000E+000", "(\"V\",-3,0,0,0.100000d)");
  Inst().Expect(":_H:VOLT 3.000000000000E+000", "", QenStatus::kLocked);
  EXPECT_EQ(mField.mState.AdjustAndSend("3x", 0, mField.mBinding, mList), QenStatus::kLocked);
  EXPECT_TRUE(mList.IsEmpty()) << mList.ToText();
  EXPECT_EQ(mField.mState.GetNotice(), "");
  EXPECT_EQ(mField.mBinding.GetLastError(), "");
}

TEST_F(ParFieldStateTest, MovingTheBaseNameMovesTheRegistration) {
  Bind("1.000000000000E+000", "(\"V\",-3,0,0,0.100000d)");
  const int before = mField.mRefreshes;
  ExpectRead(":_J:VOLT", "2");
  ExpectRead(":_J:VOLT:ATTR", "(\"V\",-3,0,0,0.100000d)");
  ASSERT_EQ(mField.mBinding.SetDsBaseName(":_J", mList), 0);
  EXPECT_EQ(mField.mRefreshes, before + 1);
  EXPECT_EQ(Dte::GetDsByName(":_H:VOLT"), nullptr) << "the old source is still held";
  EXPECT_DOUBLE_EQ(mField.mState.GetValue(), 2.0);
}

TEST_F(ParFieldStateTest, DesignModeNeitherBindsNorSends) {
  DsBinding::SetDesignMode(true);
  mField.mBinding.NfyInit();
  EXPECT_EQ(mField.mBinding.SetDsBaseName(":_H", mList), 0);
  EXPECT_EQ(mField.mBinding.SetDsCmdName(":VOLT", mList), 0);
  EXPECT_EQ(mField.mState.AdjustAndSend("3", 0, mField.mBinding, mList), 0);
  DsBinding::SetDesignMode(false);
  EXPECT_TRUE(Inst().Sent().empty());
  EXPECT_EQ(Dte::NumSources(), 0u);
  mField.mBinding.NfyEnd();
}
