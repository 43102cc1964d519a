#include <gtest/gtest.h>

#include "settings/SettingText.h"

namespace {

using Kind = SettingText::Kind;

// A setting as the instrument sends it: numbers in their shortest exact form, a text with a
// "%", a line break and blanks at its ends, a profile, two connections, a sequence with a
// loop and its events.
constexpr const char* kCanonical =
    "qen setting 1\n"
    "value :CGR1:PER 1e-09\n"
    "value :CGR1:MOD1:CONN1:VOLT:HIGH 1.511\n"
    "value :CGR1:MOD1:CONN1:VOLT:OFFS 0.7555\n"
    "value :TRIG:MODE SEQ\n"
    "value :NOTE \" 50%25 off%0Anext \"\n"
    "profile (2.0,\n"
    "  (\"Zoom\",\"(4i)\"),\n"
    "  (\"Title\",\"a (b)\"))\n"
    "connection \":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\"\n"
    "connection \":CGR2:MOD1:CONN2\",\":CGR2:MOD2:CONN2\"\n"
    "sequence (3.0,\"start\",\n"
    "  (SEQ,\n"
    "    (BLOCK,0,512,0,\"\",SYNC,\"cnt32\",0,0,PAUSE0,0,0),\"b2\",\n"
    "    (LOOP1,0,3,\"\",\n"
    "      (BLOCK,0,64,0,\"\",((\"a\",\"b\",1,\"\")),\"50%25 (x\",0,0,PAUSE,0,0))))\n"
    "events (3.0,\n"
    "  (\"ev\",1,(('a','b','c',X))),\n"
    "  (\"\",0,()))\n"
    "end\n";

SettingText Read(const char* text, Kind kind = Kind::kSetting) {
  SettingText out;
  SettingText::Problem problem;
  EXPECT_TRUE(SettingText::Read(text, kind, out, problem)) << problem.line << ": " << problem.what;
  return out;
}

}  // namespace

TEST(SettingText, ACanonicalTextReadsAndWritesBackByteForByte) {
  const SettingText text = Read(kCanonical);
  EXPECT_EQ(text.Write(), kCanonical);
  ASSERT_EQ(text.GetValues().size(), 5u);
  EXPECT_EQ(text.GetValues()[1].header, ":CGR1:MOD1:CONN1:VOLT:HIGH");
  EXPECT_EQ(text.GetValues()[1].text, "1.511");
  EXPECT_EQ(text.GetValues()[1].line, 3);
  EXPECT_EQ(text.GetValues()[4].text, "\" 50% off\nnext \"");
  EXPECT_EQ(text.GetProfile(), "(2.0,(\"Zoom\",\"(4i)\"),(\"Title\",\"a (b)\"))");
  ASSERT_EQ(text.GetConnections().size(), 2u);
  EXPECT_EQ(text.GetConnections()[1].analyser, ":CGR2:MOD2:CONN2");
  EXPECT_EQ(text.GetSequence(),
            "(3.0,\"start\",(SEQ,(BLOCK,0,512,0,\"\",SYNC,\"cnt32\",0,0,PAUSE0,0,0),\"b2\",(LOOP1,0,3,\"\",(BLOCK,0,64,0,"
            "\"\",((\"a\",\"b\",1,\"\")),\"50% (x\",0,0,PAUSE,0,0))))");
  EXPECT_EQ(text.GetSequenceLine(), 12);
  EXPECT_EQ(text.GetEvents(), "(3.0,(\"ev\",1,(('a','b','c',X))),(\"\",0,()))");
  EXPECT_EQ(text.GetEndLine(), 20);
}

TEST(SettingText, WhatIsHeldComesBackExactly) {
  SettingText held;
  held.AddValue(":A", "\"\x01 tab\there; semi \"\"q\"\" 100%\"");
  held.AddValue(":B", "-1.7976931348623157e+308");
  held.SetProfile("");
  held.SetSequence("(3.0, \"x\" ,(BLOCK,0,1,0,\"\",SYNC, (\"odd\" ,0,0)))");
  SettingText::Problem problem;
  SettingText back;
  ASSERT_TRUE(SettingText::Read(held.Write(), Kind::kSetting, back, problem)) << problem.line << ": " << problem.what;
  EXPECT_EQ(back.GetValues()[0].text, held.GetValues()[0].text);
  EXPECT_EQ(back.GetValues()[1].text, held.GetValues()[1].text);
  EXPECT_EQ(back.GetProfile(), "");
  EXPECT_EQ(back.GetSequence(), held.GetSequence());
  EXPECT_FALSE(back.HasEvents());
  EXPECT_EQ(back.Write(), held.Write());
}

