// The simulated automatic deskew: delays set port by port, and put back when cancelled.
#include <gtest/gtest.h>

#include "SimFixture.h"

namespace {

class SimDeskewTest : public SimFixture {
 protected:
  double Delay(const std::string& port) { return std::stod(Text(":_H" + port + ":PULS:DEL?")); }
};

TEST_F(SimDeskewTest, SetsEveryDataPortsDelayInTurnAndOthersHearOfIt) {
  ASSERT_EQ(Handle("_O", 2), "_O");
  Text(":_H:SYST:DESK:STAR");
  EXPECT_EQ(Text(":_H:SYST:DESK:STAT?"), "RUNN,0,10");
  mClock.Advance(900);
  EXPECT_EQ(Text(":_H:SYST:DESK:STAT?"), "RUNN,2,10");
  EXPECT_GT(Delay(":CGR1:MOD1:CONN1"), 19e-12);
  EXPECT_EQ(Delay(":CGR2:MOD2:CONN2"), 0.0);
  EXPECT_NE(Text(":_O:DFL?", 2).find(":CGR1:MOD1:CONN1:PULS:DEL"), std::string::npos);
  mClock.Advance(4000);
  EXPECT_EQ(Text(":_H:SYST:DESK:STAT?"), "DONE,10,10");
  EXPECT_GT(Delay(":CGR2:MOD2:CONN2"), 19e-12);
}

TEST_F(SimDeskewTest, CancelPutsBackTheDelaysItHadSet) {
  Text(":_H:CGR1:MOD1:CONN1:PULS:DEL 5E-12");
  Text(":_H:SYST:DESK:STAR");
  mClock.Advance(900);
  EXPECT_NE(Delay(":CGR1:MOD1:CONN1"), 5e-12);
  Text(":_H:SYST:DESK:ABOR");
  EXPECT_EQ(Text(":_H:SYST:DESK:STAT?"), "ABOR,2,10");
  EXPECT_DOUBLE_EQ(Delay(":CGR1:MOD1:CONN1"), 5e-12);
  EXPECT_EQ(Delay(":CGR1:MOD1:CONN2"), 0.0);
  Text(":_H:SGEN:GLOB:INIT:CONT ON");
  Reply(":_H:SYST:DESK:STAR");
  EXPECT_EQ(Text(":_H:SYST:ERR?").substr(0, 4), "-200");
}

}  // namespace
