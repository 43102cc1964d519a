#include <gtest/gtest.h>

#include <cmath>

#include "params/CBoxItem.h"
#include "params/LbUnitsData.h"
#include "params/MemorySize.h"
#include "params/UnitMenu.h"
#include "params/UnitsData.h"
#include "params/UnitsDialogTable.h"
#include "params/ValueText.h"

namespace {

struct AttrCase {
  const char* reply;
  int status;
  const char* unit;
  int minExp, maxExp, curExp;
  double step;
  std::size_t conditions;
};

class AttrParse : public testing::TestWithParam<AttrCase> {};

const AttrCase kAttrCases[] = {
    {"(\"V\",-3,0,-3,0.100000d)", 0, "V", -3, 0, -3, 0.1, 0},
    {"(\"s\",-12,-3,9999,1)", 0, "s", -12, -3, -3, 1.0, 0},
    {"(\"Hz\",3,9,9999,1)", 0, "Hz", 3, 9, 3, 1.0, 0},
    {"(\"V\",-3,3,9999,1)", 0, "V", -3, 3, 0, 1.0, 0},
    {"(\"V\",-3,0,0,9.91e37)", 0, "V", -3, 0, 0, 1.0, 0},
    {"(\"V\",-3,0,0,0.25f)", 0, "V", -3, 0, 0, 0.25, 0},
    // Each unreadable item is one condition; the step then counts as "no value", that is 1.
    {"(\"V\",-3,0,0,x)", 1, "V", -3, 0, 0, 1.0, 1},
    {"(\"V\",a,b,0,0.1)", 1, "V", 0, 0, 0, 0.1, 2},
    {"(3,-3,0,0,0.1)", 1, "", -3, 0, 0, 0.1, 1},
    {"garbage(", 1, "", 0, 0, 0, 1.0, 5},
};

}  // namespace

TEST_P(AttrParse, ReadsEachItemOnItsOwn) {
  const AttrCase& c = GetParam();
  UnitsData units;
  ConditionList list;
  EXPECT_EQ(units.Parse(c.reply, list), c.status);
  EXPECT_EQ(units.unitName, c.unit);
  EXPECT_EQ(units.minExp, c.minExp);
  EXPECT_EQ(units.maxExp, c.maxExp);
  EXPECT_EQ(units.curExp, c.curExp);
  EXPECT_FLOAT_EQ(units.step, c.step);
  EXPECT_EQ(list.Size(), c.conditions);
  for (const auto& condition : list) EXPECT_NE(condition.GetMessage().find(c.reply), Dstring::npos);
}

INSTANTIATE_TEST_SUITE_P(Replies, AttrParse, testing::ValuesIn(kAttrCases));

TEST(UnitsRecordTest, WritesTheAttributeWithTheLiteralD) {
  LbUnitsData units;
  units.unitName = "V";
  units.minExp = -3;
  units.maxExp = 0;
  units.curExp = -3;
  units.step = 0.1;
  EXPECT_EQ(units.Format(), "(\"V\",-3,0,-3,0.100000d)");
  UnitsData back;
  ConditionList list;
  ASSERT_EQ(back.Parse(units.Format(), list), 0);
  EXPECT_FALSE(back != units);
}

TEST(UnitsRecordTest, InequalityDecidesWhatIsSent) {
  UnitsData a;
  a.unitName = "V";
  UnitsData b = a;
  EXPECT_FALSE(a != b);
  b.step = NAN;
  a.step = NAN;
  EXPECT_TRUE(a != b);
  b = a;
  b.step = 1.0;
  a.step = 1.0;
  b.curExp = -3;
  EXPECT_TRUE(a != b);
}

