// The shared pieces of a Value Change Dump: identifiers at the edge of one character, module
// names stripped of what a viewer would misread.
#include <gtest/gtest.h>

#include <sstream>

#include "support/VcdText.h"

namespace {

TEST(VcdTextTest, IdentifiersArePrintableAndGrowAtTheLastCode) {
  EXPECT_EQ(VcdText::Identifier(0), "!");
  EXPECT_EQ(VcdText::Identifier(93), "~");
  EXPECT_EQ(VcdText::Identifier(94), "!\"");
  EXPECT_EQ(VcdText::Identifier(94 * 94 - 1), "~~");
  EXPECT_EQ(VcdText::Identifier(94 * 94), "!!\"");
  EXPECT_NE(VcdText::Identifier(95), VcdText::Identifier(1));
}

TEST(VcdTextTest, ScopeNamesLoseBlanksAndJoinPathsWithUnderscores) {
  const struct {
    const char* scope;
    const char* name;
  } cases[] = {{":CGR1:MOD1:CONN2", "CGR1_MOD1_CONN2"},
               {"walk B/8", "walkB_8"},
               {"", "fallback"},
               {" :/", "fallback"},
               {"a\x7f"
                "b",
                "ab"}};
  for (const auto& c : cases) EXPECT_EQ(VcdText::ScopeName(c.scope, "fallback"), c.name) << c.scope;
}

TEST(VcdTextTest, TheFirstStepHoldsTheInitialValues) {
  std::ostringstream out;
  Dstring changes;
  VcdText::AddChange(changes, '1', "!");
  VcdText::AddChange(changes, 'z', "\"");
  VcdText::Step(out, 0, changes, true);
  VcdText::Step(out, 12, changes, false);
  EXPECT_EQ(out.str(), "#0\n$dumpvars\n1!\nz\"\n$end\n#12\n1!\nz\"\n");
}

}  // namespace
