#include <gtest/gtest.h>

#include <QPushButton>
#include <QTest>
#include <memory>

#include "common/gui/GuiSimFixture.h"
#include "params/ui/ParSpinBox.h"
#include "params/ui/QenParEd.h"
#include "windows/common/TaskFollower.h"
#include "windows/deskew/DeskewDeskewWin.h"

namespace {

// The deskew window against qensim, whose pace the test sets.
class DeskewTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    Poll();
    mWin = std::make_unique<DeskewDeskewWin>();
    ASSERT_EQ(mWin->Load(mList), 0) << mList.ToText();
    mWin->show();
  }
  void TearDown() override {
    Other(":SYST:DESK:ABOR");
    Other(":SYST:DESK:PACE 400");
    mWin.reset();
    GuiSimFixture::TearDown();
  }
  QenParEd* Field(int n) const { return mWin->findChild<QenParEd*>(QStringLiteral("FieldDelay%1").arg(n)); }
  void Click(const char* name) { QTest::mouseClick(mWin->findChild<QPushButton*>(QString::fromLatin1(name)), Qt::LeftButton); }

  std::unique_ptr<DeskewDeskewWin> mWin;
};

}  // namespace

TEST_F(DeskewTest, EveryDataPortHasItsDelayAndTheAutomaticDeskewSetsThem) {
  ASSERT_NE(Field(10), nullptr);
  EXPECT_EQ(Field(11), nullptr);
  EXPECT_EQ(Field(1)->GetDsName(), ":" + mHandle + ":CGR1:MOD1:CONN1:PULS:DEL");
  Other(":SYST:DESK:PACE 0");
  Click("PButStart");
  EXPECT_FALSE(mWin->Follower()->IsActive());
  EXPECT_EQ(mWin->StateText().toStdString(), "All 10 ports deskewed.");
  const double set = OtherNumber(":CGR1:MOD1:CONN1:PULS:DEL");
  EXPECT_GT(set, 0.0);
  Poll();
  EXPECT_NEAR(Field(1)->Editor()->Text().toDouble() * 1e-9, set, 1e-13) << Field(1)->Editor()->Text().toStdString();
}

TEST_F(DeskewTest, CancelHalfWayLeavesTheDelaysAsTheyWere) {
  Other(":CGR1:MOD1:CONN1:PULS:DEL 5E-12");
  Other(":SYST:DESK:PACE 60000");
  Click("PButStart");
  EXPECT_TRUE(mWin->Follower()->IsActive());
  EXPECT_EQ(mWin->StateText().toStdString(), "Measuring port 1 of 10…");
  Click("PButCancel");
  EXPECT_FALSE(mWin->Follower()->IsActive());
  EXPECT_EQ(Other(":SYST:DESK:STAT?"), "ABOR,0,10");
  EXPECT_DOUBLE_EQ(OtherNumber(":CGR1:MOD1:CONN1:PULS:DEL"), 5e-12);
  EXPECT_EQ(mWin->StateText().toStdString(), "Cancelled; the delays are as they were before.");
}