TEST(UnitsRecordTest, LabelHasAPrefixOrABlank) {
  UnitsData units;
  units.unitName = "Hz";
  EXPECT_EQ(units.LabelText(), "");
  const std::pair<int, const char*> kLabels[] = {{-12, "pHz"}, {-9, "nHz"}, {-6, "uHz"}, {-3, "mHz"},
                                                 {0, " Hz"},   {3, "kHz"},  {6, "MHz"},  {9, "GHz"}};
  for (const auto& [exp, label] : kLabels) {
    units.curExp = exp;
    EXPECT_EQ(units.LabelText(), label) << exp;
  }
}

TEST(ValueTextTest, DisplayFollowsTheExponentRule) {
  const struct {
    double value;
    int exp;
    const char* text;
  } kCases[] = {
      {1234567, 0, "1.234567e6"}, {0.00005, 0, "5e-5"}, {12.5, 0, "12.5"},    {999.5, 0, "999.5"},
      {1000, 0, "1000"},          {10000, 0, "1e4"},    {0.0025, -3, "2.5"},  {1e9, 6, "1000"},
      {0, 0, "0"},                {-0.001, 0, "-0.001"}, {-12345, 0, "-1.2345e4"}, {2.5e-9, -9, "2.5"},
  };
  for (const auto& c : kCases) EXPECT_EQ(ValueText::FormatDisplay(c.value, c.exp), c.text) << c.value;
}

TEST(ValueTextTest, SentTextHasThreeExponentDigits) {
  EXPECT_EQ(ValueText::FormatSent(0.0026), "2.600000000000E-003");
  EXPECT_EQ(ValueText::FormatSent(1e6), "1.000000000000E+006");
  EXPECT_EQ(ValueText::FormatSent(0.0), "0.000000000000E+000");
}

TEST(ValueTextTest, TypedTextReadsItsLeadingNumber) {
  const std::pair<const char*, double> kCases[] = {
      {"2.5", 2.5}, {" 2.5 mV", 2.5}, {"-1e3x", -1000}, {"1e", 1}, {".5", 0.5}, {"5.", 5},
      {"abc", 0},   {"0x10", 0},      {"inf", 0},       {"nan", 0}, {"+7", 7},   {"", 0},
  };
  for (const auto& [text, value] : kCases) EXPECT_DOUBLE_EQ(ValueText::ReadLeadingNumber(text), value) << text;
  EXPECT_TRUE(std::isnan(ValueText::ReadLeadingNumber("1e400")));
}

TEST(ValueTextTest, NoValueMark) {
  EXPECT_TRUE(ValueText::IsNoValue("CLAS"));
  EXPECT_TRUE(ValueText::IsNoValue("9.91e37"));
  EXPECT_TRUE(ValueText::IsNoValue("9.910000000000E+037"));
  EXPECT_FALSE(ValueText::IsNoValue("9.9e37"));
  EXPECT_FALSE(ValueText::IsNoValue("SEQ"));
}

TEST(UnitMenuTest, PrefixItemsFollowTheRange) {
  UnitsData units;
  units.unitName = "s";
  units.minExp = -12;
  units.maxExp = 0;
  units.curExp = -9;
  Dstring visible;
  for (int i = 0; i < 8; ++i) {
    const int id = UnitMenu::PrefixItemId(i);
    if (UnitMenu::IsPrefixItemVisible(id, units)) visible += UnitMenu::PrefixItemLabel(i, units) + "|";
  }
  EXPECT_EQ(visible, " s|ms|us|ns|ps|");
  EXPECT_EQ(UnitMenu::PrefixItemId(6), units.curExp + UnitMenu::kPrefixMenu);
}

TEST(UnitMenuTest, StepCheckedIsTheNearestPowerOfTenBelow) {
  EXPECT_EQ(UnitMenu::CheckedStepItemId(0.25), 199);
  EXPECT_EQ(UnitMenu::CheckedStepItemId(1), 200);
  EXPECT_EQ(UnitMenu::CheckedStepItemId(0.001), 197);
  EXPECT_EQ(UnitMenu::CheckedStepItemId(1000), 203);
  EXPECT_EQ(UnitMenu::CheckedStepItemId(0.3), 199);
  EXPECT_EQ(UnitMenu::CheckedStepItemId(0.4), 200);
}

