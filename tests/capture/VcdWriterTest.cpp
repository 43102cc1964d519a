// The capture as a Value Change Dump, to the byte, and as a logic analyser program reads it.
#include <gtest/gtest.h>

#include <filesystem>
#include <random>
#include <sstream>

#include "capture/VcdWriter.h"
#include "common/SigrokCli.h"

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

// `width` traces of random bits over `length` vectors, with an error on a few of them.
CaptureData Random(long width, long length, double period) {
  std::mt19937 random(7);
  CaptureData data;
  data.Reset(width, length, period);
  const auto rowBytes = static_cast<std::size_t>((length + 7) / 8);
  std::string bits(rowBytes * static_cast<std::size_t>(width), '\0');
  std::string errors(bits.size(), '\0');
  for (char& byte : bits) byte = static_cast<char>(random() & 0xFF);
  for (char& byte : errors) byte = static_cast<char>(random() % 200 == 0 ? 1u << (random() % 8) : 0u);
  EXPECT_TRUE(data.Put(0, length, bits, false));
  EXPECT_TRUE(data.Put(0, length, errors, true));
  data.Summarise();
  return data;
}

TEST(VcdWriterTest, WritesTheChangesOfEveryTraceTheErrorsAndTheBusBitByBitAtTheirOwnTimes) {
  std::ostringstream out;
  VcdWriter::Write(Sample(1e-9), ":CGR1:MOD3:CONN1", {1, 6, 0, 1}, out);
  EXPECT_EQ(out.str(),
            "$version qengui capture $end\n$comment vectors 1 to 5 of 6; vector 0 is at time 0 $end\n"
            "$timescale 1 ps $end\n$scope module CGR1_MOD3_CONN1 $end\n"
            "$var wire 1 ! d0 $end\n$var wire 1 \" d1 $end\n$var wire 1 # error $end\n"
            "$var wire 1 % bus [1] $end\n$var wire 1 $ bus [0] $end\n$upscope $end\n$enddefinitions $end\n"
            "#1000\n$dumpvars\n1!\n1$\n1\"\n1%\n0#\n$end\n"
            "#2000\n0!\n0$\n1#\n"
            "#3000\n0#\n"
            "#4000\n1!\n1$\n"
            "#5000\n0\"\n0%\n"
            "#6000\n");
}

TEST(VcdWriterTest, APeriodOfNoWholePicosecondsIsWrittenInFemtoseconds) {
  std::ostringstream out;
  VcdWriter::Write(Sample(1.0 / 3e9), "", {0, 2, 1, 0}, out);
  const std::string text = out.str();
  EXPECT_NE(text.find("$timescale 1 fs $end\n$scope module capture $end"), std::string::npos);
  EXPECT_EQ(text.find("bus"), std::string::npos);
  EXPECT_NE(text.find("#333333\n1\"\n#666667\n"), std::string::npos) << text;
}

TEST(VcdWriterTest, AnUnwritablePathIsACondition) {
  ConditionList list;
  EXPECT_NE(VcdWriter::WriteFile(Sample(1e-9), "p", {0, 6, 0, 1}, "/nonexistent/dir/x.vcd", list), 0);
  EXPECT_NE(list.ToText().find("/nonexistent/dir/x.vcd"), std::string::npos);
}

// sigrok reads every sample of a range at its place in the capture: a hundred traces (two-character
// identifiers), a bus of ten of them and the errors, in femtoseconds, one sample a vector.
TEST(VcdWriterTest, SigrokReadsEverySampleOfARangeAtItsPlace) {
  if (!SigrokCli::IsInstalled()) GTEST_SKIP() << "sigrok-cli is not installed";
  constexpr long kWidth = 100, kFrom = 37, kTo = 250;
  const CaptureData data = Random(kWidth, 300, 1.0 / 3e9);
  const std::string path = (std::filesystem::temp_directory_path() / "qen-vcd-sigrok.vcd").string();
  ConditionList list;
  ASSERT_EQ(VcdWriter::WriteFile(data, ":CGR1:MOD3:CONN1", {kFrom, kTo, 90, 99}, path, list), 0)
      << list.ToText();
  std::map<std::string, std::string> channels;
  std::string error;
  // With a sample a vector, sigrok counts from time 0: the range starts at sample kFrom.
  ASSERT_TRUE(SigrokCli::Read(path, "downsample=333333", channels, error)) << error;
  std::filesystem::remove(path);
  ASSERT_EQ(channels.size(), static_cast<std::size_t>(kWidth + 1 + 10));
  auto expect = [&](const std::string& name, auto bit) {
    ASSERT_TRUE(channels.count(name)) << name;
    const std::string& samples = channels[name];
    ASSERT_EQ(samples.size(), static_cast<std::size_t>(kTo)) << name;
    for (long v = kFrom; v < kTo; ++v)
      ASSERT_EQ(samples[static_cast<std::size_t>(v)] == '1', bit(v)) << name << " at " << v;
  };
  for (long t = 0; t < kWidth; ++t) {
    auto bit = [&](long v) { return data.Bit(t, v); };
    expect("d" + std::to_string(t), bit);
    if (t >= 90) expect("bus[" + std::to_string(t) + "]", bit);
  }
  expect("error", [&](long v) { return data.HasError(v, v + 1); });
}

}  // namespace
