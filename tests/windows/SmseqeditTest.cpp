#include <gtest/gtest.h>

#include <QAction>
#include <QCoreApplication>
#include <QPushButton>
#include <QLineEdit>
#include <QTableView>
#include <QTest>
#include <memory>

#include "common/gui/GuiSimFixture.h"
#include "segments/QenSegmentPool.h"
#include "sequences/CSequence.h"
#include "sequences/ui/LoopGridManager.h"
#include "windows/smseqedit/SequenceBlockModel.h"
#include "windows/smseqedit/SmseqeditWin.h"

namespace {

// The simple sequence editor against qensim, whose sequence starts as one block of 512 vectors.
class SmseqeditTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    // Every test starts from the sequence qensim starts with: one qensim serves the suite.
    static const Dstring initial = Other(":SGEN:GLOB:SEQ?");
    Other(":SGEN:GLOB:SEQ " + initial);
    Poll();
    mWin = std::make_unique<SmseqeditWin>();
    ASSERT_EQ(mWin->Load(mList), 0) << mList.ToText();
    mWin->resize(1000, 400);
    mWin->show();
  }
  void TearDown() override {
    mWin.reset();
    GuiSimFixture::TearDown();
  }
  QString Cell(int row, int column) const { return mWin->Model()->index(row, column).data().toString(); }
  int Rows() const { return mWin->Model()->rowCount(); }
  void SetCurrent(int row, int column) { mWin->Table()->setCurrentIndex(mWin->Model()->index(row, column)); }
  void Click(const char* button) {
    mAlerts.clear();
    QTest::mouseClick(mWin->findChild<QPushButton*>(QLatin1String(button)), Qt::LeftButton);
    QCoreApplication::processEvents();
    EXPECT_TRUE(mAlerts.empty()) << button << ": " << mAlerts.front();
  }
  // A tick of the poll, then the events it left: the table is filled after the read.
  void PollAndShow() {
    Poll();
    QCoreApplication::processEvents();
  }
  // A cell typed in, as the table's editor commits it.
  void Type(int row, int column, const QString& text) {
    SetCurrent(row, column);
    mWin->Model()->setData(mWin->Model()->index(row, column), text);
    QCoreApplication::processEvents();  // refusals are shown after the event
  }
  static int Count(const Dstring& text, const std::string& word) {
    int n = 0;
    for (std::size_t at = text.find(word); at != std::string::npos; at = text.find(word, at + 1)) ++n;
    return n;
  }

  std::unique_ptr<SmseqeditWin> mWin;
};

}  // namespace

TEST_F(SmseqeditTest, EditsReachTheInstrumentAndRefusalsShowWhatItHolds) {
  ASSERT_EQ(Rows(), 1);
  ASSERT_GT(mWin->Model()->columnCount(), 2);
  EXPECT_EQ(Cell(0, 1), QStringLiteral("512"));

  SetCurrent(0, 0);
  Click("PButAdd");
  EXPECT_EQ(Rows(), 2);
  EXPECT_EQ(Count(Other(":SGEN:GLOB:SEQ?"), "(BLOCK,"), 2);

  // F2 opens the cell's editor; Enter commits it.
  SetCurrent(1, 1);
  mWin->Table()->setFocus();
  QTest::keyClick(mWin->Table(), Qt::Key_F2);
  auto* editor = mWin->Table()->viewport()->findChild<QLineEdit*>();
  ASSERT_NE(editor, nullptr);
  editor->selectAll();
  QTest::keyClicks(editor, QStringLiteral("1024"));
  QTest::keyClick(editor, Qt::Key_Return);
  QCoreApplication::processEvents();  // the delegate commits after the key
  EXPECT_EQ(Cell(1, 1), QStringLiteral("1024"));
  Type(1, 0, QStringLiteral("loop_me"));
  const Dstring written = Other(":SGEN:GLOB:SEQ?");
  EXPECT_NE(written.find(",1024,"), std::string::npos) << written;
  EXPECT_NE(written.find("\"loop_me\""), std::string::npos) << written;

  MakeSegment("Seq/A", 512, 1);
  Type(0, 2, QStringLiteral("Seq/A"));
  EXPECT_NE(Other(":SGEN:GLOB:SEQ?").find("\"Seq/A\""), std::string::npos);
  mAlerts.clear();
  Type(0, 3, QStringLiteral("Seq/Missing"));
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_NE(mAlerts[0].find("no segment \"Seq/Missing\""), std::string::npos) << mAlerts[0];
  EXPECT_EQ(Cell(0, 3), QStringLiteral("PAUSE"));
  EXPECT_EQ(Other(":SGEN:GLOB:SEQ?").find("Seq/Missing"), std::string::npos);
  Type(0, 2, QStringLiteral("pause0"));
  EXPECT_EQ(Cell(0, 2), QStringLiteral("PAUSE0"));

  SetCurrent(1, 0);
  Click("PButUp");
  EXPECT_EQ(Cell(0, 1), QStringLiteral("1024"));
  EXPECT_EQ(mWin->CurrentBlock(), 1u);
  Click("PButDelete");
  EXPECT_EQ(Rows(), 1);
  EXPECT_EQ(Count(Other(":SGEN:GLOB:SEQ?"), "(BLOCK,"), 1);
  QenSegmentPool::Delete("Seq/A", mList);
}

