// The port information the sequence needs: the configuration reply and its use.
#include <gtest/gtest.h>

#include "sequences/SequenceFixture.h"

namespace {

using PortInfoTest = SequenceFixture;

TEST_F(PortInfoTest, ReadsPortsByClassInConfigurationOrder) {
  EXPECT_TRUE(CPortInfo::IsKnown());
  EXPECT_FALSE(CPortInfo::HasCentral());
  EXPECT_EQ(CPortInfo::GetMode(), "PATT");
  EXPECT_EQ(CPortInfo::GetNumPorts("PDAT"), 2u);
  EXPECT_EQ(CPortInfo::GetNumPorts("PCLK"), 1u);
  Dstring type;
  ASSERT_EQ(CPortInfo::GetPortType("PDAT", 2, type, mList), 0);
  EXPECT_EQ(type, "INPUT_PORT");
  ASSERT_EQ(CPortInfo::GetPortType("PCLK", 1, type, mList), 0);
  EXPECT_EQ(type, "OUTPUT_PORT");
  EXPECT_EQ(CPortInfo::GetPorts()[1].path, ":CGR1:MOD1:CONN3");
  EXPECT_EQ(CPortInfo::GetPorts()[2].model, "K2270A");
  EXPECT_EQ(CPortInfo::GetPortType("PDAT", 3, type, mList), 1);
  EXPECT_EQ(LastKey(), "GUI_PORTINFO_NO_PORT");
  EXPECT_EQ(CPortInfo::GetPortType("PDAT", 0, type, mList), 1);
  EXPECT_TRUE(mFake.received.empty());
}

TEST_F(PortInfoTest, AnUnreadableConfigurationIsRefusedAndTheOldOneKept) {
  for (const char* bad : {"", "\"PATT\"", "(\"PATT\"),\"\"", "\"PATT\",\"\",(\":CGR1\",\"PDAT\")",
                          "\"PATT\",\"\",(\":CGR1\",\"PDAT\",\"INPUT_PORT\",(\"K\"))", "\"PATT"}) {
    mList.Clear();
    EXPECT_EQ(CPortInfo::SetConfiguration(bad, mList), 1) << bad;
    EXPECT_EQ(LastKey(), "GUI_PORTINFO_BAD_CONFIGURATION");
  }
  EXPECT_EQ(CPortInfo::GetNumPorts("PDAT"), 2u);
}

TEST_F(PortInfoTest, WhatIsNotKnownIsAskedOnce) {
  CPortInfo::Invalidate();
  EXPECT_FALSE(CPortInfo::IsKnown());
  mFake.configuration = "\"CAPT\",\"K2200A\"";
  EXPECT_TRUE(CPortInfo::HasCentral());
  EXPECT_TRUE(CPortInfo::HasCentral());
  EXPECT_EQ(mFake.received, DstringList{"_H:SGEN:GLOB:CONF?"});
  EXPECT_EQ(CPortInfo::GetCentralModel(), "K2200A");
  EXPECT_EQ(CPortInfo::GetNumPorts("PDAT"), 0u);
}

TEST_F(PortInfoTest, WithoutAnAnswerThereIsNoCentralModule) {
  CPortInfo::Invalidate();
  mFake.configuration = "nonsense(";
  EXPECT_FALSE(CPortInfo::HasCentral());
  EXPECT_FALSE(CPortInfo::IsKnown());
  EXPECT_TRUE(mList.IsEmpty()) << "its conditions are dropped";
}

TEST_F(PortInfoTest, DirtyFlagNames) {
  EXPECT_TRUE(CPortInfo::NfyMatchDirtyFlag("ALL"));
  EXPECT_TRUE(CPortInfo::NfyMatchDirtyFlag(":_H:SGEN:GLOB:CONF"));
  EXPECT_FALSE(CPortInfo::NfyMatchDirtyFlag(":_H:SGEN:GLOB:SEQ"));
}

TEST_F(PortInfoTest, NewBlocksTakeTheDefaultsOfTheConfigurationKnown) {
  ASSERT_EQ(CPortInfo::SetConfiguration(Dstring(FakeSequencer::kConfiguration).replace(1, 4, "CAPT"), mList),
            0);
  ASSERT_EQ(mSeq.fromExpression("(3.0,,)", mList), 0);
  EXPECT_EQ(mSeq.GetType(1, 1), CSequence::SEG_ACQUIRE);
  EXPECT_EQ(mSeq.GetType(1, 2), CSequence::SEG_PAUSE0);
  CPortInfo::Invalidate();
  ASSERT_EQ(mSeq.fromExpression("(3.0,,)", mList), 0);
  EXPECT_EQ(mSeq.GetNumPorts(), 0u) << "nothing known: a block without ports";
  EXPECT_TRUE(mFake.received.empty()) << "making a block asks nothing";
}

}  // namespace
