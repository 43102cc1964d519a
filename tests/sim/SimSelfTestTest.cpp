// The simulated self test: pace, a module made to fail, cancel, and what it refuses.
#include <gtest/gtest.h>

#include "SimFixture.h"

namespace {

using SimSelfTestTest = SimFixture;

TEST_F(SimSelfTestTest, ModulesAreTestedInTurnAndAFailingOneIsReported) {
  Text(":_H:SYST:TEST:FAIL \"CGR1:MOD2\"");
  EXPECT_EQ(Text(":_H:SYST:TEST:STAT?"), "IDLE,0,0");
  Text(":_H:SYST:TEST:STAR");
  EXPECT_EQ(Text(":_H:SYST:TEST:STAT?"), "RUNN,0,5");
  mClock.Advance(1300);  // two modules at 0.6 s each
  EXPECT_EQ(Text(":_H:SYST:TEST:STAT?"), "RUNN,2,5");
  Reply(":_H:SYST:TEST:STAR");
  EXPECT_EQ(Text(":_H:SYST:ERR?").substr(0, 4), "-200");
  mClock.Advance(2000);
  EXPECT_EQ(Text(":_H:SYST:TEST:STAT?"), "DONE,5,5");
  const std::string results = Text(":_H:SYST:TEST:RES?");
  EXPECT_EQ(results.substr(0, 54), "(\":CGR1:MOD1\",\"K2268A\",PASS,\"\"),(\":CGR1:MOD2\",\"K2269B\"") << results;
  EXPECT_NE(results.find("\"K2269B\",FAIL,\"Front end of K2269B"), std::string::npos) << results;
}

TEST_F(SimSelfTestTest, CancelLeavesTheRestUntested) {
  Text(":_H:SYST:TEST:STAR");
  mClock.Advance(700);
  Text(":_H:SYST:TEST:ABOR");
  mClock.Advance(5000);
  EXPECT_EQ(Text(":_H:SYST:TEST:STAT?"), "ABOR,1,5");
  const std::string results = Text(":_H:SYST:TEST:RES?");
  EXPECT_NE(results.find("PASS"), std::string::npos);
  EXPECT_NE(results.find("(\":CGR2:MOD2\",\"K2270A\",NRUN,\"\")"), std::string::npos) << results;
}

TEST_F(SimSelfTestTest, RefusedWhileRunningAndForBadPace) {
  Text(":_H:SGEN:GLOB:INIT:CONT ON");
  Reply(":_H:SYST:TEST:STAR");
  EXPECT_EQ(Text(":_H:SYST:ERR?").substr(0, 4), "-200");
  Text(":_H:SGEN:GLOB:INIT:CONT OFF");
  Reply(":_H:SYST:TEST:PACE -1");
  EXPECT_EQ(Text(":_H:SYST:ERR?").substr(0, 4), "-222");
  Text(":_H:SYST:TEST:PACE 0");
  Text(":_H:SYST:TEST:STAR");
  EXPECT_EQ(Text(":_H:SYST:TEST:STAT?"), "DONE,5,5");
}

}  // namespace
