#include <gtest/gtest.h>

#include "common/InstrumentFixture.h"
#include "data/DirtyFlagDs.h"
#include "data/Dte.h"
#include "data/QenParamDs.h"
#include "instrument/QenStatus.h"
#include "support/ErrorMgr.h"

#include <utility>

namespace {

// A control bound to a parameter: on each notification it reads the value, as a widget does.
class ValueView : public QenDsView {
 public:
  int NfyViewDataUpdated(QenDs* source, ConditionList& list) override {
    ++mTold;
    return static_cast<QenParamDs*>(source)->QueryStrValue(mShown, list);
  }
  int mTold = 0;
  Dstring mShown;
};

class DteTest : public InstrumentFixture {
 protected:
  void SetUp() override {
    InstrumentFixture::SetUp();
    Dte::Init(&mDirtyFlag, &mErrors);
  }
  void TearDown() override {
    Dte::End();
    InstrumentFixture::TearDown();
  }
  // The exchange that follows every successful write batch.
  void ExpectCoupled(const Dstring& batch, const Dstring& values, const Dstring& limits = "") {
    Inst().Expect(":VC" + batch, values);
    Inst().Expect(":RC" + batch, limits);
  }

  DirtyFlagDs mDirtyFlag;
  ErrorMgr mErrors;
};

}  // namespace

TEST_F(DteTest, SameNameSharesOneSourceUntilTheLastFree) {
  QenParamDs* a = Dte::AllocDsByName(":_H:TRIG:MODE", 0);
  QenParamDs* b = Dte::AllocDsByName(":_h:trig:mode", 0);
  EXPECT_EQ(a, b);
  Dte::FreeDs(a);
  EXPECT_EQ(Dte::GetDsByName(":_H:TRIG:MODE"), b);
  Dte::FreeDs(b);
  EXPECT_EQ(Dte::GetDsByName(":_H:TRIG:MODE"), nullptr);
  EXPECT_EQ(Dte::NumSources(), 0u);
}

TEST_F(DteTest, QueryUsesTheCacheOnceValid) {
  QenParamDs* mode = Dte::AllocDsByName(":_H:TRIG:MODE", 0);
  ExpectRead(":_H:TRIG:MODE", "SEQ");
  Dstring value;
  EXPECT_EQ(mode->QueryStrValue(value, mList), 0);
  EXPECT_EQ(mode->QueryStrValue(value, mList), 0);
  EXPECT_EQ(value, "SEQ");
  EXPECT_EQ(Inst().Sent().size(), 1u);
  Dte::FreeDs(mode);
}

TEST_F(DteTest, WriteRefreshesEveryCoupledSourceInOneReadAndTellsTheirViews) {
  QenParamDs* period = Dte::AllocDsByName(":_H:CGR1:PER", 0);
  QenParamDs* freq = Dte::AllocDsByName(":_H:CGR1:FREQ", 0);
  QenParamDs* delay = Dte::AllocDsByName(":_H:CGR1:MOD1:CONN1:PULS:DEL", 0);
  ValueView periodView, freqView, delayView;
  Dte::RegisterView(period, &periodView, mList, 0);
  Dte::RegisterView(freq, &freqView, mList, 0);
  Dte::RegisterView(delay, &delayView, mList, 0);
  ConditionList earlier;
  earlier.Add(-222, "from an earlier write");
  mErrors.add(earlier);
  Inst().Expect(":_H:CGR1:PER 2E-9", "");
  ExpectCoupled(":_H:CGR1:PER 2E-9", "\":_H:CGR1:PER\",\":_H:CGR1:FREQ\",\":_H:OTHER\"",
                "\":_H:CGR1:MOD1:CONN1:PULS:DEL\"");
  Inst().Expect(":_H:CGR1:FREQ?;:_H:CGR1:FREQ? CLAS;:_H:CGR1:PER?;:_H:CGR1:PER? CLAS",
                "5.000000000000E+008;0;2.000000000000E-009;0");
  ExpectRead(":_H:CGR1:MOD1:CONN1:PULS:DEL", "0.000000000000E+000");
  EXPECT_EQ(period->SetStrValue("2E-9", mList), 0);
  EXPECT_TRUE(mErrors.list()->IsEmpty());
  EXPECT_EQ(periodView.mShown, "2.000000000000E-009");
  EXPECT_EQ(freqView.mShown, "5.000000000000E+008");
  EXPECT_EQ(periodView.mTold, 1);
  EXPECT_EQ(freqView.mTold, 1);
  // The limits changed: told, and its value read when the view asks.
  EXPECT_EQ(delayView.mTold, 1);
  EXPECT_TRUE(mList.IsEmpty()) << mList.ToText();
  period->UnregisterView(&periodView, mList);
  freq->UnregisterView(&freqView, mList);
  delay->UnregisterView(&delayView, mList);
  for (auto* s : {period, freq, delay}) Dte::FreeDs(s);
}

