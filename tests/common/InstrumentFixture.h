#pragma once

#include <gtest/gtest.h>

#include "common/ScriptedInstrument.h"
#include "instrument/QenGuiInst.h"

// QenGuiInst with a scripted instrument and the handle "_H"; the log goes to the test's own
// temporary directory.
class InstrumentFixture : public testing::Test {
 protected:
  void SetUp() override;
  void TearDown() override;

  ScriptedInstrument& Inst() { return *mInst; }
  DstringList mDeaths;
  ConditionList mList;

 private:
  ScriptedInstrument* mInst = nullptr;
};
