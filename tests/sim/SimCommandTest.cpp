#include <gtest/gtest.h>

#include "SimCommand.h"

struct CommandCase {
  const char* text;
  const char* args;
  bool query;
  const char* path;
};

class SimCommandCut : public testing::TestWithParam<CommandCase> {};

// Blanks around a command go, but never the blank bytes at the end of a data block.
TEST_P(SimCommandCut, ArgumentsKeepTheirBlockBytes) {
  const auto& c = GetParam();
  SimCommand cmd(std::string_view(c.text));
  EXPECT_EQ(cmd.GetArgs(), c.args);
  EXPECT_EQ(cmd.IsQuery(), c.query);
  EXPECT_EQ(cmd.PathFrom(0), c.path);
}

INSTANTIATE_TEST_SUITE_P(
    Table, SimCommandCut,
    testing::Values(CommandCase{" :_h:cgr1:per  2E-9 \n", "2E-9", false, ":_H:CGR1:PER"},
                    CommandCase{":_H:DATA 0,0,8,1,#13a  ", "0,0,8,1,#13a  ", false, ":_H:DATA"},
                    CommandCase{":_H:DATA #11 ", "#11 ", false, ":_H:DATA"},
                    CommandCase{":_H:DATA #12a  ", "#12a ", false, ":_H:DATA"},
                    CommandCase{":_H:DATA \"#13\" ", "\"#13\"", false, ":_H:DATA"},
                    CommandCase{":_H:DATA #15ab", "#15ab", false, ":_H:DATA"},
                    CommandCase{":_H:PER? HLIM ", "HLIM", true, ":_H:PER"}));

struct BlockCase {
  const char* text;
  bool split;
  const char* head;
  const char* bytes;
};

class SimCommandTrailingBlock : public testing::TestWithParam<BlockCase> {};

// Only plain values before a block that runs exactly to the end are split off; every other
// shape is left to the full parse.
TEST_P(SimCommandTrailingBlock, SplitsOnlyPlainValuesBeforeAWholeBlock) {
  const auto& c = GetParam();
  SimCommand cmd(std::string_view(c.text));
  std::string_view head = "unset";
  std::string_view bytes = "unset";
  ASSERT_EQ(cmd.SplitTrailingBlock(head, bytes), c.split);
  EXPECT_EQ(head, c.head);
  EXPECT_EQ(bytes, c.bytes);
}

INSTANTIATE_TEST_SUITE_P(
    Table, SimCommandTrailingBlock,
    testing::Values(BlockCase{":_H:DATA 0,0,63,7,#13a;,", true, "0,0,63,7", "a;,"},
                    BlockCase{":_H:DATA 0 , 1 ,  #12  ", true, "0 , 1 ", "  "},
                    BlockCase{":_H:DATA 0,1,#10", true, "0,1", ""},
                    BlockCase{":_H:DATA 0,1,#13ab", false, "unset", "unset"},
                    BlockCase{":_H:DATA 0,1,#12abc", false, "unset", "unset"},
                    BlockCase{":_H:DATA 0,1,#0ab", false, "unset", "unset"},
                    BlockCase{":_H:DATA 0,1,#2", false, "unset", "unset"},
                    BlockCase{":_H:DATA 0,1,#1x", false, "unset", "unset"},
                    BlockCase{":_H:DATA 0,1#12ab", false, "unset", "unset"},
                    BlockCase{":_H:DATA #12ab", false, "unset", "unset"},
                    BlockCase{":_H:DATA \"a\",#12ab", false, "unset", "unset"},
                    BlockCase{":_H:DATA (0,1),#12ab", false, "unset", "unset"},
                    BlockCase{":_H:DATA 0,1,2", false, "unset", "unset"}));
