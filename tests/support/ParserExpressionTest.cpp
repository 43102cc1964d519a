#include <gtest/gtest.h>

#include <charconv>
#include <string>
#include <vector>

#include "support/ParserExpression.h"

namespace {

// The tree by type and value, e.g. ("V i-3 d0.1 w:INF b3:abc ()): independent of the written text.
std::string Describe(const LispList& node) {
  if (node.IsList()) {
    std::string out = "(";
    for (const LispList& child : node) out += (out.size() > 1 ? " " : "") + Describe(child);
    return out + ")";
  }
  const DataItem& item = node.GetItem();
  long l = 0;
  unsigned long u = 0;
  double d = 0;
  float f = 0;
  char buffer[64];
  switch (item.GetType()) {
    case DataItemType::Signed:
      return item.GetLong(l) ? "i" + std::to_string(l) : "i?";
    case DataItemType::Unsigned:
      return item.GetULong(u) ? "u" + std::to_string(u) : "u?";
    case DataItemType::Float:
      item.GetFloat(f);
      return "f" + std::string(buffer, std::to_chars(buffer, buffer + 64, f).ptr);
    case DataItemType::Double:
      item.GetDouble(d);
      return "d" + std::string(buffer, std::to_chars(buffer, buffer + 64, d).ptr);
    case DataItemType::String:
      return item.GetQuote() + std::string(item.GetText());
    case DataItemType::Word:
      return "w:" + std::string(item.GetText());
    case DataItemType::Block:
      return "b" + std::to_string(item.GetText().size()) + ":" + std::string(item.GetText());
  }
  return "?";
}

struct ParseCase {
  std::string text;
  std::string shape;
};

class ParseOk : public testing::TestWithParam<ParseCase> {};

TEST_P(ParseOk, GivesTheShapeAndReadsBackEqual) {
  ConditionList list;
  LispList tree;
  ASSERT_EQ(ParserExpression::Parse(GetParam().text, tree, list), 0) << list.ToText();
  EXPECT_EQ(Describe(tree), GetParam().shape);
  LispList again;
  ASSERT_EQ(ParserExpression::Parse(tree.AsExpression(), again, list), 0) << tree.AsExpression();
  EXPECT_EQ(again, tree) << tree.AsExpression();
}

INSTANTIATE_TEST_SUITE_P(
    Texts, ParseOk,
    testing::Values(
        ParseCase{"(\"V\",-3,0,-3,0.100000d)", "(\"V i-3 i0 i-3 d0.1)"}, ParseCase{"(12i)", "(i12)"},
        ParseCase{"(7u)", "(u7)"}, ParseCase{"(1.500000f)", "(f1.5)"}, ParseCase{"(2.000000d)", "(d2)"},
        ParseCase{"(3.0,,)", "(d3 w: w:)"},
        ParseCase{"(2.0,(\"NAME\",(12i)),(\"OTHER\",\"text\"))", "(d2 (\"NAME (i12)) (\"OTHER \"text))"},
        ParseCase{"(3.0,\"start\",(SEQ,(BLOCK,0,1024,0,\"\",(),\"seg1\",0,0),\"lbl\",(LOOP1,0,INF,\"\","
                  "(BLOCK,0,64,0,\"\",SYNC,PAUSE0,0,0))))",
                  "(d3 \"start (w:SEQ (w:BLOCK i0 i1024 i0 \" () \"seg1 i0 i0) \"lbl (w:LOOP1 i0 w:INF \" "
                  "(w:BLOCK i0 i64 i0 \" w:SYNC w:PAUSE0 i0 i0))))"},
        ParseCase{"(3.0,(\"EV1\",0,('a','b','c',X)),(\"EV2\",1,()))",
                  "(d3 (\"EV1 i0 ('a 'b 'c w:X)) (\"EV2 i1 ()))"},
        ParseCase{"-222,\"Data out of range\"", "(i-222 \"Data out of range)"},
        ParseCase{"\":_H:CGR1:PER\",\":_H:CGR1:FREQ\"", "(\":_H:CGR1:PER \":_H:CGR1:FREQ)"},
        ParseCase{"\"ALL\"", "(\"ALL)"}, ParseCase{"", "()"}, ParseCase{" \r\n", "()"},
        ParseCase{"1.000000000000E-009,9.91E+37,-5,+3,INF", "(d1e-09 d9.91e+37 i-5 i3 w:INF)"},
        ParseCase{"18446744073709551615,-9223372036854775808",
                  "(u18446744073709551615 i-9223372036854775808)"},
        ParseCase{"99999999999999999999,1.5i,5.e3,.5,-0u,1e,-", "(d1e+20 w:1.5i d5000 d0.5 u0 w:1e w:-)"},
        ParseCase{"#15hello,#50001101234567890,#10", "(b5:hello b11:01234567890 b0:)"},
        ParseCase{std::string("(#18\"',;()\n\0 ,x)", 16), std::string("(b8:\"',;()\n\0 w:x)", 17)},
        ParseCase{"((1,2))", "((i1 i2))"}, ParseCase{"(1,2),3", "((i1 i2) i3)"}, ParseCase{"()", "()"},
        ParseCase{"(())", "(())"}, ParseCase{"(,)", "(w: w:)"}, ParseCase{",", "(w: w:)"},
        ParseCase{" a b , c#1 ", "(w:a b w:c#1)"},
        ParseCase{"\"a\"\"b\",'it''s',\"a'b\",  \"x\"  ", "(\"a\"b 'it's \"a'b \"x)"},
        // Texts longer than an item holds in place, with and without doubled quotes.
        ParseCase{"(\"a string of exactly 25 b\",WORD_LONGER_THAN_24_BYTES_,\"x\"\"quoted\"\" in a long text\")",
                  "(\"a string of exactly 25 b w:WORD_LONGER_THAN_24_BYTES_ \"x\"quoted\" in a long text)"},
        ParseCase{"1.0000000000000000000000000E3,000000000000000000000000042i", "(d1000 i42)"}));

struct FailCase {
  std::string text;
  std::size_t offset;
};

class ParseFails : public testing::TestWithParam<FailCase> {};

TEST_P(ParseFails, NamesTheOffset) {
  ConditionList list;
  LispList tree;
  tree.Append(DataItem::MakeWord("kept"));
  EXPECT_NE(ParserExpression::Parse(GetParam().text, tree, list), 0);
  ASSERT_EQ(list.Size(), 1u);
  EXPECT_EQ(list[0].GetKey(), "GUI_PARSER_SYNTAX");
  EXPECT_EQ(list[0].GetArgs().at(1), std::to_string(GetParam().offset)) << list[0].GetMessage();
  EXPECT_LE(list[0].GetArgs().at(0).size(), 60u);
  EXPECT_EQ(Describe(tree), "(w:kept)");
}

INSTANTIATE_TEST_SUITE_P(
    Texts, ParseFails,
    testing::Values(FailCase{"(1,2", 0}, FailCase{"1,(2,(3)", 2}, FailCase{"1,2)", 3}, FailCase{"(1,2)x", 5},
                    FailCase{"(1,2) (3)", 6}, FailCase{"\"abc", 0}, FailCase{"1,'abc", 2},
                    FailCase{"ab\"c", 2}, FailCase{"\"a\"b", 3}, FailCase{"x(1)", 1}, FailCase{"#", 1},
                    FailCase{"#0", 1}, FailCase{"#a", 1}, FailCase{"#2a1", 2}, FailCase{"#3", 2},
                    FailCase{"#15hell", 0}, FailCase{"#5000110123456789", 0}, FailCase{"#13abcx", 6},
                    FailCase{"1,1e400", 2}, FailCase{"1e-400", 0}, FailCase{"9223372036854775808i", 0},
                    FailCase{"-1u", 0}, FailCase{"1e39f", 0}, FailCase{std::string(100, 'x') + ")", 100}));

// Takes the elements at depth 2 with an odd index, and notes every element it is shown.
class OddTaker : public ParserExpression::Sink {
 public:
  std::size_t Depth() const override { return 2; }
  bool Take(std::size_t depth, std::size_t index, LispList& element) override {
    shown += std::to_string(depth) + "." + std::to_string(index) + "=" + element.AsExpression().c_str() + " ";
    if (depth != 2 || index % 2 == 0) return false;
    taken.push_back(std::move(element));
    return true;
  }
  std::string shown;
  std::vector<LispList> taken;
};

TEST(ParserExpression, ASinkSeesElementsAsTheyCompleteAndTakesThemOutOfTheTree) {
  ConditionList list;
  LispList tree;
  OddTaker sink;
  ASSERT_EQ(ParserExpression::Parse("(1,(a,(b,(c)),d,e),())", tree, list, sink), 0) << list.ToText();
  EXPECT_EQ(tree.AsExpression(), "(1,(a,d),())");
  EXPECT_EQ(sink.shown, "1.0=1 2.0=a 2.1=(b,(c)) 2.2=d 2.3=e 1.1=(a,d) 1.2=() ");
  ASSERT_EQ(sink.taken.size(), 2u);
  EXPECT_EQ(sink.taken[0].AsExpression(), "(b,(c))");
  // A failure later in the text still fails the parse, whatever was taken before it.
  LispList kept = tree;
  EXPECT_NE(ParserExpression::Parse("(1,(a,b,c),\"open)", tree, list, sink), 0);
  EXPECT_EQ(tree, kept);
}

TEST(ParserExpression, NestingIsCappedCountingTheOuterList) {
  auto nested = [](std::string head, std::size_t depth) {
    return head + std::string(depth, '(') + std::string(depth, ')');
  };
  ConditionList list;
  LispList tree;
  EXPECT_EQ(ParserExpression::Parse(nested("", 256), tree, list), 0);
  EXPECT_EQ(ParserExpression::Parse(nested("1,", 255), tree, list), 0);
  EXPECT_EQ(ParserExpression::Parse(tree.AsExpression(), tree, list), 0);
  EXPECT_NE(ParserExpression::Parse(nested("", 257), tree, list), 0);
  EXPECT_NE(ParserExpression::Parse(nested("1,", 256), tree, list), 0);
  EXPECT_NE(ParserExpression::Parse(nested("", 100000), tree, list), 0);
  ASSERT_EQ(list.Size(), 3u);
  EXPECT_EQ(list[0].GetArgs().at(1), "256");
  EXPECT_EQ(list[1].GetArgs().at(1), "257");
}

TEST(ParserExpression, BlocksShareOneCopyOfTheText) {
  ConditionList list;
  LispList tree;
  {
    std::string text = "#13abc,x,#12de";
    ASSERT_EQ(ParserExpression::Parse(text, tree, list), 0);
  }
  std::string_view first = tree[0].GetItem().GetText();
  std::string_view second = tree[2].GetItem().GetText();
  EXPECT_EQ(second.data() - first.data(), 9);
  EXPECT_EQ(std::string(first) + std::string(second), "abcde");
}

// Items copied out of a tree keep their text when the tree and the parsed text are gone.
TEST(ParserExpression, ItemsOutliveTheTreeAndTheText) {
  ConditionList list;
  std::vector<DataItem> kept;
  {
    std::string text = "(\"short\",\"a segment name of forty bytes, quoted.\",#230abcdefghijklmnopqrstuvwxyz0123)";
    LispList tree;
    ASSERT_EQ(ParserExpression::Parse(text, tree, list), 0);
    for (const LispList& child : tree) kept.push_back(child.GetItem());
    text.assign(text.size(), '?');
  }
  ASSERT_EQ(kept.size(), 3u);
  EXPECT_EQ(kept[0].GetText(), "short");
  EXPECT_EQ(kept[1].GetText(), "a segment name of forty bytes, quoted.");
  EXPECT_EQ(kept[2].GetText(), "abcdefghijklmnopqrstuvwxyz0123");
  DataItem moved = std::move(kept[1]);
  kept[1] = kept[0];
  EXPECT_EQ(moved.AsExpression(), "\"a segment name of forty bytes, quoted.\"");
  EXPECT_EQ(kept[1], kept[0]);
}

TEST(ParserExpression, WritesNumbersAsReadAndBlocksCanonically) {
  ConditionList list;
  LispList tree;
  ASSERT_EQ(ParserExpression::Parse(" +3 , 1.500000f,'it''s',#500003a\"c, w ", tree, list), 0);
  EXPECT_EQ(tree.AsExpression(), "(+3,1.500000f,'it''s',#13a\"c,w)");
}

TEST(ParserExpression, ElementsAreNeverUnwrapped) {
  struct Case {
    const char* text;
    const char* shape;  // empty for a failure
  };
  const Case cases[] = {{"(1,2)", "((1,2))"}, {"(1),(2)", "((1),(2))"}, {"1,2", "(1,2)"}, {"", "()"},
                        {"1),(2", ""},        {"(1", ""}};
  for (const Case& c : cases) {
    ConditionList list;
    LispList tree;
    const int status = ParserExpression::ParseElements(c.text, tree, list);
    EXPECT_EQ(status == 0, *c.shape != '\0') << c.text;
    if (status == 0) {
      EXPECT_EQ(tree.AsExpression(), c.shape) << c.text;
    }
  }
}

struct ParcelCase {
  std::string text;
  bool ok;
  std::string shape;  // the items, or the offset of the failure
};

class ParcelParse : public testing::TestWithParam<ParcelCase> {};

TEST_P(ParcelParse, RefusesNestedLists) {
  ConditionList list;
  DataParcel parcel;
  int rc = ParserExpression::Parse(GetParam().text, parcel, list);
  ASSERT_EQ(rc == 0, GetParam().ok) << list.ToText();
  LispList shape;
  for (const DataItem& item : parcel) shape.Append(item);
  EXPECT_EQ(rc == 0 ? Describe(shape) : std::string(list[0].GetArgs().at(1)), GetParam().shape);
}

INSTANTIATE_TEST_SUITE_P(
    Texts, ParcelParse,
    testing::Values(ParcelCase{"-222,\"Data out of range\"", true, "(i-222 \"Data out of range)"},
                    ParcelCase{"(\"V\",-3,0.1)", true, "(\"V i-3 d0.1)"},
                    ParcelCase{"0,\"No error\"", true, "(i0 \"No error)"}, ParcelCase{"", true, "()"},
                    ParcelCase{"1,(2)", false, "2"}, ParcelCase{"((1))", false, "1"},
                    ParcelCase{"(1),2", false, "0"}, ParcelCase{"(1,(2),(3))", false, "3"},
                    ParcelCase{"(1", false, "0"}));

struct SplitCase {
  std::string text;
  std::vector<std::string_view> parts;
};

class Split : public testing::TestWithParam<SplitCase> {};

TEST_P(Split, KeepsSemicolonsInStringsAndBlocks) {
  ConditionList list;
  std::vector<std::string_view> parts;
  ASSERT_EQ(ParserExpression::SplitJoined(GetParam().text, parts, list), 0) << list.ToText();
  EXPECT_EQ(parts, GetParam().parts);
}

INSTANTIATE_TEST_SUITE_P(Texts, Split,
                         testing::Values(SplitCase{"1;\"a;b\";#13;;;;x", {"1", "\"a;b\"", "#13;;;", "x"}},
                                         SplitCase{"1;\"a;b\";#13;;;x", {"1", "\"a;b\"", "#13;;;x"}},
                                         SplitCase{"a;;b", {"a", "", "b"}}, SplitCase{"", {""}},
                                         SplitCase{";", {"", ""}},
                                         SplitCase{":_H:A 1;:_H:B \"x;y\";:_H:DATA 0,0,8,1,#11Z",
                                                   {":_H:A 1", ":_H:B \"x;y\"", ":_H:DATA 0,0,8,1,#11Z"}},
                                         SplitCase{"'it''s;';x", {"'it''s;'", "x"}},
                                         SplitCase{"a#1;b", {"a#1", "b"}},
                                         SplitCase{"(#12;;);x", {"(#12;;)", "x"}}));

TEST(ParserExpression, SplitRefusesOpenQuotesAndLyingBlocks) {
  for (auto [text, offset] : {std::pair{"1;\"a;b", "2"}, {"x;#15ab;c", "2"}, {"x #0;", "3"}, {"'a''", "3"}}) {
    ConditionList list;
    std::vector<std::string_view> parts{"kept"};
    EXPECT_NE(ParserExpression::SplitJoined(text, parts, list), 0) << text;
    ASSERT_EQ(list.Size(), 1u) << text;
    EXPECT_EQ(list[0].GetArgs().at(1), offset) << text;
    EXPECT_EQ(parts.size(), 1u);
  }
}

}  // namespace
