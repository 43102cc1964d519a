#include <gtest/gtest.h>

#include <cmath>
#include <limits>

#include "support/Dstring.h"
#include "support/DstringList.h"

TEST(DstringFormat, ExponentHasThreeDigits) {
  EXPECT_EQ(Dstring::Format("%.12E", 1e-9), "1.000000000000E-009");
  EXPECT_EQ(Dstring::Format("%.12E", 2.5e10), "2.500000000000E+010");
  EXPECT_EQ(Dstring::Format("%E", 1.5e300), "1.500000E+300");
  EXPECT_EQ(Dstring::Format("%.2e", -0.00123), "-1.23e-003");
  EXPECT_EQ(Dstring::Format("%.0E", 0.0), "0E+000");
}

TEST(DstringFormat, ExponentWidthAndFlagsApplyToTheLongerText) {
  EXPECT_EQ(Dstring::Format("[%12.2E]", 1.5e-3), "[   1.50E-003]");
  EXPECT_EQ(Dstring::Format("[%-12.2E]", 1.5e-3), "[1.50E-003   ]");
  EXPECT_EQ(Dstring::Format("[%012.2E]", -1.5e-3), "[-001.50E-003]");
  EXPECT_EQ(Dstring::Format("[%*.*E]", 11, 1, 2.0), "[   2.0E+000]");
  EXPECT_EQ(Dstring::Format("%+.1E", 3.0), "+3.0E+000");
}

TEST(DstringFormat, OtherConversionsFollowTheCLibrary) {
  EXPECT_EQ(Dstring::Format("%s=%d;%ld;%lu;%c;%%;%x;%5.1f|%-4s|", "a", -3, -4L, 5UL, 'z', 255, 2.25, "b"),
            "a=-3;-4;5;z;%;ff;  2.2|b   |");
  EXPECT_EQ(Dstring::Format("%g %G", 1e-5, 2e20), "1e-05 2E+20");
  EXPECT_EQ(Dstring::Format("%zu %lld %hhd", std::size_t{7}, -9LL, 3), "7 -9 3");
  EXPECT_EQ(Dstring::Format("%E", std::numeric_limits<double>::infinity()), "INF");
  EXPECT_EQ(Dstring::Format("plain"), "plain");
}

TEST(DstringFormat, LongTextsAreNotCut) {
  Dstring big(5000, 'q');
  EXPECT_EQ(Dstring::Format("<%s>", big.c_str()).size(), 5002u);
  Dstring d = "x";
  d.AppendPrintf("%03d", 7);
  EXPECT_EQ(d, "x007");
}

struct NumberCase {
  const char* text;
  bool longOk;
  long longValue;
  bool ulongOk;
  bool doubleOk;
};

class DstringNumber : public testing::TestWithParam<NumberCase> {};

TEST_P(DstringNumber, ReadsWholeTextOnly) {
  const auto& c = GetParam();
  long l = -99;
  unsigned long u = 0;
  double d = 0;
  EXPECT_EQ(Dstring(c.text).ToLong(l), c.longOk);
  if (c.longOk) {
    EXPECT_EQ(l, c.longValue);
  }
  EXPECT_EQ(Dstring(c.text).ToULong(u), c.ulongOk);
  EXPECT_EQ(Dstring(c.text).ToDouble(d), c.doubleOk);
}

INSTANTIATE_TEST_SUITE_P(Table, DstringNumber,
                         testing::Values(NumberCase{"42", true, 42, true, true},
                                         NumberCase{" -7 ", true, -7, false, true},
                                         NumberCase{"3.5", false, 0, false, true},
                                         NumberCase{"12abc", false, 0, false, false},
                                         NumberCase{"", false, 0, false, false},
                                         NumberCase{"99999999999999999999", false, 0, false, true},
                                         NumberCase{"1E-9", false, 0, false, true}));

TEST(DstringText, UpperTrimAndList) {
  EXPECT_EQ(Dstring("_qen1x:a").ToUpper(), "_QEN1X:A");
  EXPECT_EQ(Dstring("  a b \r\n").Trimmed(), "a b");
  EXPECT_EQ(Dstring("   ").Trimmed(), "");
  EXPECT_EQ(DstringList::Split("a,,b", ','), (DstringList{"a", "", "b"}));
  EXPECT_TRUE(DstringList::Split("", ',').empty());
  EXPECT_EQ((DstringList{"x", "y"}).Join(";"), "x;y");
}
