#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sstream>

#include "common/ScriptedInstrument.h"
#include "instrument/AppHandle.h"
#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "support/QenEnvironment.h"

namespace {

class QenGuiInstTest : public testing::Test {
 protected:
  void SetUp() override {
    mLogDir = std::filesystem::temp_directory_path() /
              ("qengui-test-" + std::to_string(::getpid()) + "-" +
               testing::UnitTest::GetInstance()->current_test_info()->name());
    QenEnvironment::SetLogDirectory(Dstring(mLogDir.string()));
    QenGuiInst::Init();
    QenGuiInst::SetServerDeathHandler([this](const Dstring& m) { mDeathMessages.push_back(m); });
  }
  void TearDown() override {
    QenGuiInst::End();
    QenEnvironment::SetLogDirectory(std::nullopt);
    std::filesystem::remove_all(mLogDir);
  }
  std::string LogText() {
    std::ifstream in(mLogDir / "qengui.log");
    std::stringstream s;
    s << in.rdbuf();
    return s.str();
  }

  std::filesystem::path mLogDir;
  DstringList mDeathMessages;
  ScriptedInstrument mInst;
  ConditionList mList;
  Dstring mReply;
};

}  // namespace

TEST_F(QenGuiInstTest, SuccessReadsNoErrorQueue) {
  mInst.Expect(":_H:TRIG:MODE?", "SEQ");
  EXPECT_EQ(QenGuiInst::Call(&mInst, ":_H:TRIG:MODE?", mReply, mList), 0);
  EXPECT_EQ(mReply, "SEQ");
  EXPECT_TRUE(mList.IsEmpty());
  EXPECT_TRUE(mInst.AllConsumed());
}

TEST_F(QenGuiInstTest, QueuedErrorsAreDrainedInOrderAndLogged) {
  mInst.Expect(":_H:CGR1:PER 9", "", 2);
  mInst.Expect(":_H:SYST:ERR?", "-222,\"Data out of range\"");
  mInst.Expect(":_H:SYST:ERR?", "-113,\"Undefined header\"");
  mInst.Expect(":_H:SYST:ERR?", "0,\"No error\"");
  EXPECT_EQ(QenGuiInst::Call(&mInst, ":_H:CGR1:PER 9", mReply, mList), 2);
  ASSERT_EQ(mList.Size(), 2u);
  EXPECT_EQ(mList[0], Condition(-222, "Data out of range"));
  EXPECT_EQ(mList[1], Condition(-113, "Undefined header"));
  EXPECT_EQ(LogText(), "-222,\"Data out of range\"\n-113,\"Undefined header\"\n");
  EXPECT_TRUE(mInst.AllConsumed());
}

// Each error keeps the command it came from, and the dialog says once, before the first of
// them, what the installed describer makes of the command; a condition of the program's own has
// no command and gets nothing.
TEST_F(QenGuiInstTest, ErrorsKeepTheirCommandAndTheDialogDescribesItOnce) {
  mInst.Expect(":_H:CGR1:PER 9", "", 2);
  mInst.Expect(":_H:SYST:ERR?", "-222,\"Data out of range\"");
  mInst.Expect(":_H:SYST:ERR?", "-113,\"Undefined header\"");
  mInst.Expect(":_H:SYST:ERR?", "0,\"No error\"");
  QenGuiInst::Call(&mInst, ":_H:CGR1:PER 9", mReply, mList);
  mList.Add(1, "Of the program's own");
  ASSERT_EQ(mList.Size(), 3u);
  EXPECT_EQ(mList[0].GetCommand(), ":_H:CGR1:PER 9");
  EXPECT_EQ(mList[1].GetCommand(), ":_H:CGR1:PER 9");
  EXPECT_EQ(mList[2].GetCommand(), "");
  std::vector<Dstring> asked;
  QenGuiInst::SetRefusalDescriber([&](const Condition& c) {
    asked.push_back(c.GetCommand());
    return Dstring("Period: 9 s asked.");
  });
  EXPECT_EQ(QenGuiInst::ErrorDlgText(mList),
            "Period: 9 s asked.\n\nERROR -222\n\nData out of range.\n----------\nERROR -113\n\nUndefined header."
            "\n----------\nERROR 1\n\nOf the program's own.");
  EXPECT_EQ(asked, std::vector<Dstring>{":_H:CGR1:PER 9"});
  QenGuiInst::SetRefusalDescriber(nullptr);
  EXPECT_EQ(QenGuiInst::ErrorDlgText(mList).rfind("ERROR -222", 0), 0u);
}

