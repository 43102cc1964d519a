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
  // The read of a parameter source: its value and clash state in one joined query.
  void ExpectRead(const Dstring& header, const Dstring& value, bool clashing = false) {
    Inst().Expect(header + "?;" + header + "? CLAS", value + (clashing ? ";1" : ";0"));
  }
  DstringList mDeaths;
  ConditionList mList;

 private:
  ScriptedInstrument* mInst = nullptr;
};
