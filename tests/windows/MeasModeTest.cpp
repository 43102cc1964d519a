#include <gtest/gtest.h>

#include <QComboBox>
#include <QGroupBox>
#include <QTest>
#include <memory>

#include "common/gui/GuiSimFixture.h"
#include "core/MeasconfMeasMode.h"
#include "core/uiapp.h"
#include "params/ui/ParSpinBox.h"
#include "params/ui/QenParEd.h"
#include "windows/measconf/MeasconfMeasModeDlg.h"

namespace {

// The measurement mode dialog against qensim.
class MeasModeTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    Poll();
    mDlg = std::make_unique<MeasconfMeasModeDlg>();
    ASSERT_EQ(mDlg->Load(mList), 0) << mList.ToText();
    mDlg->show();
    QApplication::setActiveWindow(mDlg.get());
  }
  void TearDown() override {
    Other(":SGEN:GLOB:INIT:CONT OFF");
    Other(":MEAS:MODE PATT");
    Other(":MEAS:GATE:TIME 1");
    mDlg.reset();
    GuiSimFixture::TearDown();
  }
  // Types into the gate time field (counting bit errors, where it counts) and leaves the text
  // there, uncommitted.
  void TypeGateTime(const char* text) {
    Other(":MEAS:MODE BER");
    Poll();
    ParSpinBox* editor = mDlg->findChild<QenParEd*>(QStringLiteral("FieldGateTime"))->Editor();
    editor->setFocus();
    ASSERT_TRUE(editor->hasFocus());
    editor->selectAll();
    QTest::keyClicks(editor, QString::fromLatin1(text));
  }
  QComboBox* Box(const char* name) const { return mDlg->findChild<QComboBox*>(QString::fromLatin1(name)); }
  QGroupBox* Group(const char* name) const { return mDlg->findChild<QGroupBox*>(QString::fromLatin1(name)); }

  std::unique_ptr<MeasconfMeasModeDlg> mDlg;
};

}  // namespace

TEST_F(MeasModeTest, FollowsTheModeASecondClientSetsAndGreysWhatItDoesNotUse) {
  EXPECT_EQ(Box("BoxMode")->currentIndex(), 0);
  EXPECT_FALSE(Group("GroupGate")->isEnabled());
  Other(":MEAS:MODE BER");
  Poll();
  EXPECT_EQ(Box("BoxMode")->currentIndex(), 2);
  EXPECT_TRUE(Group("GroupGate")->isEnabled());
  EXPECT_FALSE(Group("GroupCapture")->isEnabled());
  Box("BoxMode")->setCurrentIndex(1);
  Box("BoxMode")->activated(1);
  EXPECT_EQ(Other(":MEAS:MODE?"), "CAPT");
  EXPECT_TRUE(Group("GroupCapture")->isEnabled());
}

TEST_F(MeasModeTest, RunSendsTheValueStillBeingTypedFirst) {
  TypeGateTime("2.5");
  EXPECT_DOUBLE_EQ(OtherNumber(":MEAS:GATE:TIME"), 1.0);
  ASSERT_EQ(uiapp::Run(mList), 0) << mList.ToText();
  EXPECT_DOUBLE_EQ(OtherNumber(":MEAS:GATE:TIME"), 2.5);
  EXPECT_EQ(Other(":SGEN:GLOB:INIT:CONT?"), "ON");
}

TEST_F(MeasModeTest, ARefusedPendingValueKeepsTheInstrumentStopped) {
  TypeGateTime("x");
  EXPECT_NE(uiapp::Run(mList), 0);
  EXPECT_FALSE(mList.IsEmpty());
  EXPECT_EQ(Other(":SGEN:GLOB:INIT:CONT?"), "OFF");
  // Without the dialog there is nothing to send.
  mDlg.reset();
  EXPECT_EQ(MeasconfMeasMode::GetEditor(), nullptr);
  ConditionList list;
  EXPECT_EQ(MeasconfMeasMode::UpdateBeforeRun(list), 0);
}
