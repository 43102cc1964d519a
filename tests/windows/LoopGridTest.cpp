#include <gtest/gtest.h>

#include <QApplication>
#include <QCoreApplication>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QMdiArea>
#include <QMdiSubWindow>
#include <QMimeData>
#include <QPushButton>
#include <QScreen>
#include <QScrollBar>
#include <QTableWidget>
#include <QTest>
#include <memory>

#include "common/gui/GuiSimFixture.h"
#include "segments/QenSegmentPool.h"
#include "segments/ui/GridDisp.h"
#include "sequences/CSequence.h"
#include "sequences/SequenceBlockInstanceInfo.h"
#include "sequences/SequenceService.h"
#include "sequences/SequenceUndo.h"
#include "sequences/ui/LoopGridManager.h"
#include "windows/InstanceWindows.h"
#include "windows/MainWin.h"
#include "windows/dataedit/DataeditSegmentEditWin.h"
#include "windows/loopgridedit/LoopGridEditWin.h"
#include "windows/seqedit/BlockReactionModel.h"
#include "windows/seqedit/SeqeditEventWin.h"
#include "windows/seqedit/SeqeditSeqEdWin.h"
#include "windows/smseqedit/SequenceBlockModel.h"
#include "windows/smseqedit/SmseqeditWin.h"

namespace {

// The loop grid editor in the main window against qensim, whose sequence starts as one block.
class LoopGridTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    // Every test starts from the sequence qensim starts with: one qensim serves the suite.
    static const Dstring initial = Other(":SGEN:GLOB:SEQ?");
    mInitial = initial;
    Other(":SGEN:GLOB:SEQ " + initial);
    Poll();
    mMain = ShowMainWin();
    mMain->resize(1400, 700);
    mWin = qobject_cast<LoopGridEditWin*>(mMain->OpenWindow(QStringLiteral("LoopGridEdit.Win")));
    ASSERT_NE(mWin, nullptr) << (mAlerts.empty() ? "" : mAlerts.back()) << mList.ToText();
    mGrid = mWin->Grid();
    mGrid->setFocus();
  }
  void TearDown() override {
    mMain.reset();
    GuiSimFixture::TearDown();
  }
  // The element of qensim's first block: a new block plays the same.
  Dstring Block() const { return Dstring(mInitial.substr(8, mInitial.size() - 9)); }
  Dstring Server() { return Other(":SGEN:GLOB:SEQ?"); }
  void Key(Qt::Key key, Qt::KeyboardModifiers modifiers = Qt::NoModifier) {
    QTest::keyClick(mGrid, key, modifiers);
    QCoreApplication::processEvents();
  }
  void Select(unsigned long first, unsigned long last, int field) {
    mGrid->SetCursor(first, field);
    mGrid->SetCursor(last, field, true);
  }
  void PollAndShow() {
    Poll();
    QCoreApplication::processEvents();
  }
  // Puts a sequence of four blocks, a loop on level 2 over blocks 2 .. 4 holding one on level 1
  // over 2 .. 3, on the instrument as another client, and waits for the grid to show it.
  void LoadNested() {
    const Dstring b = Block();
    mNested = "(3.0,\"\",(SEQ," + b + ",\"\",(LOOP2,0,3,\"\",(SEQ,(LOOP1,0,4,\"\",(SEQ," + b + ",\"\"," + b +
              ")),\"\"," + b + "))))";
    Other(":SGEN:GLOB:SEQ " + mNested);
    for (int i = 0; i < 20 && mGrid->DispLineCount() != 4; ++i) PollAndShow();
    ASSERT_EQ(mGrid->DispLineCount(), 4);
    mAlerts.clear();
  }

  Dstring mInitial;
  Dstring mNested;
  std::unique_ptr<MainWin> mMain;
  LoopGridEditWin* mWin = nullptr;
  LoopGridManager* mGrid = nullptr;
};

}  // namespace

