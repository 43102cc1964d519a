#include <gtest/gtest.h>

#include <QApplication>
#include <QPushButton>
#include <QTableWidget>
#include <QTest>
#include <memory>

#include "common/gui/GuiSimFixture.h"
#include "core/SelfTest.h"
#include "core/uiapp.h"
#include "windows/MainWin.h"
#include "windows/common/TaskFollower.h"
#include "windows/selftest/SelftestResultWin.h"

namespace {

// The self test through the Instrument menu's action against qensim, whose pace and failing
// module the test sets.
class SelfTestTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    mWin = ShowMainWin();
    Poll();
  }
  void TearDown() override {
    Other(":SYST:TEST:ABOR");
    Other(":SYST:TEST:PACE 600");
    Other(":SYST:TEST:FAIL \"\"");
    mWin.reset();
    GuiSimFixture::TearDown();
  }
  SelftestResultWin* Run() {
    EXPECT_EQ(uiapp::DoSelfTest(mList), 0) << mList.ToText();
    return mWin->findChild<SelftestResultWin*>();
  }
  static std::string Cell(SelftestResultWin* w, int row, int column) {
    return w->Table()->item(row, column)->text().toStdString();
  }

  std::unique_ptr<MainWin> mWin;
};

}  // namespace

TEST_F(SelfTestTest, AModuleMadeToFailIsShownFailedWithWhatItReported) {
  Other(":SYST:TEST:PACE 0");
  Other(":SYST:TEST:FAIL \"CGR1:MOD2\"");
  SelftestResultWin* w = Run();
  ASSERT_NE(w, nullptr);
  EXPECT_FALSE(w->Follower()->IsActive());
  ASSERT_EQ(w->Table()->rowCount(), 5);
  EXPECT_EQ(Cell(w, 0, 2), "Passed");
  EXPECT_EQ(Cell(w, 1, 0), "Group 1 › Module 2");
  EXPECT_EQ(Cell(w, 1, 2), "Failed");
  EXPECT_NE(Cell(w, 1, 3).find("Front end"), std::string::npos);
  EXPECT_EQ(w->StateText().toStdString(), "1 of 5 modules failed: Group 1 › Module 2.");
}

TEST_F(SelfTestTest, CancelStopsItOnTheInstrumentAndLeavesTheRestNotRun) {
  Other(":SYST:TEST:PACE 60000");
  SelftestResultWin* w = Run();
  ASSERT_NE(w, nullptr);
  EXPECT_TRUE(w->Follower()->IsActive());
  EXPECT_EQ(w->StateText().toStdString(), "Testing module 1 of 5…");
  // Held by another client meanwhile: still followed, and said so.
  Control(":TEST:LOCK ON");
  ConditionList locked;
  EXPECT_NE(w->Follower()->Poll(locked), 0);
  EXPECT_TRUE(w->Follower()->IsActive());
  Control(":TEST:LOCK OFF");
  QTest::mouseClick(w->findChild<QPushButton*>(QStringLiteral("PButCancel")), Qt::LeftButton);
  EXPECT_FALSE(w->Follower()->IsActive());
  EXPECT_EQ(Other(":SYST:TEST:STAT?"), "ABOR,0,5");
  EXPECT_EQ(Cell(w, 4, 2), "Not run");
  EXPECT_EQ(w->StateText().toStdString(), "Cancelled after 0 of 5 modules.");
}

TEST_F(SelfTestTest, WithoutTheWindowThereIsNothingToRunItIn) {
  mWin.reset();
  ConditionList list;
  EXPECT_NE(uiapp::DoSelfTest(list), 0);
  EXPECT_NE(list.ToText().find("self test needs its window"), std::string::npos) << list.ToText();
}
