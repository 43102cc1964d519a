#include <gtest/gtest.h>

#include <cmath>
#include <functional>
#include <limits>

#include "common/InstrumentFixture.h"
#include "data/DirtyFlagDs.h"
#include "settings/QENSettingProfile.h"
#include "settings/QENSystemProfile.h"

// The profiles' exchanges with the server, byte for byte, and what they do with bad replies.
namespace {

class ProfileWire : public InstrumentFixture {
 protected:
  void SetUp() override {
    InstrumentFixture::SetUp();
    QENSettingProfile::Init(&mDirtyFlag);
  }
  void TearDown() override {
    QENSettingProfile::End();
    InstrumentFixture::TearDown();
  }
  void ReadProfile(const Dstring& reply, int expected = 0) {
    Inst().Expect("_H:CONF:CSET:PROF:EXPR?", reply);
    EXPECT_EQ(QENSettingProfile::Read(mList), expected) << mList.ToText();
  }
  DirtyFlagDs mDirtyFlag;
};

}  // namespace

TEST_F(ProfileWire, SystemProfileQueriesAndRefusesNamesThatWouldBreakTheCommand) {
  Inst().Expect("_H:CONF:PROF? \"OPENSETTING_NAME\"", "\"bench\"");
  Dstring name;
  EXPECT_EQ(QENSystemProfile::GetValue("OPENSETTING_NAME", name, mList), 0);
  EXPECT_EQ(name, "bench");
  EXPECT_NE(QENSystemProfile::SetValue("a\"b", 1L, mList), 0);
  EXPECT_NE(QENSystemProfile::SetValue("N", std::nan(""), mList), 0);
  EXPECT_TRUE(mList.HasKey("GUI_PROFILE_VALUE_NOT_FINITE"));
  // The names may come quoted or bare, numbers included; a nested list is no list of names.
  Inst().Expect("_H:CONF:PROF:LIST?", "\"A\",B,7");
  int exists = 0;
  EXPECT_EQ(QENSystemProfile::Exists("B", exists, mList), 0) << mList.ToText();
  EXPECT_EQ(exists, 1);
  Inst().Expect("_H:CONF:PROF:LIST?", "\"A\",B,7");
  EXPECT_EQ(QENSystemProfile::Exists("7", exists, mList), 0);
  EXPECT_EQ(exists, 1);
  Inst().Expect("_H:CONF:PROF:LIST?", "\"A\",(B)");
  EXPECT_NE(QENSystemProfile::Exists("B", exists, mList), 0);
  EXPECT_TRUE(mList.HasKey("GUI_SYSTEM_PROFILE_BAD_LIST"));
  EXPECT_EQ(Inst().Sent().size(), 4u) << "nothing may be sent for a refused name or value";
}

TEST_F(ProfileWire, SettingProfileWritesTheWholeListAppendingNewNames) {
  ReadProfile("(2.0,(\"A\",\"(1i)\"))");
  EXPECT_EQ(QENSettingProfile::SetValue("B", 2.5, mList), 0);
  EXPECT_EQ(QENSettingProfile::SetValue("A", Dstring("x;y"), mList), 0);
  EXPECT_TRUE(QENSettingProfile::IsDirty());
  Inst().Expect("_H:CONF:CSET:PROF:EXPR (2.0,(\"A\",\"x;y\"),(\"B\",\"(2.500000d)\"))", "");
  EXPECT_EQ(QENSettingProfile::Write(mList), 0);
  EXPECT_FALSE(QENSettingProfile::IsDirty());
}

struct VersionCase {
  const char* reply;
  int status;
  const char* key;
};

class SettingProfileVersion : public ProfileWire, public testing::WithParamInterface<VersionCase> {};

TEST_P(SettingProfileVersion, OnlyVersionTwoIsTaken) {
  ReadProfile(GetParam().reply, GetParam().status);
  if (GetParam().key) {
    EXPECT_TRUE(mList.HasKey(GetParam().key)) << mList.ToText();
  }
  long value = 0;
  int found = QENSettingProfile::GetValue("A", value, mList);
  EXPECT_EQ(found == 0, GetParam().status == 0 && std::string(GetParam().reply).find("\"A\"") != std::string::npos);
  if (GetParam().status != 0) {
    EXPECT_EQ(QENSettingProfile::GetNameValues().AsExpression(), "(2.0)");
  }
}

INSTANTIATE_TEST_SUITE_P(
    Replies, SettingProfileVersion,
    testing::Values(VersionCase{"", 0, nullptr}, VersionCase{"(2.0,(\"A\",\"(4i)\"))", 0, nullptr},
                    VersionCase{"2,(\"A\",\"(4i)\")", 0, nullptr},
                    VersionCase{"(1.0,(\"A\",\"(4i)\"))", -34, "GUI_SETTING_PROFILE_WRONG_VERSION"},
                    VersionCase{"(2.0001)", -34, "GUI_SETTING_PROFILE_WRONG_VERSION"},
                    VersionCase{"(\"2.0\")", -34, "GUI_SETTING_PROFILE_WRONG_VERSION"},
                    VersionCase{"((2.0))", -34, "GUI_SETTING_PROFILE_WRONG_VERSION"}));

struct EntryCase {
  const char* name;
  const char* key;
};

class SettingProfileEntries : public ProfileWire, public testing::WithParamInterface<EntryCase> {};