TEST_F(DteTest, TransactionSendsOneBatchInTheOrderOfTheEdits) {
  QenParamDs* ampl = Dte::AllocDsByName(":_H:A", 0);
  Dte::StartTransaction();
  EXPECT_EQ(Dte::SendCmd(":_H:X 1", mList), 0);
  EXPECT_EQ(ampl->SetStrValue("2", mList), 0);
  EXPECT_EQ(Dte::SendCmd(":_H:Y 3", mList), 0);
  EXPECT_TRUE(Inst().Sent().empty());
  Inst().Expect(":_H:X 1;:_H:A 2;:_H:Y 3", "");
  ExpectCoupled(":_H:X 1;:_H:A 2;:_H:Y 3", "");
  EXPECT_EQ(Dte::EndTransaction(mList), 0);
  Dte::FreeDs(ampl);
}

TEST_F(DteTest, FailedWriteMarksTheSourceAndDefersItsRelease) {
  QenParamDs* period = Dte::AllocDsByName(":_H:CGR1:PER", 0);
  Inst().Expect(":_H:CGR1:PER 5", "", 1);
  Inst().Expect(":_H:SYST:ERR?", "-222,\"Data out of range\"");
  Inst().Expect(":_H:SYST:ERR?", "0,\"No error\"");
  EXPECT_EQ(period->SetStrValue("5", mList), 1);
  EXPECT_EQ(mList[0], Condition(-222, "Data out of range"));
  EXPECT_TRUE(Dte::IsFailed());
  Dte::FreeDs(period);
  EXPECT_EQ(Dte::GetDsByName(":_H:CGR1:PER"), period) << "kept so the failure stays visible";
  EXPECT_TRUE(Dte::IsFailed());
  Dte::ReleaseAllFailed();
  EXPECT_EQ(Dte::GetDsByName(":_H:CGR1:PER"), nullptr);
  EXPECT_FALSE(Dte::IsFailed());
}

TEST_F(DteTest, LockedWriteIsNotAFailure) {
  QenParamDs* period = Dte::AllocDsByName(":_H:CGR1:PER", 0);
  Inst().Expect(":_H:CGR1:PER 5", "", QenStatus::kLocked);
  EXPECT_EQ(period->SetStrValue("5", mList), -19);
  EXPECT_FALSE(Dte::IsFailed());
  Dte::FreeDs(period);
}

TEST_F(DteTest, ValueThatWouldBreakTheBatchIsRefusedBeforeSending) {
  QenParamDs* name = Dte::AllocDsByName(":_H:NAME", 0);
  EXPECT_NE(name->SetStrValue("x;:_H:SYST:LOCK ON", mList), 0);
  EXPECT_NE(name->SetStrValue("\"open", mList), 0);
  EXPECT_TRUE(Inst().Sent().empty());
  Inst().Expect(":_H:NAME \"a;b\"", "");
  ExpectCoupled(":_H:NAME \"a;b\"", "");
  EXPECT_EQ(name->SetStrValue("\"a;b\"", mList), 0);
  Dte::FreeDs(name);
}

TEST_F(DteTest, ClashingSourcesAreWrittenWithTheInstrumentStopped) {
  QenParamDs* clashing = Dte::AllocDsByName(":_H:B", 0);
  QenParamDs* written = Dte::AllocDsByName(":_H:A", 0);
  ExpectRead(":_H:B", "8E-10", true);
  Dstring value;
  clashing->QueryStrValue(value, mList);
  ASSERT_TRUE(clashing->IsClashing());
  // The clashing value is sent again with the write, the instrument stopped meanwhile.
  Inst().Expect(":_H:SGEN:GLOB:INIT:CONT?", "ON");
  const Dstring batch = ":_H:SGEN:GLOB:INIT:CONT OFF;:_H:A 1;:_H:B 8E-10;:_H:SGEN:GLOB:INIT:CONT ON";
  Inst().Expect(batch, "");
  ExpectCoupled(batch, "");
  ExpectRead(":_H:B", "8E-10");
  EXPECT_EQ(written->SetStrValue("1", mList), 0);
  EXPECT_FALSE(clashing->IsClashing());

  ExpectRead(":_H:B", "8E-10", true);
  Dte::UpdateDsByName(":_H:B", mList);
  Inst().Expect(":_H:SGEN:GLOB:INIT:CONT?", "OFF");
  Inst().Expect(":_H:A 2;:_H:B 8E-10", "");
  ExpectCoupled(":_H:A 2;:_H:B 8E-10", "");
  ExpectRead(":_H:B", "8E-10", true);
  EXPECT_EQ(written->SetStrValue("2", mList), 0);
  Dte::FreeDs(clashing);
  Dte::FreeDs(written);
}

