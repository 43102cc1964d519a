#include <gtest/gtest.h>

#include <QApplication>
#include <QLabel>
#include <QLineEdit>
#include <QMdiArea>
#include <QMdiSubWindow>
#include <QPushButton>
#include <QTableWidget>
#include <QTest>
#include <QTreeWidget>
#include <memory>

#include "common/gui/GuiSimFixture.h"
#include "core/ErrorJournal.h"
#include "params/ui/ParSpinBox.h"
#include "params/ui/QenDsCBut.h"
#include "params/ui/QenParEd.h"
#include "params/ui/UnitLabel.h"
#include "windows/MainWin.h"
#include "segments/QenSegmentDs.h"
#include "segments/QenSegmentPool.h"
#include "segments/ui/SegmentGridManager.h"
#include "windows/StateStatusBar.h"
#include "windows/dataedit/DataeditSegmentEditWin.h"
#include "windows/dtecmd/DtecmdCmdWin.h"
#include "windows/error/ErrorErrorWin.h"
#include "windows/paramedit/ParameditParamEdWin.h"
#include "windows/smseqedit/SmseqeditWin.h"

namespace {

// The main window against qensim, as the window host shows it.
class MainWinTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    Other(":CGR1:MOD1:CONN2:VOLT:AMPL 1");
    Other(":CGR2:MOD1:CONN1:VOLT:AMPL 1");
    mWin = std::make_unique<MainWin>();
    mWin->Attach();
    mWin->show();
    QApplication::setActiveWindow(mWin.get());
    Poll();
  }
  void TearDown() override {
    mWin.reset();
    GuiSimFixture::TearDown();
  }
  template <class T>
  T* Open(const char* resource) {
    auto* window = qobject_cast<T*>(mWin->OpenWindow(QString::fromLatin1(resource)));
    EXPECT_NE(window, nullptr) << resource << ": " << (mAlerts.empty() ? "" : mAlerts.back());
    return window;
  }
  QenParEd* Field(ParameditParamEdWin* editor, const char* name) {
    return editor->CurrentPanel()->findChild<QenParEd*>(QString::fromLatin1(name));
  }

  std::unique_ptr<MainWin> mWin;
};

}  // namespace

TEST_F(MainWinTest, AWindowOpensOnceAndIsRaisedWhenAskedAgain) {
  QWidget* first = mWin->OpenWindow("error.ErrorWin");
  mWin->OpenWindow("dtecmd.CmdWin");
  EXPECT_EQ(mWin->OpenWindow("error.ErrorWin"), first);
  EXPECT_EQ(mWin->Area()->subWindowList().size(), 2);
  EXPECT_EQ(mWin->Area()->activeSubWindow()->widget(), first);
  EXPECT_EQ(mWin->OpenWindow("nosuch.Win"), nullptr);
  QCoreApplication::processEvents();
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_NE(mAlerts[0].find("nosuch.Win"), Dstring::npos);
}

TEST_F(MainWinTest, ParameterEditorWritesAndFollowsASecondClient) {
  auto* editor = Open<ParameditParamEdWin>("paramedit.ParamEd");
  ASSERT_TRUE(editor->SelectPath(":CGR1:MOD1:CONN2"));
  QenParEd* ampl = Field(editor, "FieldAmpl");
  ASSERT_NE(ampl, nullptr);
  EXPECT_EQ(ampl->Editor()->Text(), "1");
  ampl->Editor()->setFocus();
  QTest::keyClick(ampl->Editor(), Qt::Key_A, Qt::ControlModifier);
  QTest::keyClicks(ampl->Editor(), "2.25");
  QTest::keyClick(ampl->Editor(), Qt::Key_Return);
  EXPECT_DOUBLE_EQ(OtherNumber(":CGR1:MOD1:CONN2:VOLT:AMPL"), 2.25);
  EXPECT_DOUBLE_EQ(OtherNumber(":CGR1:MOD1:CONN1:VOLT:AMPL"), 1.0) << "another port was written";
  Other(":CGR1:MOD1:CONN2:VOLT:AMPL 0.75");
  Poll();
  EXPECT_EQ(ampl->Editor()->Text(), "0.75");
  // The same panel moves to another port of another group.
  ASSERT_TRUE(editor->SelectPath(":CGR2:MOD1:CONN1"));
  EXPECT_EQ(Field(editor, "FieldAmpl"), ampl);
  EXPECT_EQ(ampl->Editor()->Text(), "1");
  EXPECT_TRUE(mAlerts.empty());
}