TEST_P(SettingProfileEntries, BadEntriesAndValuesAreReportedAndChangeNothing) {
  ReadProfile("(2.0,(\"A\"),(\"B\",\"(1i)\",\"x\"),C,(\"D\",5),(\"E\",\"(1i\"),(\"F\",\"(1u)\"),(\"G\",\"(1i)\"))");
  const Dstring before = QENSettingProfile::GetNameValues().AsExpression();
  long value = 0;
  EXPECT_NE(QENSettingProfile::GetValue(GetParam().name, value, mList), 0);
  EXPECT_TRUE(mList.HasKey(GetParam().key)) << mList.ToText();
  EXPECT_EQ(mList.Size(), 1u);
  QENSettingProfile::SetValue(GetParam().name, 9L, mList);
  const bool replaceable = Dstring(GetParam().key) != "GUI_SETTING_PROFILE_BAD_ENTRY";
  EXPECT_EQ(QENSettingProfile::GetNameValues().AsExpression() == before, !replaceable);
  EXPECT_EQ(QENSettingProfile::IsDirty(), replaceable ? 1u : 0u);
}

INSTANTIATE_TEST_SUITE_P(Entries, SettingProfileEntries,
                         testing::Values(EntryCase{"A", "GUI_SETTING_PROFILE_BAD_ENTRY"},
                                         EntryCase{"B", "GUI_SETTING_PROFILE_BAD_ENTRY"},
                                         EntryCase{"C", "GUI_SETTING_PROFILE_NO_VALUE"},
                                         EntryCase{"D", "GUI_SETTING_PROFILE_BAD_ENTRY"},
                                         EntryCase{"E", "GUI_SETTING_PROFILE_BAD_VALUE"},
                                         EntryCase{"F", "GUI_SETTING_PROFILE_UNEXPEXPECTED_VALUE"},
                                         EntryCase{"Missing", "GUI_SETTING_PROFILE_NO_VALUE"}));

TEST_F(ProfileWire, FailedReadsAndWritesKeepTheList) {
  ReadProfile("(2.0,(\"A\",\"(1i)\"))");
  const Dstring before = QENSettingProfile::GetNameValues().AsExpression();
  ReadProfile("(2.0,(\"A\"", -35);
  EXPECT_TRUE(mList.HasKey("GUI_SETTING_PROFILE_SYNTAX"));
  Inst().Expect("_H:CONF:CSET:PROF:EXPR?", "", 1);
  Inst().Expect(":_H:SYST:ERR?", "-113,\"Undefined header\"");
  Inst().Expect(":_H:SYST:ERR?", "0,\"No error\"");
  EXPECT_EQ(QENSettingProfile::Read(mList), 1);
  EXPECT_EQ(QENSettingProfile::GetNameValues().AsExpression(), before);
  EXPECT_EQ(QENSettingProfile::SetValue("B", 2L, mList), 0);
  Inst().Expect("_H:CONF:CSET:PROF:EXPR (2.0,(\"A\",\"(1i)\"),(\"B\",\"(2i)\"))", "", -19);
  EXPECT_EQ(QENSettingProfile::Write(mList), -19);
  EXPECT_TRUE(QENSettingProfile::IsDirty()) << "an unsent change must stay pending";
  EXPECT_NE(QENSettingProfile::SetValue("C", Dstring("line\nbreak"), mList), 0);
  EXPECT_NE(QENSettingProfile::SetValue("C", std::numeric_limits<double>::infinity(), mList), 0);
}

struct DirtyCase {
  const char* changed;
  bool reads;
};

class SettingProfileFollows : public ProfileWire, public testing::WithParamInterface<DirtyCase> {};

TEST_P(SettingProfileFollows, ReadsAgainWhenTheServerReportsItsChange) {
  Inst().Expect("_H:DFL?", GetParam().changed);
  if (GetParam().reads) Inst().Expect("_H:CONF:CSET:PROF:EXPR?", "(2.0,(\"A\",\"(3i)\"))");
  EXPECT_EQ(mDirtyFlag.UpdateFromFW(mList), 0);
  long value = 0;
  EXPECT_EQ(QENSettingProfile::GetValue("A", value, mList) == 0, GetParam().reads);
  QENSettingProfile::End();
  Inst().Expect("_H:DFL?", GetParam().changed);
  EXPECT_EQ(mDirtyFlag.UpdateFromFW(mList), 0) << "after End nothing is read";
}

INSTANTIATE_TEST_SUITE_P(Names, SettingProfileFollows,
                         testing::Values(DirtyCase{"\":_H:CONF:CSET:PROF:EXPR\"", true},
                                         DirtyCase{"\":CONF:CSET:PROF:EXPR\"", true},
                                         DirtyCase{"\":_OTHER:CONF:CSET:PROF:EXPR\"", false},
                                         DirtyCase{"\":_H:CGR1:PER\",\":_h:conf:cset:prof:expr\"", true},
                                         DirtyCase{"\"ALL\"", true}, DirtyCase{"\":_H:CONF:PROF\"", false},
                                         DirtyCase{"\":_H:CONF:CSET:PROF:EXPRX\"", false}));

TEST_F(ProfileWire, NumbersReadInTheFixedAndTheShortForm) {
  ReadProfile("(2.0,(\"A\",\"(1.5f)\"),(\"B\",\"(1.500000f)\"),(\"C\",\"(2.500000d)\"),(\"D\",\"(2.5e-09d)\"))");
  float a = 0, b = 0;
  double c = 0, d = 0;
  EXPECT_EQ(QENSettingProfile::GetValue("A", a, mList), 0);
  EXPECT_EQ(QENSettingProfile::GetValue("B", b, mList), 0);
  EXPECT_EQ(QENSettingProfile::GetValue("C", c, mList), 0);
  EXPECT_EQ(QENSettingProfile::GetValue("D", d, mList), 0);
  EXPECT_EQ(a, 1.5f);
  EXPECT_EQ(b, 1.5f);
  EXPECT_EQ(c, 2.5);
  EXPECT_EQ(d, 2.5e-9);
}