TEST_F(QenGuiInstTest, CoupledQueryReadsTheQueueOfTheSecondElement) {
  mInst.Expect(":VC:_h:CGR1:PER 1", "", 1);
  mInst.Expect(":_h:SYST:ERR?", "-100,\"Command error\"");
  mInst.Expect(":_h:SYST:ERR?", "0,\"No error\"");
  EXPECT_EQ(QenGuiInst::Call(&mInst, ":VC:_h:CGR1:PER 1", mReply, mList), 1);
  EXPECT_TRUE(mInst.AllConsumed());
}

TEST_F(QenGuiInstTest, UnparsedEntryGivesRawTextThenTheComplaint) {
  mInst.Expect(":_H:X 1", "", 1);
  mInst.Expect(":_H:SYST:ERR?", "garbage, no quotes");
  mInst.Expect(":_H:SYST:ERR?", "0,\"No error\"");
  QenGuiInst::Call(&mInst, ":_H:X 1", mReply, mList);
  ASSERT_EQ(mList.Size(), 2u);
  EXPECT_EQ(mList[0], Condition(0, "garbage, no quotes"));
  EXPECT_EQ(mList[1], Condition(0, "Unable to parse error message"));
}

TEST_F(QenGuiInstTest, LockDuringTheQueueReadBecomesTheStatus) {
  mInst.Expect(":_H:X 1", "", 1);
  mInst.Expect(":_H:SYST:ERR?", "", QenStatus::kLocked);
  EXPECT_EQ(QenGuiInst::Call(&mInst, ":_H:X 1", mReply, mList), -19);
  EXPECT_TRUE(mList.IsEmpty());
  EXPECT_EQ(LogText(), "Locked\n");
}

TEST_F(QenGuiInstTest, OtherFailureDuringTheQueueReadIsMinusSeven) {
  mInst.Expect(":_H:X 1", "", 1);
  mInst.Expect(":_H:SYST:ERR?", "", QenStatus::kTimeOut);
  EXPECT_EQ(QenGuiInst::Call(&mInst, ":_H:X 1", mReply, mList), 1);
  ASSERT_EQ(mList.Size(), 1u);
  EXPECT_EQ(mList[0].GetCode(), -7);
}

TEST_F(QenGuiInstTest, LockedCommandIsNotAnError) {
  mInst.Expect(":_H:X 1", "", QenStatus::kLocked);
  EXPECT_EQ(QenGuiInst::Call(&mInst, ":_H:X 1", mReply, mList), -19);
  EXPECT_TRUE(mList.IsEmpty());
  EXPECT_TRUE(mInst.AllConsumed());
}

TEST_F(QenGuiInstTest, ClientFailureIsReportedWithItsText) {
  mInst.Expect(":_H:X?", "", QenStatus::kTimeOut);
  EXPECT_EQ(QenGuiInst::Call(&mInst, ":_H:X?", mReply, mList), QenStatus::kTimeOut);
  ASSERT_EQ(mList.Size(), 1u);
  EXPECT_EQ(mList[0], Condition(-3, "The instrument server did not answer in time"));
}

TEST_F(QenGuiInstTest, ServerDeathIsLoggedAndReported) {
  mInst.Expect(":_H:X?", "", QenStatus::kServerTerminated);
  EXPECT_EQ(QenGuiInst::Call(&mInst, ":_H:X?", mReply, mList), -18);
  ASSERT_EQ(mDeathMessages.size(), 1u);
  EXPECT_EQ(mDeathMessages[0], "The user interface will be terminated\nbecause the firmware server has died.");
  EXPECT_EQ(LogText(), "Server has terminated. Shutdown.\n");
}

TEST_F(QenGuiInstTest, EndlessErrorQueueDoesNotHang) {
  mInst.SetHandler([](const Dstring& cmd, Dstring& reply) {
    reply = "-200,\"Execution error\"";
    return cmd == ":_H:X 1" ? 1 : 0;
  });
  QenGuiInst::Call(&mInst, ":_H:X 1", mReply, mList);
  EXPECT_EQ(mList.Size(), 256u);
}

struct HandleCase {
  const char* cmd;
  const char* handle;
};

class HandleOfCommand : public testing::TestWithParam<HandleCase> {};

TEST_P(HandleOfCommand, FirstElementUnlessAPrefixWord) {
  EXPECT_EQ(QenGuiInst::GetHandleFromCommand(GetParam().cmd), GetParam().handle);
}