TEST_F(MainWinTest, TextAFieldLeavesOutIsSaidInTheStatusBar) {
  auto* editor = Open<ParameditParamEdWin>("paramedit.ParamEd");
  ASSERT_TRUE(editor->SelectPath(":CGR1:MOD1:CONN2"));
  QenParEd* ampl = Field(editor, "FieldAmpl");
  ASSERT_NE(ampl, nullptr);
  ampl->Editor()->setFocus();
  QTest::keyClick(ampl->Editor(), Qt::Key_A, Qt::ControlModifier);
  QTest::keyClicks(ampl->Editor(), "1.5 volts");
  QTest::keyClick(ampl->Editor(), Qt::Key_Return);
  EXPECT_DOUBLE_EQ(OtherNumber(":CGR1:MOD1:CONN2:VOLT:AMPL"), 1.5);
  EXPECT_EQ(mWin->statusBar()->currentMessage(), "1.5 V sent; \"volts\" ignored: this field is in V");
}

TEST_F(MainWinTest, ParameterEditorShowsOnlyWhatTheItemHas) {
  auto* editor = Open<ParameditParamEdWin>("paramedit.ParamEd");
  ASSERT_TRUE(editor->SelectPath(":CGR1:MOD1"));
  EXPECT_EQ(editor->CurrentPanel()->findChild<QLabel*>("LabelMemory")->text(), "128 MBit");
  EXPECT_TRUE(editor->CurrentPanel()->findChild<QWidget*>("BoxUcas")->isVisibleTo(editor));
  ASSERT_TRUE(editor->SelectPath(":CGR1:MOD3"));
  EXPECT_FALSE(editor->CurrentPanel()->findChild<QWidget*>("BoxUcas")->isVisibleTo(editor));
  EXPECT_EQ(editor->CurrentPanel()->findChild<QLabel*>("LabelMemory")->text(), "none");
  for (const auto& e : ErrorJournal::Entries()) ADD_FAILURE() << e.command << ": " << e.text;
}

TEST_F(MainWinTest, ALockByAnotherClientMakesEverythingReadOnlyUntilItGoes) {
  Open<ParameditParamEdWin>("paramedit.ParamEd");
  Control(":TEST:LOCK ON");
  // The first tick meets the lock; the next one's guard knows it.
  Poll();
  Poll();
  EXPECT_TRUE(mWin->IsShowingLock());
  EXPECT_FALSE(mWin->Area()->subWindowList().front()->widget()->isEnabled());
  Control(":TEST:LOCK OFF");
  Poll();
  Poll();
  EXPECT_FALSE(mWin->IsShowingLock());
  EXPECT_TRUE(mWin->Area()->subWindowList().front()->widget()->isEnabled());
  EXPECT_TRUE(mAlerts.empty());
}

TEST_F(MainWinTest, StatusBarFollowsTheRunState) {
  EXPECT_TRUE(mWin->StatusBarView()->Text().startsWith(QStringLiteral("\u25A0 Stopped"))) << mWin->StatusBarView()->Text().toStdString();
  Other(":SGEN:GLOB:INIT:CONT ON");
  Poll();
  EXPECT_TRUE(mWin->StatusBarView()->Text().contains(QStringLiteral("Running"))) << mWin->StatusBarView()->Text().toStdString();
  Other(":SGEN:GLOB:INIT:CONT OFF");
}