// Whole blocks are cut, copied and pasted on the table's keys.
TEST_F(SmseqeditTest, BlocksAreCopiedCutAndPasted) {
  Type(0, 1, QStringLiteral("777"));
  SetCurrent(0, 0);
  mWin->Table()->setFocus();
  QTest::keyClick(mWin->Table(), Qt::Key_C, Qt::ControlModifier);
  QTest::keyClick(mWin->Table(), Qt::Key_V, Qt::ControlModifier);
  ASSERT_EQ(Rows(), 2);
  EXPECT_EQ(Cell(1, 1), QStringLiteral("777"));
  Type(1, 1, QStringLiteral("888"));
  SetCurrent(0, 0);
  QTest::keyClick(mWin->Table(), Qt::Key_X, Qt::ControlModifier);
  ASSERT_EQ(Rows(), 1);
  EXPECT_EQ(Cell(0, 1), QStringLiteral("888"));
  EXPECT_EQ(Count(Other(":SGEN:GLOB:SEQ?"), "(BLOCK,"), 1);
}

// A step is taken back and done again on the instrument; another client's change forgets the steps.
TEST_F(SmseqeditTest, StepsAreUndoneAndRedone) {
  Type(0, 1, QStringLiteral("1000"));
  Type(0, 0, QStringLiteral("first"));
  mWin->Table()->setFocus();
  QTest::keyClick(mWin->Table(), Qt::Key_Z, Qt::ControlModifier);
  EXPECT_EQ(Cell(0, 0), QString());
  EXPECT_EQ(Other(":SGEN:GLOB:SEQ?").find("first"), std::string::npos);
  QTest::keyClick(mWin->Table(), Qt::Key_Z, Qt::ControlModifier);
  EXPECT_EQ(Cell(0, 1), QStringLiteral("512"));
  EXPECT_EQ(Other(":SGEN:GLOB:SEQ?").find(",1000,"), std::string::npos);
  QTest::keyClick(mWin->Table(), Qt::Key_Z, Qt::ControlModifier | Qt::ShiftModifier);
  EXPECT_EQ(Cell(0, 1), QStringLiteral("1000"));
  EXPECT_NE(Other(":SGEN:GLOB:SEQ?").find(",1000,"), std::string::npos);
  ASSERT_TRUE(mWin->CanUndo());

  Dstring text = Other(":SGEN:GLOB:SEQ?");
  text.replace(text.find(",1000,"), 6, ",2000,");
  Other(":SGEN:GLOB:SEQ " + text);
  for (int i = 0; i < 20 && Cell(0, 1) != QStringLiteral("2000"); ++i) PollAndShow();
  EXPECT_EQ(Cell(0, 1), QStringLiteral("2000"));
  EXPECT_FALSE(mWin->CanUndo());
}

// Ctrl+Y redoes as Ctrl+Shift+Z does, on every platform: the editor answers the loop grid's keys.
TEST_F(SmseqeditTest, CtrlYRedoes) {
  LoopGridManager grid;
  const QAction* gridRedo = grid.findChild<QAction*>(QStringLiteral("Redo"));
  const QAction* redo = mWin->Table()->findChild<QAction*>(QStringLiteral("Redo"));
  ASSERT_NE(gridRedo, nullptr);
  ASSERT_NE(redo, nullptr);
  EXPECT_EQ(redo->shortcuts(), gridRedo->shortcuts());
  EXPECT_TRUE(redo->shortcuts().contains(QKeySequence(Qt::CTRL | Qt::Key_Y)));
  Type(0, 1, QStringLiteral("1000"));
  mWin->Table()->setFocus();
  QTest::keyClick(mWin->Table(), Qt::Key_Z, Qt::ControlModifier);
  ASSERT_EQ(Cell(0, 1), QStringLiteral("512"));
  QTest::keyClick(mWin->Table(), Qt::Key_Y, Qt::ControlModifier);
  EXPECT_EQ(Cell(0, 1), QStringLiteral("1000"));
  EXPECT_NE(Other(":SGEN:GLOB:SEQ?").find(",1000,"), std::string::npos);
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
}

// Under another client's lock an edit reaches nothing, and the cell shows the instrument's value.
TEST_F(SmseqeditTest, AnEditUnderALockLeavesTheSequence) {
  const Dstring before = Other(":SGEN:GLOB:SEQ?");
  Control(":TEST:LOCK ON");
  Type(0, 1, QStringLiteral("1111"));
  EXPECT_EQ(Cell(0, 1), QStringLiteral("512"));
  Control(":TEST:LOCK OFF");
  EXPECT_EQ(Other(":SGEN:GLOB:SEQ?"), before);
  EXPECT_FALSE(mWin->CanUndo());
}