// Blocks and nested loops made with the grid's keys are what another client reads, exactly.
TEST_F(LoopGridTest, NestedLoopsBuiltInTheGridAreWhatTheInstrumentHolds) {
  ASSERT_EQ(mGrid->DispLineCount(), 1);
  ASSERT_EQ(CSequence::GetNumLoopLevels(), 3u);
  for (int i = 0; i < 3; ++i) Key(Qt::Key_Insert);
  ASSERT_EQ(mGrid->DispLineCount(), 4);
  EXPECT_EQ(mGrid->CursorBlock(), 4u);

  Select(2, 3, mGrid->LabelField());
  Key(Qt::Key_L, Qt::ControlModifier);  // the lowest level that fits: 1
  mGrid->SetCursor(2, mGrid->LaneField(1));
  Key(Qt::Key_F2);
  ASSERT_TRUE(mGrid->IsEditing());
  mGrid->Editor()->setText(QStringLiteral("4"));
  QTest::keyClick(mGrid->Editor(), Qt::Key_Return);
  QCoreApplication::processEvents();
  Select(2, 4, mGrid->LabelField());
  Key(Qt::Key_L, Qt::ControlModifier);  // holds the loop on level 1: level 2
  EXPECT_EQ(mGrid->SetCellText(3, mGrid->LaneField(2), QStringLiteral("3")), 0);
  Select(1, 4, mGrid->LabelField());
  Key(Qt::Key_L, Qt::ControlModifier);  // the top level, endless
  mGrid->SetCursor(2, mGrid->LabelField());
  Key(Qt::Key_I);  // typing opens the cell's editor with what was typed
  mGrid->Editor()->setText(QStringLiteral("inner"));
  QTest::keyClick(mGrid->Editor(), Qt::Key_Return);
  QCoreApplication::processEvents();
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();

  const Dstring b = Block();
  EXPECT_EQ(Server(), "(3.0,\"\",(LOOP3,0,INF,\"\",(SEQ," + b +
                          ",\"inner\",(LOOP2,0,3,\"\",(SEQ,(LOOP1,0,4,\"\",(SEQ," + b + ",\"\"," + b +
                          ")),\"\"," + b + ")))))");
  EXPECT_EQ(mGrid->CellText(2, mGrid->LaneField(1)), QStringLiteral("4"));
  EXPECT_EQ(mGrid->CellText(4, mGrid->LaneField(3)), QStringLiteral("INF"));
  EXPECT_EQ(mGrid->CellText(1, mGrid->LaneField(1)), QString());
}

struct Refusal {
  const char* name;
  std::function<int(LoopGridManager&)> edit;
  const char* text;  // in the message shown
};

class LoopGridRefusals : public LoopGridTest, public testing::WithParamInterface<Refusal> {};

// A refused edit is shown, nothing reaches the instrument, and the grid shows what it holds.
TEST_P(LoopGridRefusals, ShowTheConditionAndWriteNothing) {
  LoadNested();
  EXPECT_NE(GetParam().edit(*mGrid), 0);
  QCoreApplication::processEvents();
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_NE(mAlerts[0].find(GetParam().text), std::string::npos) << mAlerts[0];
  EXPECT_EQ(Server(), mNested);
  EXPECT_EQ(SequenceService::GetSequence()->GetLastExpression(), mNested);
  EXPECT_EQ(mGrid->CellText(2, mGrid->LaneField(1)), QStringLiteral("4"));
  EXPECT_EQ(mGrid->CellText(1, mGrid->PortField(1)), QStringLiteral("PAUSE"));
  EXPECT_FALSE(mGrid->Steps()->CanUndo());
}

INSTANTIATE_TEST_SUITE_P(
    Table, LoopGridRefusals,
    testing::Values(
        Refusal{"CrossingLoop",
                [](LoopGridManager& g) {
                  g.SetCursor(3, g.LaneField(1));
                  g.SetCursor(4, g.LaneField(1), true);
                  return g.AddLoop();
                },
                "already in a loop on that level"},
        Refusal{"CrossingLowerLoop",
                [](LoopGridManager& g) {
                  g.SetCursor(3, g.LaneField(3));
                  g.SetCursor(4, g.LaneField(3), true);
                  return g.AddLoop();
                },
                "would cross the loop on level"},
        Refusal{"NoLevelLeft",
                [](LoopGridManager& g) {
                  g.SetCursor(3, g.LabelField());
                  g.SetCursor(4, g.LabelField(), true);
                  return g.AddLoop();
                },
                "can loop on no level"},
        Refusal{"ZeroCount",
                [](LoopGridManager& g) { return g.SetCellText(2, g.LaneField(1), QStringLiteral("0")); },
                "\"0\" is no loop count: type how many times the loop runs, 1 to 1048576"},
        Refusal{
            "CountAboveTheLimit",
            [](LoopGridManager& g) { return g.SetCellText(2, g.LaneField(2), QStringLiteral("1048577")); },
            "1 to 1048576"},
        Refusal{"TopLevelCount",
                [](LoopGridManager& g) { return g.SetCellText(1, g.LaneField(3), QStringLiteral("5")); },
                "the top level, always runs for ever"},
        Refusal{"MissingSegment",
                [](LoopGridManager& g) {
                  return g.SetCellText(1, g.PortField(1), QStringLiteral("Grid/Missing"));
                },
                "no segment \"Grid/Missing\""},
        Refusal{"NoLength",
                [](LoopGridManager& g) { return g.SetCellText(1, g.LengthField(), QStringLiteral("0")); },
                "no block length"}),
    [](const testing::TestParamInfo<Refusal>& info) { return std::string(info.param.name); });