TEST_F(DteTest, RefreshThatCannotBeReadJoinedLeavesEachViewToAskItself) {
  QenParamDs* a = Dte::AllocDsByName(":_H:A", 0);
  QenParamDs* b = Dte::AllocDsByName(":_H:B", 0);
  ValueView va, vb;
  Dte::RegisterView(a, &va, mList, 0);
  Dte::RegisterView(b, &vb, mList, 0);
  Inst().Expect(":_H:A?;:_H:A? CLAS;:_H:B?;:_H:B? CLAS", "only;three;parts");
  ExpectRead(":_H:A", "1");
  ExpectRead(":_H:B", "2");
  EXPECT_EQ(Dte::Update(mList), 0);
  EXPECT_EQ(va.mShown, "1");
  EXPECT_EQ(vb.mShown, "2");
  a->UnregisterView(&va, mList);
  b->UnregisterView(&vb, mList);
  Dte::FreeDs(a);
  Dte::FreeDs(b);
}

TEST_F(DteTest, DirtyFlagNamesRefreshOnlyTheirSources) {
  QenParamDs* a = Dte::AllocDsByName(":_H:A", 0);
  QenParamDs* b = Dte::AllocDsByName(":_H:B", 0);
  ValueView va, vb;
  Dte::RegisterView(a, &va, mList, 0);
  Dte::RegisterView(b, &vb, mList, 0);
  Inst().Expect("_H:DFL?", "\":_H:B\",\":_H:UNKNOWN\",\":_H:B\"");
  ExpectRead(":_H:B", "7");
  EXPECT_EQ(mDirtyFlag.UpdateFromFW(mList), 0);
  EXPECT_EQ(va.mTold, 0);
  EXPECT_EQ(vb.mTold, 1);
  EXPECT_EQ(vb.mShown, "7");
  Inst().Expect("_H:DFL?", "\"ALL\"");
  Inst().Expect(":_H:A?;:_H:A? CLAS;:_H:B?;:_H:B? CLAS", "9;0;8;0");
  EXPECT_EQ(mDirtyFlag.UpdateFromFW(mList), 0);
  EXPECT_EQ(va.mShown, "9");
  EXPECT_EQ(vb.mShown, "8");
  a->UnregisterView(&va, mList);
  b->UnregisterView(&vb, mList);
  Dte::FreeDs(a);
  Dte::FreeDs(b);
}

TEST_F(DteTest, SubCommandValuesKeepTheirWord) {
  QenParamDs* kind = Dte::AllocDsByName(":_H:SEGM:TYPE", Dte::kSubCmd);
  ExpectRead(":_H:SEGM:TYPE", "\"PRBS 7\"");
  Dstring value;
  EXPECT_EQ(kind->QueryStrValue(value, mList), 0);
  EXPECT_EQ(value, "7");
  EXPECT_EQ(kind->QuerySubCmd(value, mList), 0);
  EXPECT_EQ(value, "PRBS");
  Inst().Expect(":_H:SEGM:TYPE \"PRBS 15\"", "");
  ExpectCoupled(":_H:SEGM:TYPE \"PRBS 15\"", "");
  EXPECT_EQ(kind->SetStrValue("15", mList), 0);
  Inst().Expect(":_H:SEGM:TYPE \"MEM\"", "");
  ExpectCoupled(":_H:SEGM:TYPE \"MEM\"", "");
  EXPECT_EQ(kind->SetSubCmd("MEM", mList), 0);
  Dte::FreeDs(kind);
}

TEST_F(DteTest, LimitsAreAskedEachTime) {
  QenParamDs* ampl = Dte::AllocDsByName(":_H:AMPL", 0);
  Dstring v;
  Inst().Expect(":_H:AMPL? HLIM", "2.5");
  Inst().Expect(":_H:AMPL? LLIM", "0.1");
  Inst().Expect(":_H:AMPL? HMAX", "3");
  Inst().Expect(":_H:AMPL? LMAX", "0");
  EXPECT_EQ(ampl->QueryHLimStrValue(v, mList), 0);
  EXPECT_EQ(ampl->QueryLLimStrValue(v, mList), 0);
  EXPECT_EQ(ampl->QueryHMaxStrValue(v, mList), 0);
  EXPECT_EQ(ampl->QueryLMaxStrValue(v, mList), 0);
  EXPECT_EQ(v, "0");
  ampl->SetReadOnly(1);
  EXPECT_EQ(ampl->SetStrValue("1", mList), 1);
  EXPECT_TRUE(mList.HasKey("GUI_PARAMDS_READONLY"));
  Dte::FreeDs(ampl);
}

