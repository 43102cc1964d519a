#include <gtest/gtest.h>

#include <QScrollBar>
#include <QSignalSpy>
#include <QTest>
#include <functional>
#include <memory>

#include "common/gui/GuiSimFixture.h"
#include "segments/ui/AddrDisp.h"
#include "segments/ui/DigitDisp.h"
#include "segments/ui/GridManager.h"
#include "segments/ui/NameDisp.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "toolkit/qt/WidgetClassTable.h"

namespace {

class GridManagerTest : public testing::Test {
 protected:
  void SetUp() override {
    EnsureApplication();
    ASSERT_EQ(GridManager::Register(mList), 0) << mList.ToText();
  }
  void TearDown() override { WidgetClassTable::UnregisterAll(); }

  ConditionList mList;
};

// A grid of numbered lines, one cell per digit of the line number; it records what it is told.
class LinesGrid : public GridManager {
 public:
  explicit LinesGrid(long lines) : mLines(lines) {
    SetFields({10, 18, 0, 16});
    resize(300, 16 + 10 * 18);
    new AddrDisp(this);
    new DigitDisp(this);
  }
  long DispLineCount() const override { return mLines; }
  long DispFirstLine() const override { return mFirst; }
  void DispScrollTo(long first) override { mFirst = first; }
  GridCell DispCell(const GridDisp& disp, long line, int cell) const override {
    GridCell c;
    c.text = disp.GetKind() == GridDisp::Kind::kAddr ? QString::number(line) : QString::number(cell);
    c.cursor = line == mPressedLine;
    return c;
  }
  void DispPress(const GridDisp& disp, long line, int cell, Qt::KeyboardModifiers) override {
    mPressedKind = disp.GetKind();
    mPressedLine = line;
    mPressedCell = cell;
  }
  using GridManager::ShowLine;