// The grid's edits are taken back on the instrument and done again; another client's change
// forgets them.
TEST_F(LoopGridTest, UndoPutsTheInstrumentsSequenceBack) {
  LoadNested();
  mGrid->SetCursor(2, mGrid->LaneField(2));
  Key(Qt::Key_Delete);  // on a lane: the loop goes
  ASSERT_EQ(mGrid->CellText(2, mGrid->LaneField(2)), QString());
  const Dstring without = Server();
  ASSERT_NE(without, mNested);
  Key(Qt::Key_Z, Qt::ControlModifier);
  EXPECT_EQ(Server(), mNested);
  EXPECT_EQ(mGrid->CellText(2, mGrid->LaneField(2)), QStringLiteral("3"));
  Key(Qt::Key_Y, Qt::ControlModifier);
  EXPECT_EQ(Server(), without);
  Key(Qt::Key_Z, Qt::ControlModifier);
  EXPECT_EQ(Server(), mNested);
  EXPECT_TRUE(mGrid->Steps()->CanRedo());

  Other(":SGEN:GLOB:SEQ " + mInitial);
  for (int i = 0; i < 20 && mGrid->DispLineCount() != 1; ++i) PollAndShow();
  EXPECT_EQ(mGrid->DispLineCount(), 1);
  EXPECT_FALSE(mGrid->Steps()->CanUndo());
  EXPECT_FALSE(mGrid->Steps()->CanRedo());
}

// Another client's sequence shows in the grid within the poll, loops and all.
TEST_F(LoopGridTest, AnotherClientsChangeIsFollowed) {
  LoadNested();
  EXPECT_EQ(mGrid->CellText(3, mGrid->LaneField(2)), QStringLiteral("3"));
  EXPECT_EQ(mGrid->CellText(4, mGrid->LaneField(1)), QString());
  EXPECT_EQ(mGrid->CellText(1, mGrid->LengthField()), QStringLiteral("512"));
}