TEST(SettingText, CommentsBlankLinesAndCrLfAreReadAsTheTextWithout) {
  const char* edited =
      "qen setting 1\r\n# bench 2, deskewed\r\n\r\nvalue :CGR1:PER 2e-09\r\nprofile\r\n"
      "sequence (3.0,,\r\n\t(BLOCK,0,512,0,\"\",SYNC,PAUSE,0,0))\r\nend\r\n# kept in git\r\n";
  const SettingText text = Read(edited);
  EXPECT_EQ(text.Write(), "qen setting 1\nvalue :CGR1:PER 2e-09\nprofile\nsequence (3.0,,\n  (BLOCK,0,512,0,\"\",SYNC,PAUSE,0,0))\nend\n");
}

TEST(SettingText, ASequenceTextHoldsTheSequenceAndItsEventsAlone) {
  SettingText sequence(Kind::kSequence);
  sequence.SetSequence("(3.0,,(BLOCK,0,512,0,\"\",SYNC,PAUSE,0,0))");
  EXPECT_EQ(sequence.Write(), "qen sequence 1\nsequence (3.0,,\n  (BLOCK,0,512,0,\"\",SYNC,PAUSE,0,0))\nend\n");
  EXPECT_EQ(Read(sequence.Write().c_str(), Kind::kSequence).GetSequence(), sequence.GetSequence());
}

TEST(SettingText, AnOlderSettingOfQensimReadsWithoutSequence) {
  const SettingText text = Read("qensim setting 1\nvalue :CGR1:PER 2.0000000000000001e-09\nprofile \nend\n");
  EXPECT_TRUE(text.IsLegacy());
  EXPECT_FALSE(text.HasSequence());
  EXPECT_EQ(text.GetValues()[0].text, "2.0000000000000001e-09");
}

struct Refusal {
  const char* name;
  Kind kind;
  const char* text;
  int line;
  const char* what;  // a part of the reason
};

class SettingTextRefusal : public testing::TestWithParam<Refusal> {};

TEST_P(SettingTextRefusal, NamesTheLineAndLeavesTheTargetAsItWas) {
  SettingText target;
  target.AddValue(":KEPT", "1");
  SettingText::Problem problem;
  EXPECT_FALSE(SettingText::Read(GetParam().text, GetParam().kind, target, problem));
  EXPECT_EQ(problem.line, GetParam().line) << problem.what;
  EXPECT_NE(problem.what.find(GetParam().what), Dstring::npos) << problem.what;
  ASSERT_EQ(target.GetValues().size(), 1u);
  EXPECT_EQ(target.GetValues()[0].header, ":KEPT");
}

constexpr const char* kSeq = "sequence (3.0,,(BLOCK,0,512,0,\"\",SYNC,PAUSE,0,0))\n";

