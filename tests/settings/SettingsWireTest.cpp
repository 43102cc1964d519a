// Every command text of the profiles, to the byte (the first setting's load and new setting:
// StartUpWire).
#include <gtest/gtest.h>

#include "common/InstrumentFixture.h"
#include "common/WireTable.h"
#include "settings/QENSettingProfile.h"
#include "settings/QENSystemProfile.h"

namespace {

const std::map<Dstring, WireReply> kReplies = {
    {"_H:CONF:PROF? \"N\"", {"(5i)"}},
    {"_H:CONF:PROF:LIST?", {"\"N\""}},
    {"_H:CONF:CSET:PROF:EXPR?", {"(2.0)"}},
};

template <typename T>
WireRow SystemWrite(const char* operation, T value, const char* valueText) {
  return {operation, [value](ConditionList& l) { return QENSystemProfile::SetValue("N", value, l); },
          {Dstring("_H:CONF:PROF \"N\",") + valueText}};
}

const WireRow kRows[] = {
    SystemWrite("system long", -5L, "(-5i)"),
    SystemWrite("system unsigned", 7UL, "(7u)"),
    SystemWrite("system float", 1.5f, "(1.500000f)"),
    SystemWrite("system double", 2.5, "(2.500000d)"),
    // Six decimals would turn these into other values: the shortest exact form instead.
    SystemWrite("system double below six decimals", 2.5e-9, "(2.5e-09d)"),
    SystemWrite("system float beyond six decimals", 1.0f / 3, "(0.33333334f)"),
    SystemWrite("system text", Dstring("say \"hi\""), "\"say \"\"hi\"\"\""),
    SystemWrite("system list", DataParcel(2, DataItem::MakeWord("x")), "(x,x)"),
    {"system read",
     [](ConditionList& l) {
       long v = 0;
       return QENSystemProfile::GetValue("N", v, l);
     },
     {"_H:CONF:PROF? \"N\""}},
    {"system exists",
     [](ConditionList& l) {
       int exists = 0;
       return QENSystemProfile::Exists("N", exists, l);
     },
     {"_H:CONF:PROF:LIST?"}},
    {"setting read and write",
     [](ConditionList& l) {
       return QENSettingProfile::Read(l) | QENSettingProfile::SetValue("A", 1L, l) | QENSettingProfile::Write(l);
     },
     {"_H:CONF:CSET:PROF:EXPR?", "_H:CONF:CSET:PROF:EXPR (2.0,(\"A\",\"(1i)\"))"}},
};

class SettingsWire : public InstrumentFixture, public testing::WithParamInterface<WireRow> {};

TEST_P(SettingsWire, SendsItsTextsToTheByte) { CheckWireRow(GetParam(), Inst(), kReplies, mList); }

INSTANTIATE_TEST_SUITE_P(Table, SettingsWire, testing::ValuesIn(kRows), WireRowName);

}  // namespace