// A segment is put into a cell by typing, from the list, or by dropping its name.
TEST_F(LoopGridTest, SegmentsAreTypedPickedAndDropped) {
  MakeSegment("Grid/A", 512, 1);
  MakeSegment("Grid/B", 512, 1);
  ConditionList list;
  ASSERT_EQ(mWin->FillSegments(list), 0);
  ASSERT_GE(mWin->Segments()->count(), 2);
  Key(Qt::Key_Insert);
  mGrid->SetCursor(1, mGrid->PortField(1));
  Key(Qt::Key_F2);
  mGrid->Editor()->setText(QStringLiteral("Grid/A"));
  QTest::keyClick(mGrid->Editor(), Qt::Key_Return);
  QCoreApplication::processEvents();
  EXPECT_EQ(mGrid->CellText(1, mGrid->PortField(1)), QStringLiteral("Grid/A"));

  mGrid->SetCursor(2, mGrid->PortField(2));
  mWin->Segments()->setCurrentItem(
      mWin->Segments()->findItems(QStringLiteral("Grid/B"), Qt::MatchExactly).front());
  emit mWin->Segments()->itemActivated(mWin->Segments()->currentItem());
  EXPECT_EQ(mGrid->CellText(2, mGrid->PortField(2)), QStringLiteral("Grid/B"));

  // A drop onto the third port's cell of block 1.
  QRect cell;
  for (GridDisp* disp : mGrid->Disps()) {
    if (disp->objectName() == QLatin1String("port3"))
      cell = QRect(disp->x(), mGrid->GetOffY(), disp->width(), mGrid->GetDY());
  }
  ASSERT_FALSE(cell.isEmpty());
  QMimeData mime;
  mime.setText(QStringLiteral("Grid/B"));
  QDragEnterEvent enter(cell.center(), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
  QCoreApplication::sendEvent(mGrid, &enter);
  ASSERT_TRUE(enter.isAccepted());
  QDropEvent drop(QPointF(cell.center()), Qt::CopyAction, &mime, Qt::LeftButton, Qt::NoModifier);
  QCoreApplication::sendEvent(mGrid, &drop);
  QCoreApplication::processEvents();
  EXPECT_EQ(mGrid->CellText(1, mGrid->PortField(3)), QStringLiteral("Grid/B"));
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();

  const Dstring server = Server();
  EXPECT_NE(server.find("(),\"Grid/A\",0,0,PAUSE,0,0,\"Grid/B\",0,0,PAUSE,"), std::string::npos) << server;
  EXPECT_NE(server.find("(),PAUSE,0,0,\"Grid/B\",0,0,PAUSE,"), std::string::npos) << server;
  QenSegmentPool::Delete("Grid/A", mList);
  QenSegmentPool::Delete("Grid/B", mList);
}

// A second request for a window of an equal record raises the one open.
TEST_F(LoopGridTest, ASecondOpenOfTheSameRecordRaisesTheOneWindow) {
  Key(Qt::Key_Insert);
  const int before = static_cast<int>(mMain->Area()->subWindowList().size());
  QWidget* events = mMain->OpenEvents(2);
  ASSERT_NE(events, nullptr);
  QWidget* sequence = mMain->OpenSequence();
  ASSERT_NE(sequence, nullptr);
  mMain->Area()->setActiveSubWindow(mMain->Area()->subWindowList().front());
  EXPECT_EQ(mMain->OpenEvents(2), events);
  EXPECT_EQ(mMain->Area()->activeSubWindow()->widget(), events);
  EXPECT_EQ(mMain->OpenSequence(), sequence);
  EXPECT_EQ(mMain->OpenWindow(QStringLiteral("seqedit.SeqEdWin")), sequence);
  EXPECT_EQ(mMain->Area()->subWindowList().size(), before + 2);
  QWidget* other = mMain->OpenEvents(1);
  EXPECT_NE(other, events);
  EXPECT_EQ(mMain->Area()->subWindowList().size(), before + 3);
  const auto* record =
      dynamic_cast<const SequenceBlockInstanceInfo*>(InstanceWindows::GetInstanceInfo(events));
  ASSERT_NE(record, nullptr);
  EXPECT_EQ(record->GetBlockNum(), 2u);

  MakeSegment("Grid/Open", 256, 1);
  ASSERT_EQ(mGrid->SetCellText(1, mGrid->PortField(1), QStringLiteral("Grid/Open")), 0);
  QWidget* segment = mMain->OpenSegment(1, 1);
  ASSERT_NE(segment, nullptr);
  EXPECT_EQ(mMain->OpenSegment(1, 1), segment);
  EXPECT_EQ(mMain->OpenSegment(1, 2), nullptr) << "a kind word is no segment to open";
  EXPECT_EQ(mMain->Area()->subWindowList().size(), before + 4);
  mMain->Area()->closeAllSubWindows();
  QenSegmentPool::Delete("Grid/Open", mList);
}

// A block's reactions edited in its event window reach the instrument.
TEST_F(LoopGridTest, EventWindowEditsReachTheInstrument) {
  Key(Qt::Key_Insert);
  auto* events = qobject_cast<SeqeditEventWin*>(mMain->OpenEvents(2));
  ASSERT_NE(events, nullptr);
  ASSERT_EQ(events->NewReaction(), 0);
  BlockReactionModel* reactions = events->Model();
  ASSERT_EQ(reactions->rowCount(), 1);
  const char* typed[] = {"ERR", "start", "5"};
  for (int c = 0; c < 3; ++c) reactions->setData(reactions->index(0, c), QString::fromLatin1(typed[c]));
  QCoreApplication::processEvents();
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
  EXPECT_NE(Server().find(",((\"ERR\",\"start\",5,\"\")),"), std::string::npos) << Server();
  EXPECT_EQ(LoopGridManager::MarksOf(*SequenceService::GetSequence(), 2), QStringLiteral("R1"));
  ASSERT_EQ(events->SetSync(true), 0);
  EXPECT_NE(Server().find(",SYNC,"), std::string::npos);
  EXPECT_EQ(reactions->rowCount(), 0);
  EXPECT_FALSE(events->Table()->isEnabled());
}

// Blocks are inserted, moved, copied, pasted and deleted on the grid's keys, loops keeping their
// blocks; the sequence editor sums up what the instrument then holds.
TEST_F(LoopGridTest, BlocksMoveWithTheirKeysAndTheSequenceEditorFollows) {
  LoadNested();
  mGrid->SetCursor(1, mGrid->LengthField());
  Key(Qt::Key_Insert, Qt::ControlModifier | Qt::ShiftModifier);  // before block 1
  ASSERT_EQ(mGrid->DispLineCount(), 5);
  EXPECT_EQ(mGrid->CursorBlock(), 1u);
  ASSERT_EQ(mGrid->SetCellText(1, mGrid->LengthField(), QStringLiteral("777")), 0);
  Key(Qt::Key_Down, Qt::ControlModifier);
  EXPECT_EQ(mGrid->CursorBlock(), 2u);
  EXPECT_EQ(mGrid->CellText(2, mGrid->LengthField()), QStringLiteral("777"));
  Key(Qt::Key_C, Qt::ControlModifier);
  mGrid->SetCursor(6 - 1, mGrid->LabelField());
  Key(Qt::Key_V, Qt::ControlModifier);  // after the last block, outside the loops
  ASSERT_EQ(mGrid->DispLineCount(), 6);
  EXPECT_EQ(mGrid->CellText(6, mGrid->LengthField()), QStringLiteral("777"));
  EXPECT_EQ(mGrid->CellText(6, mGrid->LaneField(2)), QString());
  EXPECT_EQ(mGrid->CellText(3, mGrid->LaneField(1)), QStringLiteral("4"));
  mGrid->SetCursor(2, mGrid->LabelField());
  Key(Qt::Key_Delete);
  EXPECT_EQ(mGrid->DispLineCount(), 5);
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
  const Dstring b = Block();
  Dstring copied = b;
  copied.replace(copied.find(",512,"), 5, ",777,");
  EXPECT_EQ(Server(), "(3.0,\"\",(SEQ," + b + ",\"\",(LOOP2,0,3,\"\",(SEQ,(LOOP1,0,4,\"\",(SEQ," + b +
                          ",\"\"," + b + ")),\"\"," + b + ")),\"\"," + copied + "))");

  auto* sequence = qobject_cast<SeqeditSeqEdWin*>(mMain->OpenSequence());
  ASSERT_NE(sequence, nullptr);
  ASSERT_EQ(sequence->Table()->rowCount(), 5);
  EXPECT_EQ(SeqeditSeqEdWin::LoopsOf(3), QStringLiteral("L2 \u00D73 2\u20134   L1 \u00D74 2\u20133"));
  EXPECT_EQ(sequence->Table()->item(4, 1)->text(), QStringLiteral("777"));
  EXPECT_TRUE(sequence->Summary()->text().startsWith(QStringLiteral("5 blocks, 2 loops on 3 loop levels")));
  Other(":SGEN:GLOB:SEQ " + mInitial);
  for (int i = 0; i < 20 && sequence->Table()->rowCount() != 1; ++i) PollAndShow();
  EXPECT_EQ(sequence->Table()->rowCount(), 1);
}

// The grid base's editing commands, as a pattern-editor window asks the grid with the focus.
TEST_F(LoopGridTest, TheGridBaseCommandsWorkOnWholeBlocks) {
  CSequence::ClearClipboard();
  EXPECT_TRUE(mGrid->IsCopyPossible());
  EXPECT_FALSE(mGrid->IsPastePossible());
  EXPECT_FALSE(mGrid->IsFillPossible());
  ConditionList list;
  ASSERT_EQ(mGrid->SetCellText(1, mGrid->LengthField(), QStringLiteral("640")), 0);
  ASSERT_EQ(mGrid->ModifyInsert(VectorTrace::kVector, InsertMode::kAfter, 2, list), 0) << list.ToText();
  EXPECT_EQ(mGrid->DispLineCount(), 3);
  ASSERT_EQ(mGrid->ModifyCopy(list), 0);
  EXPECT_TRUE(mGrid->IsPastePossible());
  mGrid->SetCursor(3, mGrid->LabelField());
  ASSERT_EQ(mGrid->ModifyPaste(list), 0) << list.ToText();
  const Dstring b = Block();
  Dstring copied = b;
  copied.replace(copied.find(",512,"), 5, ",640,");
  EXPECT_EQ(Server(), "(3.0,\"\",(SEQ," + copied + ",\"\"," + b + ",\"\"," + b + ",\"\"," + copied + "))");
  mGrid->SetCursor(1, mGrid->LabelField());
  ASSERT_EQ(mGrid->ModifyDelete(list), 0);
  EXPECT_EQ(mGrid->DispLineCount(), 3);
  EXPECT_EQ(mGrid->CellText(3, mGrid->LengthField()), QStringLiteral("640"));
  ASSERT_EQ(mGrid->Undo(), 0);
  EXPECT_EQ(mGrid->DispLineCount(), 4);
  EXPECT_TRUE(list.IsEmpty()) << list.ToText();
}

// Windows > Tile with five windows: the frame keeps its size (the windows scroll in the area),
// and the grid, narrower than its columns, scrolls sideways and keeps every port's column.
TEST_F(LoopGridTest, TiledWithOtherWindowsTheGridScrollsAndKeepsEveryPortColumn) {
  for (const char* resource : {"error.ErrorWin", "dtecmd.CmdWin", "errstate.ErrStateWin", "ber.BerWin"}) {
    ASSERT_NE(mMain->OpenWindow(QString::fromLatin1(resource)), nullptr) << resource;
  }
  const QSize frame = mMain->size();
  QAction* tile = nullptr;
  for (QAction* action : mMain->findChildren<QAction*>()) {
    if (action->text() == QStringLiteral("&Tile")) tile = action;
  }
  ASSERT_NE(tile, nullptr);
  tile->trigger();
  QCoreApplication::processEvents();
  EXPECT_EQ(mMain->size(), frame);
  const QSize least = mMain->minimumSizeHint();
  EXPECT_LE(least.width(), frame.width());
  EXPECT_LE(least.height(), frame.height());
  const QRect screen = mMain->screen()->availableGeometry();
  EXPECT_LE(least.width(), screen.width()) << "the frame cannot fit the screen";

  auto* sub = qobject_cast<QMdiSubWindow*>(mWin->parentWidget());
  ASSERT_NE(sub, nullptr);
  sub->resize(sub->minimumSizeHint());
  QCoreApplication::processEvents();
  const unsigned long ports = SequenceService::GetSequence()->GetNumPorts();
  ASSERT_GE(ports, 2u);
  ASSERT_LT(mGrid->width(), static_cast<int>(ports) * LoopGridManager::kPortCells * mGrid->GetDX());
  QScrollBar* across = nullptr;
  QScrollBar* down = nullptr;
  for (QScrollBar* bar : mGrid->findChildren<QScrollBar*>())
    (bar->orientation() == Qt::Horizontal ? across : down) = bar;
  ASSERT_NE(across, nullptr);
  ASSERT_NE(down, nullptr);
  EXPECT_TRUE(across->isVisible());
  for (GridDisp* disp : mGrid->Disps()) {
    if (disp->objectName().startsWith(QStringLiteral("port"))) {
      EXPECT_GE(disp->width(), LoopGridManager::kPortCells * mGrid->GetDX())
          << disp->objectName().toStdString();
    }
  }
  // The cursor on the last port brings its column into view, and back on the first, that one.
  const int shown = mGrid->width() - down->width();
  for (const unsigned long port : {ports, 1ul}) {
    mGrid->SetCursor(1, mGrid->PortField(port));
    const GridDisp* column = mGrid->findChild<GridDisp*>(QStringLiteral("port%1").arg(port));
    ASSERT_NE(column, nullptr);
    EXPECT_GE(column->x(), 0) << port;
    EXPECT_LE(column->x() + column->width(), shown) << port;
    EXPECT_EQ(across->value(), mGrid->GetScrollX());
  }
}

// A segment the sequence plays: deleting it warns with the blocks; every list and both sequence
// editors follow the catalogue within a poll, this client's delete or another's; its name opens
// no empty new segment; and Run is refused before anything starts, naming blocks and segment.
TEST_F(LoopGridTest, ASegmentInUseIsDeletedOnlyWithAWarningAndRunIsRefusedWithoutIt) {
  MakeSegment("walkB8", 512, 1);
  MakeSegment("spare", 512, 1);
  Key(Qt::Key_Insert);
  Key(Qt::Key_Insert);
  for (unsigned long block : {1UL, 3UL})
    mGrid->SetCellText(block, mGrid->PortField(1), QStringLiteral("walkB8"));
  auto* editor =
      qobject_cast<DataeditSegmentEditWin*>(mMain->OpenWindow(QStringLiteral("dataedit.SegmentEditWin")));
  auto* simple = qobject_cast<SmseqeditWin*>(mMain->OpenWindow(QStringLiteral("smseqedit.Win")));
  ASSERT_TRUE(editor != nullptr && simple != nullptr);
  const auto listed = [](QListWidget* list, const char* name) {
    return !list->findItems(QString::fromLatin1(name), Qt::MatchExactly).isEmpty();
  };
  const auto red = [&](unsigned long block) {
    const QVariant brush = simple->Model()->index(static_cast<int>(block) - 1, 2).data(Qt::ForegroundRole);
    return brush.isValid() && brush.value<QBrush>().color() == QColor(Qt::red);
  };
  const auto marked = [&](unsigned long block) {
    for (GridDisp* disp : mGrid->Disps()) {
      if (disp->objectName() == QLatin1String("port1"))
        return mGrid->DispCell(*disp, static_cast<long>(block) - 1, 0).marked;
    }
    return false;
  };
  ASSERT_TRUE(listed(editor->SegmentList(), "walkB8") && listed(mWin->Segments(), "walkB8"));
  EXPECT_FALSE(red(1) || marked(1));

  EXPECT_EQ(DataeditSegmentEditWin::DeleteQuestion("spare"),
            "Delete the segment \"spare\" from the instrument?");
  EXPECT_EQ(
      DataeditSegmentEditWin::DeleteQuestion("walkB8"),
      "The sequence plays the segment \"walkB8\" in blocks 1 and 3. Once it is deleted, Run is refused until "
      "those blocks play another segment.\n\nDelete \"walkB8\" anyway?");
  const auto pickAndDelete = [&](const char* name, int answer) {
    editor->SegmentList()->setCurrentItem(
        editor->SegmentList()->findItems(QString::fromLatin1(name), Qt::MatchExactly).front());
    mToolkit.QueueAnswer(answer);
    editor->findChild<QPushButton*>(QStringLiteral("PButDelete"))->click();
  };
  pickAndDelete("walkB8", ToolkitPort::kNo);
  EXPECT_EQ(Other(":EDIT:SEGM:EXIS? \"walkB8\""), "TRUE");
  pickAndDelete("walkB8", ToolkitPort::kYes);
  EXPECT_EQ(Other(":EDIT:SEGM:EXIS? \"walkB8\""), "FALSE");
  // This client's own delete: every list and both sequence editors at once.
  EXPECT_FALSE(listed(editor->SegmentList(), "walkB8") || listed(mWin->Segments(), "walkB8"));
  EXPECT_TRUE(red(1) && red(3) && marked(1) && marked(3));
  EXPECT_FALSE(red(2) || marked(2));

  // Another client's delete: within one poll.
  Other(":EDIT:SEGM:DEL \"spare\"");
  ASSERT_TRUE(listed(editor->SegmentList(), "spare"));
  Poll();
  EXPECT_FALSE(listed(editor->SegmentList(), "spare") || listed(mWin->Segments(), "spare"));

  // The stale name opens nothing, and makes nothing.
  mAlerts.clear();
  EXPECT_EQ(mMain->OpenSegment(1, 1), nullptr);
  QCoreApplication::processEvents();
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_NE(mAlerts[0].find("The instrument has no segment \"walkB8\""), std::string::npos) << mAlerts[0];
  EXPECT_EQ(QenSegmentPool::GetSegmentDsByName("walkB8"), nullptr);
  EXPECT_EQ(Other(":EDIT:SEGM:EXIS? \"walkB8\""), "FALSE");

  mAlerts.clear();
  mWin->findChild<QPushButton*>(QStringLiteral("PButRun"))->click();
  QCoreApplication::processEvents();
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_NE(mAlerts[0].find(
                "The sequence names the segment \"walkB8\" (blocks 1 and 3), which the instrument does not "
                "have; nothing was started."),
            std::string::npos)
      << mAlerts[0];
  EXPECT_EQ(Other(":SGEN:GLOB:INIT:CONT?"), "OFF");
}
