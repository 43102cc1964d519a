#pragma once

#include <gtest/gtest.h>

#include <string>

#include "SimCommandProcessor.h"
#include "SimConfigLoader.h"
#include "SimManualClock.h"

extern const char* const kSimDefaultConfigText;

// A command processor on the default configuration with test control, a hand-driven clock,
// and the handle "_H" on connection 1.
class SimFixture : public ::testing::Test {
 protected:
  static constexpr int kConn = 1;

  static SimParamTable Load(const char* text) {
    SimParamTable table;
    ConditionList list;
    EXPECT_EQ(SimConfigLoader::Load(text, table, list), 0) << list.ToText();
    return table;
  }

  SimFixture() : mSim(Load(kSimDefaultConfigText), mClock, true) { EXPECT_EQ(Handle("_H"), "_H"); }

  // Creates a handle from the proposal and returns what the server named it.
  std::string Handle(const std::string& proposal, int conn = kConn) {
    return Reply(":QEN:INST:HAND:CRE? " + proposal + ",\"PSX\",\"SIM\"", conn).text;
  }
  SimReply Reply(const std::string& text, int conn = kConn) { return mSim.Execute(conn, text); }
  // The reply text of a command that must not fail.
  std::string Text(const std::string& text, int conn = kConn) {
    SimReply r = mSim.Execute(conn, text);
    EXPECT_EQ(r.status, 0) << text;
    return r.text;
  }

  SimManualClock mClock;
  SimCommandProcessor mSim;
};