TEST_F(DteTest, NamedRegistrationHoldsAReference) {
  ValueView view;
  ExpectRead(":_H:TRIG:MODE", "SEQ");
  EXPECT_EQ(Dte::RegisterView(":_H:TRIG:MODE", &view, mList, 1), 0);
  EXPECT_EQ(view.mShown, "SEQ");
  EXPECT_EQ(Dte::GetDsByName(":_H:TRIG:MODE")->NumRefs(), 1u);
  EXPECT_EQ(Dte::UnregisterView(":_H:TRIG:MODE", &view, mList), 0);
  EXPECT_EQ(Dte::GetDsByName(":_H:TRIG:MODE"), nullptr);
  EXPECT_EQ(Dte::UnregisterView(":_H:TRIG:MODE", &view, mList), 1);
}

// A server that does not know the clash form still answers the value; its refusal of the
// clash query is not the user's error.
TEST_F(DteTest, ReadOfAServerWithoutTheClashFormTakesTheValueAlone) {
  QenParamDs* name = Dte::AllocDsByName(":_H:NAME", 0);
  Inst().Expect(":_H:NAME?;:_H:NAME? CLAS", "\"abc\"", 1);
  Inst().Expect(":_H:SYST:ERR?", "-224,\"Illegal parameter value\"");
  Inst().Expect(":_H:SYST:ERR?", "0,\"No error\"");
  Inst().Expect(":_H:NAME?", "\"abc\"");
  Dstring value = "old";
  EXPECT_EQ(name->QueryStrValue(value, mList), 0);
  EXPECT_EQ(value, "\"abc\"");
  EXPECT_FALSE(name->IsClashing());
  EXPECT_FALSE(name->IsFailed());
  EXPECT_TRUE(mList.IsEmpty()) << mList.ToText();
  // A value read this way is cached like any other.
  EXPECT_EQ(name->QueryStrValue(value, mList), 0);
  Dte::FreeDs(name);
}

// After one refusal, a parameter is asked its value alone, so a server without the clash form
// costs one round trip per refresh again, joined with the parameters that do know it.
TEST_F(DteTest, AParameterWithoutTheClashFormIsRefreshedAloneInTheJoinedRead) {
  QenParamDs* name = Dte::AllocDsByName(":_H:NAME", 0);
  QenParamDs* level = Dte::AllocDsByName(":_H:LEV", 0);
  ValueView vn, vl;
  Dte::RegisterView(name, &vn, mList, 0);
  Dte::RegisterView(level, &vl, mList, 0);
  Inst().Expect(":_H:NAME?;:_H:NAME? CLAS;:_H:LEV?;:_H:LEV? CLAS", "", 1);
  Inst().Expect(":_H:SYST:ERR?", "-224,\"Illegal parameter value\"");
  Inst().Expect(":_H:SYST:ERR?", "0,\"No error\"");
  Inst().Expect(":_H:NAME?;:_H:NAME? CLAS", "", 1);
  Inst().Expect(":_H:SYST:ERR?", "-224,\"Illegal parameter value\"");
  Inst().Expect(":_H:SYST:ERR?", "0,\"No error\"");
  Inst().Expect(":_H:NAME?", "\"abc\"");
  ExpectRead(":_H:LEV", "1.5", true);
  EXPECT_EQ(Dte::Update(mList), 0);
  EXPECT_EQ(vn.mShown, "\"abc\"");
  EXPECT_TRUE(level->IsClashing());

  Inst().Expect(":_H:NAME?;:_H:LEV?;:_H:LEV? CLAS", "\"def\";2.5;0");
  EXPECT_EQ(Dte::Update(mList), 0);
  EXPECT_EQ(vn.mShown, "\"def\"");
  EXPECT_EQ(vl.mShown, "2.5");
  EXPECT_FALSE(level->IsClashing());
  EXPECT_FALSE(name->IsClashing());
  EXPECT_TRUE(mList.IsEmpty()) << mList.ToText();
  name->UnregisterView(&vn, mList);
  level->UnregisterView(&vl, mList);
  Dte::FreeDs(name);
  Dte::FreeDs(level);
}

