// The simulated error counts: reset and injected error ratios.
#include <gtest/gtest.h>

#include <cstdlib>

#include "SimFixture.h"

namespace {

class SimBerMeterTest : public SimFixture {
 protected:
  static constexpr const char* kPort = ":_H:CGR1:MOD3:CONN1:BER";

  // compared, errors, ratio
  void Read(double& compared, double& errors, double& ratio) {
    const std::string reply = Text(std::string(kPort) + "?");
    char* at = nullptr;
    compared = std::strtod(reply.c_str(), &at);
    errors = std::strtod(at + 1, &at);
    ratio = std::strtod(at + 1, &at);
  }
};

TEST_F(SimBerMeterTest, InjectedRatioDrivesTheErrorsAndResetStartsAfresh) {
  Text(":_H:SGEN:GLOB:INIT:CONT ON");
  Text(std::string(kPort) + ":INJ 1E-3");
  mClock.Advance(1000);
  double compared = 0, errors = 0, ratio = 0;
  Read(compared, errors, ratio);
  ASSERT_GT(compared, 1e6);
  EXPECT_NEAR(ratio, 1e-3, 1e-5);
  Text(std::string(kPort) + ":RES");
  Read(compared, errors, ratio);
  EXPECT_EQ(compared, 0);
  EXPECT_EQ(errors, 0);
  // Back to the port's own ratio, far below the injected one.
  Text(std::string(kPort) + ":INJ 0");
  mClock.Advance(1000);
  Read(compared, errors, ratio);
  EXPECT_GT(compared, 1e6);
  EXPECT_LT(ratio, 1e-6);
}

TEST_F(SimBerMeterTest, RefusedForms) {
  struct Case {
    std::string command;
    const char* error;
  };
  const Case cases[] = {
      {std::string(kPort) + ":INJ 0.7", "-222"},
      {std::string(kPort) + ":INJ x", "-222"},
      {std::string(kPort) + ":INJ?", "-113"},
      {std::string(kPort) + ":RES?", "-113"},
      {std::string(kPort) + " 1", "-200"},
  };
  for (const Case& c : cases) {
    Reply(c.command);
    EXPECT_EQ(Text(":_H:SYST:ERR?").substr(0, 4), c.error) << c.command;
  }
}

TEST(SimBerMeterWithoutTestControl, RefusesInjection) {
  SimManualClock clock;
  SimParamTable table;
  ConditionList list;
  ASSERT_EQ(SimConfigLoader::Load(kSimDefaultConfigText, table, list), 0);
  SimCommandProcessor sim(table, clock, false);
  ASSERT_EQ(sim.Execute(1, ":QEN:INST:HAND:CRE? _H,\"PSX\",\"SIM\"").text, "_H");
  EXPECT_NE(sim.Execute(1, ":_H:CGR1:MOD3:CONN1:BER:INJ 1E-3").status, 0);
  EXPECT_EQ(sim.Execute(1, ":_H:CGR1:MOD3:CONN1:BER:RES").status, 0);
}

}  // namespace
