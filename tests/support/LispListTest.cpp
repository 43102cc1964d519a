#include <gtest/gtest.h>

#include <functional>
#include <string>

#include "support/LispList.h"
#include "support/ParserExpression.h"

namespace {

const char* const kLong = "a text too long to be held in place";

// An edit of a parsed list and the list it leaves. The lists parsed here are plain (items with
// their text in place) and freed without visiting their elements, so every edit that brings in a
// long text or a nested list must make the list visit them again: under the sanitizers a
// forgotten one leaks.
struct EditCase {
  const char* name;
  const char* text;
  std::function<void(LispList&)> edit;
  std::string expected;
};

class Edit : public testing::TestWithParam<EditCase> {};

TEST_P(Edit, LeavesTheListAndFreesAllItHolds) {
  LispList tree;
  ConditionList list;
  ASSERT_EQ(ParserExpression::Parse(GetParam().text, tree, list), 0);
  GetParam().edit(tree);
  EXPECT_EQ(tree.AsExpression(), GetParam().expected);
  const LispList copy = tree;
  EXPECT_EQ(copy, tree);
}

INSTANTIATE_TEST_SUITE_P(
    Lists, Edit,
    testing::Values(EditCase{"AppendGrowsTheArray", "(1,2,3)",
                             [](LispList& l) {
                               for (int i = 4; i <= 9; ++i) l.Append(DataItem::MakeSigned(i));
                             },
                             "(1,2,3,4,5,6,7,8,9)"},
                    EditCase{"AppendLongText", "(1,2)",
                             [](LispList& l) { l.Append(DataItem::MakeString(kLong)); },
                             std::string("(1,2,\"") + kLong + "\")"},
                    EditCase{"AssignALongTextInPlace", "(1,2)",
                             [](LispList& l) { l[1] = LispList(DataItem::MakeString(kLong)); },
                             std::string("(1,\"") + kLong + "\")"},
                    EditCase{"AssignANestedList", "(1,2)",
                             [](LispList& l) {
                               LispList inner;
                               inner.Append(DataItem::MakeWord("x"));
                               l[0] = inner;
                             },
                             "((x),2)"},
                    EditCase{"InsertAtEachEnd", "(b,c)",
                             [](LispList& l) {
                               l.Insert(0, LispList(DataItem::MakeWord("a")));
                               l.Insert(99, LispList(DataItem::MakeString(kLong)));
                             },
                             std::string("(a,b,c,\"") + kLong + "\")"},
                    EditCase{"EraseInsideAndBeyond", "(a,(b,\"a text too long to be held in place\"),c)",
                             [](LispList& l) {
                               l.Erase(0);
                               l.Erase(5);
                               l[0].Erase(0);
                             },
                             std::string("((\"") + kLong + "\"),c)"},
                    EditCase{"ClearThenReuse", "(a,b)",
                             [](LispList& l) {
                               l.Clear();
                               l.Append(DataItem::MakeString(kLong));
                             },
                             std::string("(\"") + kLong + "\")"},
                    EditCase{"AnItemBecomesAList", "(a,b)",
                             [](LispList& l) { l[0].Append(DataItem::MakeWord("z")); }, "((z),b)"},
                    EditCase{"MoveAnElementOntoItsList", "((a,(b)),c)",
                             [](LispList& l) { l = std::move(l[0][1]); }, "(b)"}),
    [](const testing::TestParamInfo<EditCase>& info) { return std::string(info.param.name); });

}  // namespace