TEST_F(DteTest, ReadThatFailsAloneTooReportsTheReadsOwnStatus) {
  QenParamDs* name = Dte::AllocDsByName(":_H:NAME", 0);
  Inst().Expect(":_H:NAME?;:_H:NAME? CLAS", "", 1);
  Inst().Expect(":_H:SYST:ERR?", "0,\"No error\"");
  Inst().Expect(":_H:NAME?", "", 1);
  Inst().Expect(":_H:SYST:ERR?", "-113,\"Undefined header\"");
  Inst().Expect(":_H:SYST:ERR?", "0,\"No error\"");
  Dstring value;
  EXPECT_EQ(name->QueryStrValue(value, mList), 1);
  ASSERT_EQ(mList.Size(), 1u) << mList.ToText();
  EXPECT_EQ(mList[0], Condition(-113, "Undefined header"));
  EXPECT_TRUE(name->IsFailed());
  Inst().Expect(":_H:NAME?;:_H:NAME? CLAS", "", QenStatus::kLocked);
  EXPECT_EQ(name->QueryStrValue(value, mList), QenStatus::kLocked) << "a lock is not retried";
  Dte::ReleaseAllFailed();
  Dte::FreeDs(name);
  Dte::ReleaseAllFailed();
}

// A window that closes while it is being told must not erase a failed write.
class ClosingView : public QenDsView {
 public:
  int NfyViewDataUpdated(QenDs*, ConditionList&) override {
    if (mSource) Dte::FreeDs(std::exchange(mSource, nullptr));
    return 0;
  }
  QenParamDs* mSource = nullptr;
};

TEST_F(DteTest, LastFreeOfAFailedSourceDuringItsNotificationStillDefersTheRelease) {
  QenParamDs* period = Dte::AllocDsByName(":_H:CGR1:PER", 0);
  Inst().Expect(":_H:CGR1:PER 5", "", 1);
  Inst().Expect(":_H:SYST:ERR?", "0,\"No error\"");
  EXPECT_EQ(period->SetStrValue("5", mList), 1);
  ClosingView view;
  view.mSource = period;
  period->RegisterView(&view, mList);
  Inst().Expect(":_H:CGR1:PER?;:_H:CGR1:PER? CLAS", "", QenStatus::kLocked);
  EXPECT_EQ(Dte::UpdateDsByName(":_H:CGR1:PER", mList), 0);
  ASSERT_EQ(Dte::GetDsByName(":_H:CGR1:PER"), period);
  EXPECT_TRUE(Dte::IsFailed());
  period->UnregisterView(&view, mList);
  Dte::ReleaseAllFailed();
  EXPECT_EQ(Dte::GetDsByName(":_H:CGR1:PER"), nullptr);
  EXPECT_FALSE(Dte::IsFailed());
}

TEST_F(DteTest, LastFreeOfASoundSourceDuringItsNotificationRemovesItAfterThePass) {
  QenParamDs* period = Dte::AllocDsByName(":_H:CGR1:PER", 0);
  ClosingView view;
  view.mSource = period;
  period->RegisterView(&view, mList);
  Inst().Expect(":_H:CGR1:PER?;:_H:CGR1:PER? CLAS", "1;0");
  EXPECT_EQ(Dte::UpdateDsByName(":_H:CGR1:PER", mList), 0);
  EXPECT_EQ(Dte::GetDsByName(":_H:CGR1:PER"), nullptr);
}

// A lock refuses the preliminary read of a sub-command write: -19 comes back as it is.
TEST_F(DteTest, SubCommandWriteOfALockedInstrumentPassesTheLockUp) {
  QenParamDs* kind = Dte::AllocDsByName(":_H:SEGM:TYPE", Dte::kSubCmd);
  Inst().Expect(":_H:SEGM:TYPE?;:_H:SEGM:TYPE? CLAS", "", QenStatus::kLocked);
  EXPECT_EQ(kind->SetStrValue("15", mList), QenStatus::kLocked);
  EXPECT_TRUE(mList.IsEmpty()) << mList.ToText();
  EXPECT_EQ(Inst().Sent().size(), 1u) << "no error-queue read";
  Inst().Expect(":_H:SEGM:TYPE?;:_H:SEGM:TYPE? CLAS", "", QenStatus::kTimeOut);
  Inst().Expect(":_H:SEGM:TYPE?", "", QenStatus::kTimeOut);
  EXPECT_EQ(kind->SetStrValue("15", mList), QenStatus::kTimeOut);
  Dte::FreeDs(kind);
  Dte::ReleaseAllFailed();
}
