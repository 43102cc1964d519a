// The front-end information of the rack and the connection list: strict reading of the replies,
// and when the front-end information is asked again.
#include <gtest/gtest.h>

#include "common/InstrumentFixture.h"
#include "sequences/CFrontendInfo.h"
#include "sequences/CPortConnections.h"
#include "sequences/CPortInfo.h"

namespace {

constexpr const char* kRack =
    "(1,(\":CGR1:MOD1\",\"K2268A\",GEN,1,(\":CGR1:MOD1:CONN1\",\"PDAT\",8),(\":CGR1:MOD1:CONN3\",\"PCLK\",1))"
    ","
    "(\":CGR1:MOD3\",\"K2270A\",ANA,3,(\":CGR1:MOD3:CONN1\",\"PDAT\",8))),(2)";
constexpr const char* kPorts =
    "\"PATT\",\"\",(\":CGR1:MOD1:CONN1\",\"PDAT\",\"OUTPUT_PORT\",\"K2268A\"),"
    "(\":CGR1:MOD1:CONN3\",\"PCLK\",\"OUTPUT_PORT\",\"K2268A\"),(\":CGR1:MOD3:CONN1\",\"PDAT\",\"INPUT_"
    "PORT\",\"K2270A\")";

class FrontendInfoTest : public InstrumentFixture {
 protected:
  void SetUp() override {
    InstrumentFixture::SetUp();
    CPortInfo::Invalidate();
    CFrontendInfo::Invalidate();
  }
  void TearDown() override {
    CPortInfo::Invalidate();
    CFrontendInfo::Invalidate();
    InstrumentFixture::TearDown();
  }
  Dstring LastKey() const { return mList.IsEmpty() ? Dstring() : mList.Last().GetKey(); }
};

TEST_F(FrontendInfoTest, ReadsGroupsModulesAndPorts) {
  ASSERT_EQ(CFrontendInfo::SetFrontend(kRack, mList), 0) << mList.ToText();
  const auto& groups = CFrontendInfo::GetGroups();
  ASSERT_EQ(groups.size(), 2u);
  EXPECT_EQ(groups[1].number, 2);
  EXPECT_TRUE(groups[1].modules.empty());
  ASSERT_EQ(groups[0].modules.size(), 2u);
  const CFrontendInfo::Module& gen = groups[0].modules[0];
  EXPECT_EQ(gen.path, ":CGR1:MOD1");
  EXPECT_EQ(gen.model, "K2268A");
  EXPECT_TRUE(gen.generator);
  EXPECT_EQ(gen.slot, 1);
  ASSERT_EQ(gen.ports.size(), 2u);
  EXPECT_EQ(gen.ports[1], (CFrontendInfo::Port{":CGR1:MOD1:CONN3", "PCLK", 1}));
  const CFrontendInfo::Module* module = nullptr;
  const CFrontendInfo::Port* port = CFrontendInfo::FindPort(":CGR1:MOD3:CONN1", &module);
  ASSERT_NE(port, nullptr);
  EXPECT_EQ(port->terminals, 8);
  EXPECT_FALSE(module->generator);
  EXPECT_EQ(CFrontendInfo::FindPort(":CGR1:MOD3:CONN2"), nullptr);
  EXPECT_EQ(CFrontendInfo::SetFrontend("", mList), 0) << "a rack without clock groups";
  EXPECT_TRUE(CFrontendInfo::GetGroups().empty());
}

TEST_F(FrontendInfoTest, AMalformedReplyIsRefusedWholeAndTheOldOneKept) {
  ASSERT_EQ(CFrontendInfo::SetFrontend(kRack, mList), 0);
  const char* const bad[] = {
      "1",                                                                     // a group that is no list
      "()",                                                                    // no number
      "(0)",                                                                   // group 0
      "(\"1\")",                                                               // number as text
      "(1,(\":CGR1:MOD1\",\"K\",GEN))",                                        // no slot
      "(1,(\":CGR1:MOD1\",\"K\",BOTH,1))",                                     // kind
      "(1,(\":CGR1:MOD1\",\"\",GEN,1))",                                       // no model
      "(1,(\":CGR1:MOD1\",\"K\n\",GEN,1))",                                    // a control character
      "(1,(\":CGR2:MOD1\",\"K\",GEN,1))",                                      // module of another group
      "(1,(\":CGR1:MODX\",\"K\",GEN,1))",                                      // module number
      "(1,(\":CGR1:MOD1\",\"K\",GEN,0))",                                      // slot 0
      "(1,(\":CGR1:MOD1\",\"K\",GEN,1),(\":CGR1:MOD2\",\"K\",ANA,1))",         // one slot twice
      "(1,(\":CGR1:MOD1\",\"K\",GEN,1,(\":CGR1:MOD2:CONN1\",\"PDAT\",8)))",    // port of another module
      "(1,(\":CGR1:MOD1\",\"K\",GEN,1,(\":CGR1:MOD1:CONN1\",\"PXXX\",8)))",    // class
      "(1,(\":CGR1:MOD1\",\"K\",GEN,1,(\":CGR1:MOD1:CONN1\",\"PDAT\",0)))",    // no terminals
      "(1,(\":CGR1:MOD1\",\"K\",GEN,1,(\":CGR1:MOD1:CONN1\",\"PDAT\",8.5)))",  // terminals not whole
      "(1,(\":CGR1:MOD1\",\"K\",GEN,1,(\":CGR1:MOD1:CONN1\",\"PDAT\")))",      // too short
      "(1,(\":CGR1:MOD1\",\"K\",GEN,1,(\":CGR1:MOD1:CONN1\",\"PDAT\",8,1)))",  // too long
      "(1,(\":CGR1:MOD1\",\"K\",GEN,1,(\":CGR1:MOD1:CONN1\",\"PDAT\",8)",      // cut short
  };
  for (const char* reply : bad) {
    mList.Clear();
    EXPECT_EQ(CFrontendInfo::SetFrontend(reply, mList), 1) << reply;
    EXPECT_EQ(LastKey(), "GUI_FRONTEND_BAD_INFO") << reply;
  }
  ASSERT_EQ(CFrontendInfo::GetGroups().size(), 2u);
  EXPECT_EQ(CFrontendInfo::GetGroups()[0].modules.size(), 2u);
}

TEST_F(FrontendInfoTest, ReadOnceAndAgainWhenThePortInformationChanges) {
  Inst().Expect("_H:SGEN:GLOB:CONF?", kPorts);
  Inst().Expect("_H:CONF:FRON?", kRack);
  ASSERT_EQ(CFrontendInfo::Update(mList), 0) << mList.ToText();
  ASSERT_EQ(CFrontendInfo::Update(mList), 0);
  // A mode change is no change of ports.
  Inst().Expect("_H:SGEN:GLOB:CONF?", Dstring(kPorts).replace(1, 4, "CAPT"));
  ASSERT_EQ(CPortInfo::Update(mList), 0);
  ASSERT_EQ(CFrontendInfo::Update(mList), 0);
  Inst().Expect("_H:SGEN:GLOB:CONF?",
                "\"PATT\",\"\",(\":CGR1:MOD1:CONN1\",\"PDAT\",\"OUTPUT_PORT\",\"K2268A\")");
  ASSERT_EQ(CPortInfo::Update(mList), 0);
  Inst().Expect("_H:CONF:FRON?", "(1,(\":CGR1:MOD1\",\"K2268A\",GEN,1,(\":CGR1:MOD1:CONN1\",\"PDAT\",8)))");
  ASSERT_EQ(CFrontendInfo::Update(mList), 0);
  EXPECT_EQ(CFrontendInfo::GetGroups().size(), 1u);
  EXPECT_TRUE(Inst().AllConsumed());
  // A refused read keeps nothing half-filled and is asked again next time.
  CFrontendInfo::Invalidate();
  Inst().Expect("_H:CONF:FRON?", "(1,(\":CGR1:MOD1\"");
  EXPECT_EQ(CFrontendInfo::Update(mList), 1);
  EXPECT_FALSE(CFrontendInfo::IsKnown());
  EXPECT_TRUE(CFrontendInfo::GetGroups().empty());
  Inst().Expect("_H:CONF:FRON?", kRack);
  EXPECT_EQ(CFrontendInfo::Update(mList), 0);
  EXPECT_TRUE(Inst().AllConsumed());
}

TEST_F(FrontendInfoTest, ConnectionListsGoodAndMalformed) {
  CPortConnections connections;
  ASSERT_EQ(
      connections.SetConnections(
          "(\":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\"),(\":CGR1:MOD1:CONN2\",\":CGR1:MOD3:CONN2\")", mList),
      0);
  ASSERT_EQ(connections.Get().size(), 2u);
  EXPECT_EQ(connections.Get()[1], (CPortConnections::Connection{":CGR1:MOD1:CONN2", ":CGR1:MOD3:CONN2"}));
  const char* const bad[] = {
      "(\":CGR1:MOD1:CONN1\")",
      "(\":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\",\":CGR1:MOD3:CONN2\")",
      "(:CGR1:MOD1:CONN1,\":CGR1:MOD3:CONN1\")",
      "(\"GEN\",\":CGR1:MOD3:CONN1\")",
      "(\":CGR1:MOD1:CONN1\",\":CGR1:MOD1:CONN1\")",
      "(\":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\"),(\":CGR1:MOD2:CONN1\",\":CGR1:MOD3:CONN1\")",
      "\":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\"",
      "(\":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\"",
  };
  for (const char* reply : bad) {
    mList.Clear();
    EXPECT_EQ(connections.SetConnections(reply, mList), 1) << reply;
    EXPECT_EQ(LastKey(), "GUI_CONNECTIONS_BAD_LIST") << reply;
  }
  EXPECT_EQ(connections.Get().size(), 2u);
  ASSERT_EQ(connections.SetConnections("", mList), 0);
  EXPECT_TRUE(connections.Get().empty());
}

TEST_F(FrontendInfoTest, ChangesGoOutAsTheyAreWrittenAndTheListIsReadBack) {
  CPortConnections connections;
  Inst().Expect("_H:CONF:CONN:ADD \":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\"", "");
  Inst().Expect("_H:CONF:CONN?", "(\":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\")");
  EXPECT_EQ(connections.Add(":CGR1:MOD1:CONN1", ":CGR1:MOD3:CONN1", mList), 0) << mList.ToText();
  EXPECT_EQ(connections.Get().size(), 1u);
  Inst().Expect("_H:CONF:CONN:DEL \":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\"", "");
  Inst().Expect("_H:CONF:CONN?", "");
  EXPECT_EQ(connections.Remove(":CGR1:MOD1:CONN1", ":CGR1:MOD3:CONN1", mList), 0);
  EXPECT_TRUE(connections.Get().empty());
  EXPECT_EQ(connections.Add(":CGR1\";X", ":CGR1:MOD3:CONN1", mList), -6);
  EXPECT_EQ(LastKey(), "GUI_COMMAND_BAD_TEXT");
  EXPECT_TRUE(Inst().AllConsumed());
  EXPECT_TRUE(CPortConnections::NfyMatchDirtyFlag(":_H:CONF:CONN"));
  EXPECT_TRUE(CPortConnections::NfyMatchDirtyFlag("ALL"));
  EXPECT_FALSE(CPortConnections::NfyMatchDirtyFlag(":_H:CONF:PROF"));
}

}  // namespace