INSTANTIATE_TEST_SUITE_P(Table, HandleOfCommand,
                         testing::Values(HandleCase{":h1:TRIG:MODE?", "H1"}, HandleCase{":VC:h1:CGR1:PER 1", "h1"},
                                         HandleCase{":rc:h2:X 1", "h2"}, HandleCase{":SR:_Q:CGR@:MOD1", "_Q"},
                                         HandleCase{":L:_q:CGR1?", "_q"}, HandleCase{"h3:DFL?", "H3"},
                                         HandleCase{":LX:a", "LX"}, HandleCase{":VC", ""}));

struct ErrorTextCase {
  const char* text;
  bool parses;
  long code;
  const char* message;
};

class ParseErrorMsg : public testing::TestWithParam<ErrorTextCase> {};

TEST_P(ParseErrorMsg, CodeCommaQuotedMessage) {
  Condition c;
  const auto& p = GetParam();
  ASSERT_EQ(QenGuiInst::ParseErrorMsg(p.text, c) == 0, p.parses);
  if (p.parses) {
    EXPECT_EQ(c, Condition(p.code, p.message));
  }
}

INSTANTIATE_TEST_SUITE_P(
    Table, ParseErrorMsg,
    testing::Values(ErrorTextCase{"-222,\"Data out of range\"", true, -222, "Data out of range"},
                    ErrorTextCase{"  7, \"a \"\"q\"\" b\" \n", true, 7, "a \"q\" b"},
                    ErrorTextCase{"+5,\"\"", true, 5, ""}, ErrorTextCase{"-222,Data", false, 0, ""},
                    ErrorTextCase{"-222 \"x\"", false, 0, ""}, ErrorTextCase{"-222,\"open", false, 0, ""},
                    ErrorTextCase{"x,\"y\"", false, 0, ""}, ErrorTextCase{"1,\"a\" tail", false, 0, ""},
                    ErrorTextCase{"", false, 0, ""}, ErrorTextCase{"99999999999,\"big\"", false, 0, ""}));

struct ResourceCase {
  const char* resource;
  const char* handle;
};

class HandleProposal : public testing::TestWithParam<ResourceCase> {};

TEST_P(HandleProposal, NeverEndsInADigit) {
  EXPECT_EQ(AppHandle::MakeFromResourceName(GetParam().resource), GetParam().handle);
}

INSTANTIATE_TEST_SUITE_P(Table, HandleProposal,
                         testing::Values(ResourceCase{"ABC", "_ABC"}, ResourceCase{"DEV1", "_DEV1X"},
                                         ResourceCase{"INSTRUMENT1", "_INSTRUMENTX"},
                                         ResourceCase{"INSTRUMENT_AB", "_INSTRUMENT_"},
                                         ResourceCase{"INSTRUMENT_AB7", "_INSTRUMENT_X"}, ResourceCase{"", "_"}));

TEST_F(QenGuiInstTest, HandleCreationTakesTheServersVariant) {
  mInst.Expect(":QEN:INST:HAND:CRE? _DEV1X,\"PSX\",\"DEV1\"", "_DEV1XA\n");
  Dstring handle = "_DEV1X";
  EXPECT_EQ(AppHandle::Create(&mInst, handle, "DEV1", mList), 0);
  EXPECT_EQ(handle, "_DEV1XA");
}

TEST_F(QenGuiInstTest, ResourceThatWouldBreakTheCommandIsNotSent) {
  Dstring handle = "_X";
  EXPECT_EQ(AppHandle::Create(&mInst, handle, "a\";:QEN:KILL", mList), QenStatus::kBadCommand);
  EXPECT_TRUE(mInst.Sent().empty());
  EXPECT_TRUE(mList.HasKey("GUI_COMMAND_BAD_TEXT"));
}

class CommandTextCheck : public testing::TestWithParam<std::pair<const char*, bool>> {};

TEST_P(CommandTextCheck, RefusesWhatWouldBreakAQuotedArgument) {
  ConditionList list;
  EXPECT_EQ(CommandText::CheckArgument(GetParam().first, list) == 0, GetParam().second);
  EXPECT_EQ(list.IsEmpty(), GetParam().second);
}

INSTANTIATE_TEST_SUITE_P(Table, CommandTextCheck,
                         testing::Values(std::pair{"seg 1 (copy)", true}, std::pair{"", true},
                                         std::pair{"a\"b", false}, std::pair{"a;b", false},
                                         std::pair{"a\nb", false}, std::pair{"a\rb", false},
                                         std::pair{"a\tb", false}, std::pair{"a\x7f", false}));