TEST_F(MainWinTest, CommandWindowShowsRepliesAndTheErrorListTheErrors) {
  auto* errors = Open<ErrorErrorWin>("error.ErrorWin");
  auto* cmd = Open<DtecmdCmdWin>("dtecmd.CmdWin");
  QTest::keyClicks(cmd->Input(), "::TRIG:MODE?");
  QTest::keyClick(cmd->Input(), Qt::Key_Return);
  EXPECT_TRUE(cmd->Transcript().contains("> ::TRIG:MODE?\nSEQ")) << cmd->Transcript().toStdString();
  QTest::keyClicks(cmd->Input(), "::NO:SUCH:HEADER 1");
  QTest::keyClick(cmd->Input(), Qt::Key_Return);
  EXPECT_TRUE(cmd->Transcript().contains("error -113")) << cmd->Transcript().toStdString();
  ASSERT_EQ(errors->Tree()->topLevelItemCount(), 1);
  EXPECT_EQ(errors->Tree()->topLevelItem(0)->text(1), "-113");
  EXPECT_EQ(errors->Tree()->topLevelItem(0)->text(3).toStdString(), ":" + mHandle + ":NO:SUCH:HEADER 1");
  EXPECT_EQ(mWin->Area()->subWindowList(QMdiArea::StackingOrder).last()->widget(), errors)
      << "a new error raises the open list";
  EXPECT_EQ(mWin->Area()->activeSubWindow()->widget(), cmd) << "without taking the focus from the typing";
  // History: Up brings back the last line, Down the text begun.
  QTest::keyClicks(cmd->Input(), "::CGR");
  QTest::keyClick(cmd->Input(), Qt::Key_Up);
  EXPECT_EQ(cmd->Input()->text(), "::NO:SUCH:HEADER 1");
  QTest::keyClick(cmd->Input(), Qt::Key_Up);
  EXPECT_EQ(cmd->Input()->text(), "::TRIG:MODE?");
  QTest::keyClick(cmd->Input(), Qt::Key_Down);
  QTest::keyClick(cmd->Input(), Qt::Key_Down);
  EXPECT_EQ(cmd->Input()->text(), "::CGR");
}

TEST_F(MainWinTest, ALineThatWouldBreakTheLanguageIsRefusedAndListed) {
  auto* cmd = Open<DtecmdCmdWin>("dtecmd.CmdWin");
  const std::size_t sent = ErrorJournal::Entries().size();
  EXPECT_NE(cmd->RunLine(QStringLiteral("::TRIG:MODE SEQ\x01")), 0);
  EXPECT_TRUE(cmd->Transcript().contains("refused")) << cmd->Transcript().toStdString();
  EXPECT_EQ(ErrorJournal::Entries().size(), sent + 1);
  EXPECT_EQ(Other(":TRIG:MODE?"), "SEQ");
  // A ";" inside quotes is the user's business: it goes out as typed.
  cmd->RunScript(QStringLiteral("::TRIG:MODE CLOC\n\n::TRIG:MODE?"));
  EXPECT_TRUE(cmd->Transcript().endsWith("CLOC")) << cmd->Transcript().toStdString();
  Other(":TRIG:MODE SEQ");
  ConditionList list;
  EXPECT_NE(cmd->SaveTranscript(QStringLiteral("/nonexistent-dir/t.txt"), list), 0);
  EXPECT_FALSE(list.IsEmpty());
}

// A block's segment opens in the segment editor from the sequence; asking again raises that window.
TEST_F(MainWinTest, TheSequenceOpensItsSegmentsInTheSegmentEditor) {
  MakeSegment("Seq/Shown", 64, 8);
  auto* sequence = Open<SmseqeditWin>("smseqedit.Win");
  ASSERT_NE(sequence, nullptr);
  auto* button = sequence->findChild<QPushButton*>(QStringLiteral("PButOpenSegment"));
  sequence->Table()->setCurrentCell(0, 2);
  EXPECT_FALSE(button->isEnabled());  // a word, PAUSE
  sequence->Table()->item(0, 2)->setText(QStringLiteral("Seq/Shown"));
  sequence->Table()->setCurrentCell(0, 3);
  sequence->Table()->setCurrentCell(0, 2);
  ASSERT_TRUE(button->isEnabled());
  const qsizetype windows = mWin->Area()->subWindowList().size();
  QTest::mouseClick(button, Qt::LeftButton);
  auto* editor = qobject_cast<DataeditSegmentEditWin*>(mWin->Area()->activeSubWindow()->widget());
  ASSERT_NE(editor, nullptr);
  EXPECT_EQ(editor->Grid()->GetSegmentDs()->GetName(), Dstring("Seq/Shown"));
  QTest::mouseClick(button, Qt::LeftButton);
  EXPECT_EQ(mWin->Area()->subWindowList().size(), windows + 1);
  editor->close();
  QenSegmentPool::Delete("Seq/Shown", mList);
}
