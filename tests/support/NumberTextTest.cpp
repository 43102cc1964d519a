// The one form of a count and of a bit error ratio, at the edges of the groups.
#include <gtest/gtest.h>

#include <climits>

#include "support/NumberText.h"

namespace {

const std::string kThin = "\xE2\x80\x89";

TEST(NumberTextTest, DigitsStandInGroupsOfThreeFromTheRight) {
  const std::pair<long long, std::string> cases[] = {
      {0, "0"},
      {999, "999"},
      {1000, "1" + kThin + "000"},
      {999999, "999" + kThin + "999"},
      {1000000, "1" + kThin + "000" + kThin + "000"},
      {-1000,
       "\xE2\x88\x92"
       "1" +
           kThin + "000"},
      {LLONG_MIN,
       "\xE2\x88\x92"
       "9" +
           kThin + "223" + kThin + "372" + kThin + "036" + kThin + "854" + kThin + "775" + kThin + "808"},
  };
  for (const auto& [value, text] : cases) EXPECT_EQ(NumberText::Grouped(value), text) << value;
  EXPECT_EQ(
      NumberText::Grouped(18446744073709551615ull),
      "18" + kThin + "446" + kThin + "744" + kThin + "073" + kThin + "709" + kThin + "551" + kThin + "615");
  EXPECT_EQ(NumberText::Grouped(1234L), "1" + kThin + "234");
}

TEST(NumberTextTest, ARatioHasThreeFiguresAndAnExponent) {
  EXPECT_EQ(NumberText::Ratio(0, 0), "\xE2\x80\x93");
  EXPECT_EQ(NumberText::Ratio(0, 1000), "0");
  EXPECT_EQ(NumberText::Ratio(1, 10000), "1.00E-04");
  EXPECT_EQ(NumberText::Ratio(1675900, 16760000000ull), "1.00E-04");
  EXPECT_EQ(NumberText::Ratio(2, 3), "6.67E-01");
  EXPECT_EQ(NumberText::Ratio(5, 5), "1.00E+00");
}

}  // namespace