TEST(UnitMenuTest, ChoicesChangeACopy) {
  UnitsData units;
  units.curExp = 0;
  EXPECT_TRUE(UnitMenu::Apply(97, units));
  EXPECT_EQ(units.curExp, -3);
  EXPECT_TRUE(UnitMenu::Apply(202, units));
  EXPECT_DOUBLE_EQ(units.step, 100);
  for (int id : {150, 250, 300, 50}) EXPECT_FALSE(UnitMenu::Apply(id, units)) << id;
}

TEST(UnitsDialogTableTest, StepButtonByThresholds) {
  const std::pair<double, const char*> kCases[] = {
      {1000, "RButStep1000"}, {20, "RButStep10"},   {0.3, "RButStep_1"},   {0.25, "RButStep_1"},
      {1, "RButStep1"},       {0.001, "RButStep_001"}, {600, "RButStep1000"}, {0.004, "RButStep_001"},
  };
  for (const auto& [step, name] : kCases) {
    EXPECT_STREQ(UnitsDialogTable::StepButtons()[static_cast<std::size_t>(UnitsDialogTable::StepButtonIndex(step))].name, name)
        << step;
  }
}

TEST(MemorySizeTest, BinaryUnitsTruncate) {
  const struct {
    unsigned long bits;
    const char* number;
    const char* unit;
  } kCases[] = {
      {0, "0", "Bit"},           {1023, "1023", "Bit"},  {1024, "1", "KBit"},           {1048575, "1023", "KBit"},
      {1048576, "1", "MBit"},    {(1UL << 30) - 1, "1023", "MBit"}, {1UL << 30, "1", "GBit"}, {(5UL << 30) + 7, "5", "GBit"},
  };
  for (const auto& c : kCases) {
    Dstring number;
    Dstring unit;
    MemorySize::Format(c.bits, number, unit);
    EXPECT_EQ(number, c.number) << c.bits;
    EXPECT_EQ(unit, c.unit) << c.bits;
  }
}

TEST(CBoxItemTest, LabelsAreValueCoded) {
  const CBoxItem ns = CBoxItem::FromLabel("#1e-9=1 ns");
  EXPECT_EQ(ns.kind, CBoxItem::kNumber);
  EXPECT_DOUBLE_EQ(ns.number, 1e-9);
  EXPECT_EQ(ns.shown, "1 ns");
  EXPECT_EQ(ns.ValueText(), "1e-9");
  const CBoxItem seq = CBoxItem::FromLabel("$SEQ=Sequence");
  EXPECT_EQ(seq.kind, CBoxItem::kString);
  EXPECT_EQ(seq.text, "SEQ");
  EXPECT_EQ(seq.shown, "Sequence");
  EXPECT_EQ(CBoxItem::FromLabel("Plain").shown, "Plain");
}

TEST(CBoxItemTest, ChoiceTakesTheFirstTextOrTheNearestNumber) {
  const std::vector<CBoxItem> numbers = {CBoxItem::FromLabel("#1=one"), CBoxItem::FromLabel("#2=two"),
                                         CBoxItem::FromLabel("#3=three")};
  EXPECT_EQ(CBoxItem::Choose(numbers, "2.5"), 1);
  EXPECT_EQ(CBoxItem::Choose(numbers, "2.6"), 2);
  EXPECT_EQ(CBoxItem::Choose(numbers, "-7"), 0);
  EXPECT_EQ(CBoxItem::Choose(numbers, "SEQ"), -1);
  const std::vector<CBoxItem> mixed = {CBoxItem::FromLabel("#0=zero"), CBoxItem::FromLabel("$SEQ=Sequence"),
                                       CBoxItem::FromLabel("$SEQ=Again")};
  EXPECT_EQ(CBoxItem::Choose(mixed, "SEQ"), 1);
  EXPECT_EQ(CBoxItem::Choose(mixed, "CLOC"), -1);
}