INSTANTIATE_TEST_SUITE_P(
    Lines, SettingTextRefusal,
    testing::Values(
        Refusal{"Empty", Kind::kSetting, "", 1, "empty"},
        Refusal{"NotOurs", Kind::kSetting, "<?xml version=\"1.0\"?>\n", 1, "is not the first line"},
        Refusal{"Newer", Kind::kSetting, "qen setting 2\nend\n", 1, "version 2"},
        Refusal{"VersionNotANumber", Kind::kSetting, "qen setting 1x\nend\n", 1, "is not the first line"},
        Refusal{"SequenceForSetting", Kind::kSetting, "qen sequence 1\nend\n", 1, "a sequence text"},
        Refusal{"SettingForSequence", Kind::kSequence, "qen setting 1\nend\n", 1, "a setting text"},
        Refusal{"CutShort", Kind::kSetting, "qen setting 1\nvalue :A 1\n", 3, "cut short"},
        Refusal{"NoSequence", Kind::kSetting, "qen setting 1\nvalue :A 1\n\nend\n", 4, "no sequence"},
        Refusal{"UnknownKeyword", Kind::kSetting, "qen setting 1\nvalue :A 1\nvalu :B 2\n", 3, "\"valu\" is not a line"},
        Refusal{"ValueInSequence", Kind::kSequence, "qen sequence 1\nvalue :A 1\nend\n", 2, "sequence, events or end"},
        Refusal{"ConnectionInLegacy", Kind::kSetting, "qensim setting 1\nconnection \"a\",\"b\"\nend\n", 2,
                "value, profile or end"},
        Refusal{"BadHeader", Kind::kSetting, "qen setting 1\nvalue CGR1:PER 1\n", 2, "no parameter header"},
        Refusal{"DoubleColon", Kind::kSetting, "qen setting 1\nvalue :CGR1::PER 1\n", 2, "no parameter header"},
        Refusal{"NoValue", Kind::kSetting, "qen setting 1\nvalue :CGR1:PER\n", 2, "not one number"},
        Refusal{"TwoItems", Kind::kSetting, "qen setting 1\nvalue :A 1,2\n", 2, "not one number"},
        Refusal{"ListValue", Kind::kSetting, "qen setting 1\nvalue :A (1)\n", 2, "not one number"},
        Refusal{"BlockValue", Kind::kSetting, "qen setting 1\nvalue :A #13abc\n", 2, "not one number"},
        Refusal{"OpenQuote", Kind::kSetting, "qen setting 1\nvalue :A \"open\n", 2, "not one number"},
        Refusal{"Repeated", Kind::kSetting, "qen setting 1\nvalue :A 1\nvalue :a 2\n", 3, "line 2 already"},
        Refusal{"BadEscape", Kind::kSetting, "qen setting 1\nvalue :A \"%G1\"\n", 2, "no escape"},
        Refusal{"EscapeAtEnd", Kind::kSetting, "qen setting 1\nvalue :A 1%2\n", 2, "no escape"},
        Refusal{"ProfileTwice", Kind::kSetting, "qen setting 1\nprofile (2.0)\nprofile (2.0)\n", 3, "line 2 already"},
        Refusal{"ProfileNotExpression", Kind::kSetting, "qen setting 1\nprofile (2.0,(\n", 2, "not a list expression"},
        Refusal{"ConnectionOneName", Kind::kSetting, "qen setting 1\nconnection \":A\"\n", 2, "two port names"},
        Refusal{"ConnectionBare", Kind::kSetting, "qen setting 1\nconnection :A,:B\n", 2, "two port names"},
        Refusal{"AnalyserTwice", Kind::kSetting,
                "qen setting 1\nconnection \":G1\",\":A\"\nconnection \":G2\",\":a\"\n", 3, "line 2 already"},
        Refusal{"SequenceNotAList", Kind::kSetting, "qen setting 1\nsequence 3.0,x\n", 2, "not a sequence expression"},
        Refusal{"SequenceShort", Kind::kSetting, "qen setting 1\nsequence (3.0,x)\n", 2, "not a sequence expression"},
        Refusal{"SequenceTwice", Kind::kSequence,
                "qen sequence 1\nsequence (3.0,,)\n# two\nsequence (3.0,,)\n", 4, "line 2 already"},
        Refusal{"BrokenContinuation", Kind::kSetting, "qen setting 1\nsequence (3.0,,\n  (BLOCK\nend\n", 2,
                "not a sequence expression"},
        Refusal{"ContinuationFirst", Kind::kSetting, "qen setting 1\n  (BLOCK)\n", 2, "continues an item"},
        Refusal{"EventsEmpty", Kind::kSequence, "qen sequence 1\nevents\n", 2, "not a list expression"},
        Refusal{"EndWithText", Kind::kSetting, "qen setting 1\nend now\n", 2, "\"end\" alone"},
        Refusal{"AfterEnd", Kind::kSequence, "qen sequence 1\nsequence (3.0,,)\nend\n# fine\nvalue :A 1\n", 5,
                "follow the end line"}),
    [](const testing::TestParamInfo<Refusal>& info) { return std::string(info.param.name); });
