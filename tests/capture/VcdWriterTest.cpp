// The capture as a Value Change Dump, to the byte.
#include <gtest/gtest.h>

#include <sstream>

#include "capture/VcdWriter.h"

namespace {

CaptureData Sample(double period) {
  CaptureData data;
  data.Reset(2, 6, period);
  // trace 0: 1 1 0 0 1 1; trace 1: 0 1 1 1 1 0; an error on trace 1 at vector 2
  EXPECT_TRUE(data.Put(0, 6, std::string("\xCC\x78", 2), false));
  EXPECT_TRUE(data.Put(0, 6, std::string("\x00\x20", 2), true));
  data.Summarise();
  return data;
}

TEST(VcdWriterTest, WritesTheChangesOfEveryTraceTheErrorsAndTheBus) {
  std::ostringstream out;
  VcdWriter::Write(Sample(1e-9), ":CGR1:MOD3:CONN1", {1, 6, 0, 1}, out);
  EXPECT_EQ(out.str(),
            "$version qengui capture $end\n$timescale 1 ps $end\n$scope module CGR1_MOD3_CONN1 $end\n"
            "$var wire 1 ! d0 $end\n$var wire 1 \" d1 $end\n$var wire 1 # error $end\n"
            "$var wire 2 $ bus[1:0] $end\n$upscope $end\n$enddefinitions $end\n"
            "#0\n$dumpvars\n1!\n1\"\n0#\nb11 $\n$end\n"
            "#1000\n0!\n1#\nb10 $\n"
            "#2000\n0#\n"
            "#3000\n1!\nb11 $\n"
            "#4000\n0\"\nb01 $\n"
            "#5000\n");
}

TEST(VcdWriterTest, APeriodOfNoWholePicosecondsIsWrittenInFemtoseconds) {
  std::ostringstream out;
  VcdWriter::Write(Sample(1.0 / 3e9), "", {0, 2, 1, 0}, out);
  const std::string text = out.str();
  EXPECT_NE(text.find("$timescale 1 fs $end\n$scope module capture $end"), std::string::npos);
  EXPECT_EQ(text.find("bus"), std::string::npos);
  EXPECT_NE(text.find("#333333\n1\"\n#666667\n"), std::string::npos) << text;
}

TEST(VcdWriterTest, IdentifiersArePrintableAndUnique) {
  EXPECT_EQ(VcdWriter::Identifier(0), "!");
  EXPECT_EQ(VcdWriter::Identifier(93), "~");
  EXPECT_EQ(VcdWriter::Identifier(94), "!\"");
  EXPECT_NE(VcdWriter::Identifier(95), VcdWriter::Identifier(1));
}

TEST(VcdWriterTest, AnUnwritablePathIsACondition) {
  ConditionList list;
  EXPECT_NE(VcdWriter::WriteFile(Sample(1e-9), "p", {0, 6, 0, 1}, "/nonexistent/dir/x.vcd", list), 0);
  EXPECT_NE(list.ToText().find("/nonexistent/dir/x.vcd"), std::string::npos);
}

}  // namespace