  long mLines;
  long mFirst = 0;
  GridDisp::Kind mPressedKind = GridDisp::Kind::kName;
  long mPressedLine = -1;
  int mPressedCell = -1;
};

TEST_F(GridManagerTest, AGridThatOverridesNothingOffersNothingAndHarmsNothing) {
  GridManager grid;
  const std::vector<std::pair<const char*, std::function<bool()>>> possible = {
      {"fill", [&] { return grid.IsFillPossible(); }},         {"invert", [&] { return grid.IsInvertPossible(); }},
      {"serialize", [&] { return grid.IsSerializePossible(); }}, {"deserialize", [&] { return grid.IsDeserializePossible(); }},
      {"coding", [&] { return grid.IsCodingPossible(); }},     {"mirror", [&] { return grid.IsMirrorPossible(); }},
      {"copy", [&] { return grid.IsCopyPossible(); }},         {"paste", [&] { return grid.IsPastePossible(); }},
      {"insert", [&] { return grid.IsInsertPossible(); }},     {"delete", [&] { return grid.IsDeletePossible(); }},
      {"find", [&] { return grid.IsFindPossible(); }},         {"dirty", [&] { return grid.IsDirty(); }},
      {"labels", [&] { return grid.AreLabelsEnabled(); }}};
  for (const auto& [name, ask] : possible) EXPECT_FALSE(ask()) << name;

  long count = 99;
  grid.GetNumDigits(3, count);
  EXPECT_EQ(count, 0);
  count = 99;
  grid.GetNumVectors(3, count);
  EXPECT_EQ(count, 0);
  double mux = 0;
  grid.GetPortMux(0, mux);
  EXPECT_EQ(mux, 1.0);
  for (auto get : {&GridManager::GetVectorOffset, &GridManager::GetDigitOffset, &GridManager::GetPrevVectorOffset,
                   &GridManager::GetPrevDigitOffset}) {
    long value = 42;
    (grid.*get)(1, value);
    EXPECT_EQ(value, 0);
  }
  EXPECT_EQ(grid.GetAddrFormat(), -1);
  EXPECT_EQ(grid.GetDataFormat(0), -1);
  EXPECT_EQ(grid.GetDispMode(), -1);
  EXPECT_EQ(grid.GetDYMultiplier(5), 1);
  EXPECT_TRUE(grid.AutoMoveCursor());

  Dstring name = "left over";
  EXPECT_EQ(grid.GetSegmentName(0, 0, name, mList), 0);
  EXPECT_EQ(name, "");
  for (long row : {0L, 7L, -1L}) {
    for (long column : {0L, 3L}) EXPECT_TRUE(grid.IsOk(row, column)) << row << "," << column;
  }
  EXPECT_EQ(grid.ModifyFill(mList), 0);
  EXPECT_EQ(grid.ModifyInsert(VectorTrace::kVector, InsertMode::kAfter, 4, mList), 0);
  EXPECT_EQ(grid.SaveSegmentAs(0, 0, "X", mList), 0);
  EXPECT_TRUE(mList.IsEmpty());
}

TEST_F(GridManagerTest, AResourceSetsTheFieldsAndLaysTheColumnsOutInOrder) {
  std::unique_ptr<QWidget> form(ResourceLibrary::Load("qtest.Grid", nullptr, mList));
  ASSERT_NE(form, nullptr) << mList.ToText();
  auto* grid = form->findChild<GridManager*>("grid");
  ASSERT_NE(grid, nullptr);
  EXPECT_EQ(grid->GetDX(), 12);
  EXPECT_EQ(grid->GetDY(), 20);
  EXPECT_EQ(grid->GetOffX(), 4);
  EXPECT_EQ(grid->GetOffY(), 16);
  const std::vector<GridDisp*> disps = grid->Disps();
  ASSERT_EQ(disps.size(), 3u);
  EXPECT_NE(qobject_cast<AddrDisp*>(disps[0]), nullptr);
  EXPECT_NE(qobject_cast<DigitDisp*>(disps[1]), nullptr);
  EXPECT_NE(qobject_cast<NameDisp*>(disps[2]), nullptr);
  grid->resize(400, 300);
  grid->Refresh();
  EXPECT_EQ(disps[0]->geometry(), QRect(4, 0, 72, 300));
  EXPECT_EQ(disps[1]->x(), 76);
  EXPECT_EQ(disps[2]->x(), disps[1]->x() + disps[1]->width());
  EXPECT_EQ(disps[2]->width(), 96);
  EXPECT_LE(disps[2]->x() + disps[2]->width(), 400);
  EXPECT_EQ(grid->VisibleLines(), (300 - 16) / 20);

  GridManager copy;
  copy.SetFields(grid->GetFields());
  EXPECT_EQ(copy.GetDX(), 12);
  EXPECT_EQ(copy.GetOffY(), 16);
}

TEST_F(GridManagerTest, FieldsOutsideSixteenBitsAreClamped) {
  GridManager grid;
  grid.setProperty("dx", 70000);
  grid.setProperty("offx", -40000);
  EXPECT_EQ(grid.GetDX(), 32767);
  EXPECT_EQ(grid.GetOffX(), -32768);
}

TEST_F(GridManagerTest, TheResourceConstructorTakesItsContentOrNamesWhatIsMissing) {
  GridManager grid("qtest.GridContent", "uiapp", mList);
  EXPECT_TRUE(mList.IsEmpty()) << mList.ToText();
  EXPECT_EQ(grid.GetDX(), 9);
  EXPECT_EQ(grid.GetOffY(), 0);
  ASSERT_EQ(grid.Disps().size(), 2u);
  EXPECT_EQ(grid.Disps()[1]->Cells(), 5);

  ConditionList missing;
  GridManager empty("qtest.NoSuchGrid", "uiapp", missing);
  EXPECT_TRUE(empty.Disps().empty());
  EXPECT_NE(missing.ToText().find("qtest.NoSuchGrid"), std::string::npos) << missing.ToText();
  ConditionList noLibrary;
  GridManager none("qtest.GridContent", "nolib", noLibrary);
  EXPECT_NE(noLibrary.ToText().find("nolib"), std::string::npos) << noLibrary.ToText();
}

TEST_F(GridManagerTest, ConstructionThroughTheClassTableMakesAGrid) {
  QWidget parent;
  QWidget* made = WidgetClassTable::Create(GridManager::Class(), &parent);
  ASSERT_NE(qobject_cast<GridManager*>(made), nullptr);
  EXPECT_EQ(made->parent(), &parent);
  EXPECT_EQ(GridManager::GetOiFields(), (std::vector<Dstring>{"dx", "dy", "offx", "offy"}));
  GridManager::OiDelete(made);
  EXPECT_TRUE(parent.children().isEmpty());
}

TEST_F(GridManagerTest, ClicksWheelAndScrollBarAgreeOnTheLineShown) {
  LinesGrid grid(1000);
  grid.show();
  grid.Refresh();
  ASSERT_EQ(grid.VisibleLines(), 10);
  GridDisp* digits = grid.Disps()[1];
  // Third line, second cell of the digit column.
  QTest::mouseClick(digits, Qt::LeftButton, {}, QPoint(grid.GetDX() + 3, 16 + 2 * 18 + 5));
  EXPECT_EQ(grid.mPressedKind, GridDisp::Kind::kDigit);
  EXPECT_EQ(grid.mPressedLine, 2);
  EXPECT_EQ(grid.mPressedCell, 1);
  EXPECT_TRUE(grid.hasFocus() || !grid.isActiveWindow());

  auto* bar = grid.findChild<QScrollBar*>();
  ASSERT_NE(bar, nullptr);
  EXPECT_EQ(bar->maximum(), 990);
  bar->setValue(500);
  EXPECT_EQ(grid.mFirst, 500);
  QTest::mouseClick(digits, Qt::LeftButton, {}, QPoint(3, 16 + 5));
  EXPECT_EQ(grid.mPressedLine, 500);

  QWheelEvent down(QPointF(20, 40), digits->mapToGlobal(QPointF(20, 40)), {}, QPoint(0, -240), Qt::NoButton, {},
                   Qt::NoScrollPhase, false);
  QApplication::sendEvent(&grid, &down);
  EXPECT_EQ(grid.mFirst, 506);
  EXPECT_EQ(bar->value(), 506);

  grid.ShowLine(999);
  EXPECT_EQ(grid.mFirst, 990);
  grid.ShowLine(995);
  EXPECT_EQ(grid.mFirst, 990);
  // A click below the last line hits nothing.
  grid.mLines = 993;
  grid.Refresh();
  grid.mPressedLine = -1;
  QTest::mouseClick(digits, Qt::LeftButton, {}, QPoint(3, 16 + 5 * 18 + 5));
  EXPECT_EQ(grid.mPressedLine, -1);
}

TEST_F(GridManagerTest, TheDefaultPaintDrawsHeaderLinesAndCursor) {
  LinesGrid grid(3);
  grid.mPressedLine = 1;
  grid.Refresh();
  const QImage image = grid.grab().toImage();
  const QColor highlight = grid.palette().highlight().color();
  GridDisp* digits = grid.Disps()[1];
  const QPoint inCursor = digits->geometry().topLeft() + QPoint(1, 16 + 18 + 1);
  const QPoint belowLines = digits->geometry().topLeft() + QPoint(1, 16 + 5 * 18 + 1);
  EXPECT_EQ(image.pixelColor(inCursor), highlight);
  EXPECT_EQ(image.pixelColor(belowLines), grid.palette().base().color());
}

}  // namespace
