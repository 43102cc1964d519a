#include <gtest/gtest.h>

#include "support/LgsDebug.h"
#include "support/MeasTimer.h"

namespace {

struct TraceCase {
  const char* switchedOn;
  const char* scopeCategories;
  bool written;
};

class LgsDebugTest : public testing::TestWithParam<TraceCase> {
 protected:
  void SetUp() override {
    LgsDebug::SetSink([this](const Dstring& line) { mLines += line; });
  }
  void TearDown() override {
    LgsDebug::SetSink(nullptr);
    LgsDebug::SetCategories("");
  }
  Dstring mLines;
};

}  // namespace

TEST_P(LgsDebugTest, WritesOnlyForSwitchedOnCategories) {
  LgsDebug::SetCategories(GetParam().switchedOn);
  LgsDebug scope("QenGuiInst::Call ", GetParam().scopeCategories);
  scope.Printf("Command : %s\n", ":H:X?");
  EXPECT_EQ(scope.IsOn(), GetParam().written);
  EXPECT_EQ(mLines, GetParam().written ? "QenGuiInst::Call Command : :H:X?\n" : "");
}

INSTANTIATE_TEST_SUITE_P(Table, LgsDebugTest,
                         testing::Values(TraceCase{"", "qenguiinst,traffic", false},
                                         TraceCase{"traffic", "qenguiinst,traffic", true},
                                         TraceCase{"dte,qenguiinst", "qenguiinst,traffic", true},
                                         TraceCase{"all", "ur,dte", true},
                                         TraceCase{"qengui", "qenguiinst,traffic", false}));

TEST(MeasTimerTest, CountsFromResetOnTheInjectedClock) {
  double now = 100.0;
  MeasTimer timer([&] { return now; });
  now = 101.25;
  EXPECT_DOUBLE_EQ(timer.Get(), 1.25);
  timer.Reset();
  now = 102.0;
  EXPECT_DOUBLE_EQ(timer.Get(), 0.75);
}
