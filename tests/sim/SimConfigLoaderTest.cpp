#include <gtest/gtest.h>

#include "SimConfigLoader.h"

namespace {

constexpr const char* kRack =
    "model K1 generator\n"
    "model K9 analyser\n"
    "unit V -3 0 -3 0.5\n"
    "param :MODE enum A values=A|B   # global\n"
    "template group\n"
    "param {group}:PER double 2E-9 unit=s min=1E-10 max=1E-6\n"
    "end\n"
    "template module kind=generator\n"
    "param {module}:NAME string \"{model} #{mod}\" readonly\n"
    "end\n"
    "template port type=PDAT model=K1\n"
    "param {port}:AMPL double 2 unit=V min=0.1 max=5\n"
    "param {port}:OFFS double 0 unit=V min=-2 max=3\n"
    "param {port}:HIGH double 0 unit=V min=-2 max=3\n"
    "param {port}:LOW double 0 unit=V min=-2 max=3\n"
    "param {port}:DEL double 0 min=0 max=1E-6\n"
    "couple levels {port}:AMPL {port}:OFFS {port}:HIGH {port}:LOW\n"
    "couple limit-by {port}:DEL {group}:PER\n"
    "end\n"
    "group 3\n"
    "  module 1 K1\n"
    "    port 2 PDAT\n"
    "    port 4 PCLK\n"
    "  module 2 K9\n"
    "    port 1 PDAT\n";

TEST(SimConfigLoaderTest, TemplatesGiveEachPlaceItsParametersInOrder) {
  SimParamTable table;
  ConditionList list;
  ASSERT_EQ(SimConfigLoader::Load(kRack, table, list), 0) << list.ToText();
  const char* headers[] = {":MODE",
                           ":CGR3:PER",
                           ":CGR3:MOD1:NAME",
                           ":CGR3:MOD1:CONN2:AMPL",
                           ":CGR3:MOD1:CONN2:OFFS",
                           ":CGR3:MOD1:CONN2:HIGH",
                           ":CGR3:MOD1:CONN2:LOW",
                           ":CGR3:MOD1:CONN2:DEL"};
  ASSERT_EQ(table.Size(), std::size(headers));
  for (std::size_t i = 0; i < table.Size(); ++i) EXPECT_EQ(table.At(i).GetHeader(), headers[i]);
  EXPECT_EQ(table.At(2).FormatValue(), "\"K1 #1\"");
  EXPECT_TRUE(table.At(2).IsReadOnly());
  // Derived levels follow AMPL and OFFS; the delay is limited by the group's period.
  EXPECT_EQ(table.At(5).GetNumber(), 1.0);
  EXPECT_EQ(table.At(6).GetNumber(), -1.0);
  EXPECT_EQ(table.At(7).GetHlim(), 2E-9);
  EXPECT_EQ(table.At(3).GetAttr().Format(), "(\"V\",-3,0,-3,0.500000d)");
  EXPECT_TRUE(table.TakeValueChanges().empty());
}

TEST(SimConfigLoaderTest, FirstProblemIsReportedWithItsLine) {
  struct Case {
    const char* text;
    const char* message;
  };
  const Case cases[] = {
      {"frobnicate 1\n", "configuration line 1: unknown keyword \"frobnicate\""},
      {"\nparam :A float 1\n",
       "configuration line 2: expected: param <header> double|integer|enum|string|bool <value> [options]"},
      {"param :A double 7 max=5\n", "configuration line 1: value outside min..max"},
      {"param :A double x\n", "configuration line 1: bad value x"},
      {"param :A enum C values=A|B\n", "configuration line 1: bad value C"},
      {"param A double 1\n", "configuration line 1: bad header A"},
      {"param :A double 1 colour=red\n", "configuration line 1: bad option colour=red"},
      {"param :A double 1 unit=s exp=1\n", "configuration line 1: bad option exp=1"},
      {"unit s -12 0 -9 0.1\nparam :A double 1 unit=s exp=3\n",
       "configuration line 2: exp outside the exponents of its unit"},
      {"param :A double 1\nparam :a double 2\n", "configuration line 2: :A is defined twice"},
      {"param {group}:A double 1\n", "configuration line 1: no placeholder here: {group}:A"},
      {"template port\nparam {port}:A bool ON\n", "configuration line 1: template without end"},
      {"template group\nunit V 0 0 0 1\nend\n",
       "configuration line 2: a template holds only param and couple lines"},
      {"template group kind=generator\nend\n", "configuration line 1: a group template takes no selectors"},
      {"template module\nparam {port}:A bool ON\nend\ngroup 1\nmodule 1 K\n",
       "configuration line 5: model K is not declared"},
      {"model K generator\ntemplate module\nparam {port}:A bool ON\nend\ngroup 1\nmodule 1 K\n",
       "configuration line 3: no placeholder here: {port}:A"},
      {"model K generator\nmodule 1 K\n", "configuration line 2: a module belongs to a group"},
      {"model K robot\n", "configuration line 1: expected: model <code> generator|analyser [terminals=<1..999>]"},
      {"model K generator terminals=0\n",
       "configuration line 1: expected: model <code> generator|analyser [terminals=<1..999>]"},
      {"model K generator\ngroup 1\nmodule 1 K slot=2\nmodule 2 K\n", "configuration line 4: slot 2 is taken"},
      {"model K generator\ngroup 1\nmodule 1 K place=2\n",
       "configuration line 3: expected: module <number> <model> [slot=<1..999>]"},
      {"unit V -2 0 0 1\n",
       "configuration line 1: exponents must be multiples of 3 in -12..9 and the step positive"},
      {"param :A double 1\ncouple spring :A :A\n", "configuration line 2: unknown coupling kind \"spring\""},
      {"param :A double 1\ncouple limit-by :A :B\n", "configuration line 2: unknown parameter :B"},
      {"param :A double 1\nparam :B double 1\ncouple reciprocal :A :B\n",
       "configuration line 3: :A needs a positive lower limit"},
      {"param :A double 1\nparam :B bool ON\ncouple limit-by :A :B\n",
       "configuration line 3: :B is not numeric"},
      {"param :A double 1\ncouple levels :A :A :A\n", "configuration line 2: levels takes 4 parameters"},
      {"param :A string \"open\n", "configuration line 1: unterminated quote"},
  };
  for (const Case& c : cases) {
    SimParamTable table;
    ConditionList list;
    EXPECT_EQ(SimConfigLoader::Load(c.text, table, list), 1) << c.text;
    ASSERT_EQ(list.Size(), 1u) << c.text;
    EXPECT_EQ(list[0].GetMessage(), c.message) << c.text;
  }
}

}  // namespace
