#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <optional>
#include <string>

#include "support/DataItem.h"
#include "support/LispList.h"

namespace {

DataItem Token(std::string_view text) {
  DataItem item;
  EXPECT_TRUE(DataItem::FromToken(text, item)) << text;
  return item;
}

struct ConversionCase {
  DataItem item;
  std::optional<long> asLong;
  std::optional<unsigned long> asULong;
  std::optional<double> asDouble;
  std::optional<float> asFloat;
};

class Conversion : public testing::TestWithParam<ConversionCase> {};

TEST_P(Conversion, SucceedsOnlyWhenTheValueFits) {
  const ConversionCase& c = GetParam();
  long l = 0;
  unsigned long u = 0;
  double d = 0;
  float f = 0;
  EXPECT_EQ(c.item.GetLong(l) ? std::optional(l) : std::nullopt, c.asLong);
  EXPECT_EQ(c.item.GetULong(u) ? std::optional(u) : std::nullopt, c.asULong);
  EXPECT_EQ(c.item.GetDouble(d) ? std::optional(d) : std::nullopt, c.asDouble);
  EXPECT_EQ(c.item.GetFloat(f) ? std::optional(f) : std::nullopt, c.asFloat);
}

constexpr long kMin = std::numeric_limits<long>::min();
constexpr unsigned long kUMax = std::numeric_limits<unsigned long>::max();
const double kTwo63 = std::ldexp(1.0, 63);

INSTANTIATE_TEST_SUITE_P(
    Items, Conversion,
    testing::Values(ConversionCase{Token("-5"), -5, std::nullopt, -5.0, -5.0f},
                    ConversionCase{Token("7u"), 7, 7, 7.0, 7.0f},
                    ConversionCase{Token("18446744073709551615"), std::nullopt, kUMax, 0x1p64, 0x1p64f},
                    ConversionCase{Token("-9223372036854775808"), kMin, std::nullopt, -kTwo63, -0x1p63f},
                    ConversionCase{Token("3.0"), 3, 3, 3.0, 3.0f},
                    ConversionCase{Token("-1d"), -1, std::nullopt, -1.0, -1.0f},
                    ConversionCase{Token("3.5"), std::nullopt, std::nullopt, 3.5, 3.5f},
                    ConversionCase{DataItem::MakeDouble(kTwo63), std::nullopt, 1ul << 63, kTwo63, 0x1p63f},
                    ConversionCase{DataItem::MakeDouble(-kTwo63), kMin, std::nullopt, -kTwo63, -0x1p63f},
                    ConversionCase{DataItem::MakeDouble(0x1p64), std::nullopt, std::nullopt, 0x1p64, 0x1p64f},
                    ConversionCase{Token("1e300"), std::nullopt, std::nullopt, 1e300, std::nullopt},
                    ConversionCase{Token("1.5f"), std::nullopt, std::nullopt, 1.5, 1.5f},
                    ConversionCase{DataItem::MakeString("5"), std::nullopt, std::nullopt, std::nullopt,
                                   std::nullopt},
                    ConversionCase{Token("INF"), std::nullopt, std::nullopt, std::nullopt, std::nullopt},
                    ConversionCase{DataItem::MakeBlock("5", nullptr), std::nullopt, std::nullopt,
                                   std::nullopt, std::nullopt}));

struct WriteCase {
  DataItem item;
  std::string expression;
  bool readsBack = true;  // strings and blocks are read by the parser, infinities become words
};

class Write : public testing::TestWithParam<WriteCase> {};

TEST_P(Write, ReadsBackEqual) {
  EXPECT_EQ(GetParam().item.AsExpression(), GetParam().expression);
  if (GetParam().readsBack) {
    EXPECT_EQ(Token(GetParam().expression), GetParam().item);
  }
}

INSTANTIATE_TEST_SUITE_P(
    Items, Write,
    testing::Values(
        WriteCase{DataItem::MakeDouble(0.1), "0.1d"}, WriteCase{DataItem::MakeDouble(2.0), "2d"},
        WriteCase{DataItem::MakeDouble(5e-324), "5e-324d"},
        WriteCase{DataItem::MakeDouble(std::numeric_limits<double>::max()), "1.7976931348623157e+308d"},
        WriteCase{DataItem::MakeFloat(0.1f), "0.1f"}, WriteCase{DataItem::MakeUnsigned(7), "7u"},
        WriteCase{DataItem::MakeSigned(std::numeric_limits<long long>::min()), "-9223372036854775808"},
        WriteCase{DataItem::MakeWord("INF"), "INF"},
        WriteCase{DataItem::MakeDouble(-HUGE_VAL), "-INF", false},
        WriteCase{DataItem::MakeString("a\"b"), "\"a\"\"b\"", false},
        WriteCase{DataItem::MakeString("it's", '\''), "'it''s'", false},
        WriteCase{DataItem::MakeBlock("a;b", nullptr), "#13a;b", false}));

TEST(DataItem, EqualityComparesTypeQuoteAndValue) {
  auto owner = std::make_shared<const std::string>("xaby");
  EXPECT_EQ(DataItem::MakeBlock(std::string_view(*owner).substr(1, 2), owner),
            DataItem::MakeBlock("ab", nullptr));
  EXPECT_NE(DataItem::MakeString("a", '\''), DataItem::MakeString("a"));
  EXPECT_NE(DataItem::MakeSigned(1), DataItem::MakeUnsigned(1));
  EXPECT_NE(DataItem::MakeString("a"), DataItem::MakeWord("a"));
  EXPECT_EQ(Token("12i"), Token("+12"));
  EXPECT_EQ(DataItem::MakeDouble(NAN), DataItem::MakeDouble(NAN));
  EXPECT_EQ(Token("1.500000f").GetText(), "1.500000f");
  DataItem refused = DataItem::MakeWord("kept");
  for (const char* token :
       {"1e400", "1e-400", "9223372036854775808i", "-1u", "18446744073709551616u", "1e39f"}) {
    EXPECT_FALSE(DataItem::FromToken(token, refused)) << token;
  }
  EXPECT_EQ(refused, DataItem::MakeWord("kept"));
}

// A parsed reply holds one node per value: a node larger than this makes big replies slow.
TEST(DataItem, NodesStaySmallAndCopiesOwnTheirText) {
  EXPECT_LE(sizeof(DataItem), 40u);
  EXPECT_LE(sizeof(LispList), 48u);
  DataItem a = DataItem::MakeString(std::string(100, 'x'));
  DataItem b = DataItem::MakeWord("short");
  DataItem c = a;
  a = b;
  b = std::move(c);
  const DataItem& same = b;
  b = same;
  c = b;
  EXPECT_EQ(a.GetText(), "short");
  EXPECT_EQ(b.GetText(), std::string(100, 'x'));
  EXPECT_EQ(c, b);
  EXPECT_EQ(b.GetType(), DataItemType::String);
}

}  // namespace
