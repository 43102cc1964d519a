// The saved segments as the other clients hear of them: a change of the catalogue marks
// ":EDIT:SEGM:CAT" on every other handle's dirty flag, and only a change does.
#include <gtest/gtest.h>

#include <unistd.h>
#include <filesystem>
#include <string>

#include "SimFixture.h"

namespace {

class SimSegmentCatalogTest : public testing::Test {
 protected:
  static constexpr int kOther = 2;
  SimSegmentCatalogTest()
      : mDir((std::filesystem::temp_directory_path() / ("qensim-catalog-" + std::to_string(::getpid())))
                 .string()),
        mSim(Configured(), mClock, true, mDir) {
    EXPECT_EQ(mSim.Execute(1, ":QEN:INST:HAND:CRE? _H,\"PSX\",\"SIM\"").text, "_H");
    EXPECT_EQ(mSim.Execute(kOther, ":QEN:INST:HAND:CRE? _B,\"PSX\",\"SIM\"").text, "_B");
  }
  ~SimSegmentCatalogTest() override { std::filesystem::remove_all(mDir); }
  static SimParamTable Configured() {
    SimParamTable table;
    ConditionList list;
    EXPECT_EQ(SimConfigLoader::Load(kSimDefaultConfigText, table, list), 0) << list.ToText();
    return table;
  }

  std::string mDir;
  SimManualClock mClock;
  SimCommandProcessor mSim;
};

}  // namespace

TEST_F(SimSegmentCatalogTest, TheOtherHandlesHearOfEveryChangeOfTheSavedSegments) {
  struct Step {
    const char* command;
    int status;
    const char* heard;  // what _B's next dirty flag reply says
  };
  const Step steps[] = {
      {":_H:EDIT:SEGM:CRE? \"walkB8\",MEM", 0, "\":_B:EDIT:SEGM:CAT\""},
      {":_H:EDIT:SEGM1:SAVE", 0, ""},  // the file was there: the catalogue stays
      {":_H:EDIT:SEGM1:SAVE \"walkB9\"", 0, "\":_B:EDIT:SEGM:CAT\""},
      {":_H:EDIT:SEGM:DEL \"walkB8\"", 1, ""},  // still open: refused, nothing changed
      {":_H:EDIT:SEGM1:CLOS", 0, ""},
      {":_H:EDIT:SEGM:DEL \"walkB8\"", 0, "\":_B:EDIT:SEGM:CAT\""},
      {":_H:EDIT:SEGM:DEL \"walkB8\"", 1, ""},
  };
  for (const Step& step : steps) {
    EXPECT_EQ(mSim.Execute(1, step.command).status, step.status) << step.command;
    EXPECT_EQ(mSim.Execute(kOther, ":_B:DFL?").text, step.heard) << step.command;
    EXPECT_EQ(mSim.Execute(1, ":_H:DFL?").text, "") << "the handle's own change: " << step.command;
  }
  EXPECT_EQ(mSim.Execute(1, ":_H:EDIT:SEGM:CAT?").text, "\"walkB9\"");
}
