#include <gtest/gtest.h>

#include <QAction>
#include <QApplication>
#include <QClipboard>
#include <QComboBox>
#include <QDir>
#include <QGuiApplication>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QMessageBox>
#include <QPlainTextEdit>
#include <QPointer>
#include <QProgressDialog>
#include <QPushButton>
#include <QTest>
#include <QTimer>
#include <fstream>
#include <map>
#include <memory>

#include "common/gui/GuiSimFixture.h"
#include "segments/QenSegmentDs.h"
#include "segments/QenSegmentPool.h"
#include "segments/ui/GridDisp.h"
#include "segments/ui/SegmentGridManager.h"
#include "windows/dataedit/DataeditSegmentEditWin.h"

namespace {

// The segment editor against qensim: 64 vectors of 16 traces, four hex digits a vector.
class SegmentEditTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    mWin = OpenWindow();
    ASSERT_NE(mWin, nullptr);
    SegmentProperties properties;
    properties.name = kName;
    properties.length = 64;
    properties.width = 16;
    properties.coding = "01";
    ASSERT_EQ(mWin->CreateSegment(properties, mList), 0) << mList.ToText();
    mWin->Grid()->setFocus();
  }
  void TearDown() override {
    mWin.reset();
    QenSegmentPool::Delete(kName, mList);
    GuiSimFixture::TearDown();
  }
  std::unique_ptr<DataeditSegmentEditWin> OpenWindow() {
    auto win = std::make_unique<DataeditSegmentEditWin>();
    EXPECT_EQ(win->Load(mList), 0) << mList.ToText();
    win->resize(900, 600);
    win->show();
    return win;
  }
  // The digits of a vector as the grid shows them, the most significant first.
  static QString Row(SegmentGridManager* grid, long vector) {
    ConditionList list;
    EXPECT_EQ(grid->SetVectorOffset(0, vector, list), 0) << list.ToText();
    const GridDisp* digits = grid->findChild<GridDisp*>(QStringLiteral("digits"));
    QString text;
    for (int cell = 0; cell < 4; ++cell) text += grid->DispCell(*digits, vector, cell).text;
    return text;
  }
  // Every vector of the segment: the expected ones as given, the rest zero.
  static void ExpectRows(SegmentGridManager* grid, const std::map<long, QString>& expected) {
    for (long v = 0; v < 64; ++v) {
      const auto it = expected.find(v);
      EXPECT_EQ(Row(grid, v), it == expected.end() ? QStringLiteral("0000") : it->second) << "vector " << v;
    }
  }
  void Trigger(const char* action) {
    QAction* a = mWin->Action(QString::fromLatin1(action));
    ASSERT_NE(a, nullptr) << action;
    ASSERT_TRUE(a->isEnabled()) << action;
    a->trigger();
  }

  // Another client's view of a vector of the open segment `number` of 16 traces: four hex digits.
  QString OtherVector(const Dstring& number, long vector) {
    const Dstring block =
        Other(":EDIT:SEGM" + number + Dstring::Format(":PATT:DATA? 0,%ld,15,%ld,BIN", vector, vector));
    QString digits;
    for (int d = 3; d >= 0 && block.size() == 23; --d) {
      int value = 0;
      for (int t = 4 * d + 3; t >= 4 * d; --t)
        value = value * 2 + ((static_cast<unsigned char>(block[7 + t]) & 0x80) ? 1 : 0);
      digits += QString::number(value, 16);
    }
    return digits;
  }

  static constexpr const char* kName = "Edit/Work";
  std::unique_ptr<DataeditSegmentEditWin> mWin;
};

}  // namespace

TEST_F(SegmentEditTest, EditsFindsAndSavesWhatAFreshWindowReadsBack) {
  SegmentGridManager* grid = mWin->Grid();
  ASSERT_TRUE(grid->IsEditable());
  EXPECT_EQ(mWin->SegmentList()->currentItem()->text(), QString::fromLatin1(kName));
  EXPECT_EQ(mWin->windowTitle(), QStringLiteral("Segment Editor – Edit/Work"));

  QTest::keyClicks(grid, QStringLiteral("a5F0"));
  EXPECT_EQ(grid->CursorVector(), 1);
  EXPECT_TRUE(mWin->windowTitle().endsWith(QStringLiteral(" *")));
  // A letter outside hexadecimal changes nothing and says why.
  QTest::keyClick(grid, Qt::Key_G);
  EXPECT_FALSE(mWin->MessageText().isEmpty());
  EXPECT_EQ(grid->CursorVector(), 1);
  // With Alt a digit is a menu key, not typed.
  QTest::keyClick(grid, Qt::Key_A, Qt::AltModifier);
  EXPECT_EQ(grid->CursorDigit(), 3);

  ASSERT_EQ(grid->SetSelection(0, 2, 5, 1, 2, 0, mList), 0) << mList.ToText();
  Trigger("Fill1");
  ASSERT_EQ(grid->SetVectorSelection(0, 3, 4, mList), 0);
  Trigger("Invert");
  ASSERT_EQ(grid->GoToVectorTrace(40, 12, mList), 0);
  QTest::keyClicks(grid, QStringLiteral("beef"));
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();

  ASSERT_EQ(grid->GoToVectorTrace(6, 12, mList), 0);
  QTest::keyClicks(mWin->findChild<QLineEdit*>(QStringLiteral("EditFind")), QStringLiteral("bxef"));
  Trigger("FindNext");
  EXPECT_EQ(grid->CursorVector(), 40);
  // Nothing like it after the last one: the cursor stays and the message says so.
  ASSERT_EQ(grid->GoToVectorTrace(41, 12, mList), 0);
  mWin->findChild<QLineEdit*>(QStringLiteral("EditFind"))->setText(QStringLiteral("1234"));
  Trigger("FindNext");
  EXPECT_EQ(grid->CursorVector(), 41);
  EXPECT_TRUE(mWin->MessageText().contains(QStringLiteral("not found"))) << mWin->MessageText().toStdString();

  const std::map<long, QString> expected = {{0, "a5f0"}, {2, "0ff0"}, {3, "f00f"}, {4, "f00f"}, {5, "0ff0"}, {40, "beef"}};
  Trigger("Save");
  EXPECT_FALSE(grid->IsDirty());
  EXPECT_FALSE(mWin->windowTitle().endsWith(QStringLiteral(" *")));
  mWin.reset();
  ASSERT_EQ(QenSegmentPool::NumSources(), 0u);

  mWin = OpenWindow();
  ASSERT_EQ(mWin->OpenSegment(kName, mList), 0) << mList.ToText();
  ExpectRows(mWin->Grid(), expected);
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
}

// Find: text that is no pattern of the format is refused in the line below the grid, before
// anything is sent; what is found is selected; a search that went on round the end says so.
TEST_F(SegmentEditTest, FindRefusesWhatIsNoPatternSelectsWhatItFindsAndSaysWhenItWrapped) {
  SegmentGridManager* grid = mWin->Grid();
  auto* find = mWin->findChild<QLineEdit*>(QStringLiteral("EditFind"));
  ASSERT_EQ(grid->GoToVectorTrace(20, 12, mList), 0);
  QTest::keyClicks(grid, QStringLiteral("beef"));
  find->setText(QStringLiteral("zz"));
  Trigger("FindNext");
  QCoreApplication::processEvents();
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
  EXPECT_EQ(mWin->MessageText(),
            QStringLiteral("\"zz\" is not a hexadecimal pattern: use the digits 0\u20139 and "
                           "A\u2013F, and X for a digit that may be anything; nothing was sent."));
  EXPECT_FALSE(grid->HasSelection());
  EXPECT_EQ(grid->CursorVector(), 21);

  // From vector 21 on there is no "ef" up to the end: the one of vector 20 is found round it.
  find->setText(QStringLiteral("ef"));
  Trigger("FindNext");
  EXPECT_EQ(grid->CursorVector(), 20);
  ASSERT_TRUE(grid->HasSelection());
  const StateRange found = grid->SelectedRange();
  EXPECT_EQ(found.GetFirstVector(), 20);
  EXPECT_EQ(found.GetLastVector(), 20);
  EXPECT_EQ(found.GetFirstTrace(), 0);
  EXPECT_EQ(found.GetLastTrace(), 7);
  EXPECT_EQ(mWin->MessageText(),
            QStringLiteral("The search passed the end of the segment and went on from its start."));

  // From the start, "beef" is ahead: no word of wrapping; the four digits are selected.
  ASSERT_EQ(grid->GoToVectorTrace(0, 12, mList), 0);
  find->setText(QStringLiteral("BEEF"));
  Trigger("FindNext");
  EXPECT_EQ(grid->CursorVector(), 20);
  EXPECT_EQ(grid->SelectedRange().GetLastTrace(), 15);
  EXPECT_EQ(mWin->MessageText(), QString());
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
}

// In binary the digits stand in groups of four from trace 0, half a cell apart; a click on the
// first digit after a gap is that digit, one in the gap the digit before it.
TEST_F(SegmentEditTest, BinaryDigitsStandInGroupsOfFour) {
  SegmentGridManager* grid = mWin->Grid();
  QTest::keyClicks(grid, QStringLiteral("beef"));
  mWin->findChild<QComboBox*>(QStringLiteral("CBoxFormat"))
      ->setCurrentIndex(static_cast<int>(DataFormat::kBin));
  ASSERT_EQ(grid->GetDataFormat(0), static_cast<int>(DataFormat::kBin));
  GridDisp* digits = grid->findChild<GridDisp*>(QStringLiteral("digits"));
  const int dx = grid->GetDX();
  for (int cell = 1; cell < 16; ++cell) {
    EXPECT_EQ(digits->CellLeft(cell) - digits->CellLeft(cell - 1), dx + (cell % 4 == 0 ? dx / 2 : 0)) << cell;
  }
  const int y = grid->GetOffY() + grid->GetDY() + 2;
  QTest::mouseClick(digits, Qt::LeftButton, {}, QPoint(digits->CellLeft(4) + 1, y));
  EXPECT_EQ(grid->CursorTrace(), 11);
  EXPECT_EQ(grid->CursorVector(), 1);
  QTest::mouseClick(digits, Qt::LeftButton, {}, QPoint(digits->CellLeft(4) - 1, y));
  EXPECT_EQ(grid->CursorTrace(), 12);
  // The gap is blank; the digits either side are drawn.
  const QImage image = digits->grab().toImage();
  const int line0 = grid->GetOffY() + 2;
  for (int x = digits->CellLeft(3) + dx; x < digits->CellLeft(4); ++x) {
    for (int row = line0; row < line0 + grid->GetDY() - 4; ++row) {
      ASSERT_EQ(image.pixelColor(x, row), digits->palette().base().color()) << x << "," << row;
    }
  }

  // The picture of the documentation: a find in binary, the digits found selected.
  const QByteArray dir = qgetenv("QEN_SCREENSHOT_DIR");
  if (!dir.isEmpty()) {
    SegmentProperties properties;
    properties.name = "Demo/Binary";
    properties.length = 64;
    properties.width = 32;
    properties.coding = "01";
    ASSERT_EQ(mWin->CreateSegment(properties, mList), 0) << mList.ToText();
    mWin->findChild<QComboBox*>(QStringLiteral("CBoxFormat"))
        ->setCurrentIndex(static_cast<int>(DataFormat::kHex));
    for (const char* row :
         {"01234567", "89abcdef", "deadbeef", "cafef00d", "a5a5a5a5", "0ff00ff0", "12345678", "beef0000"}) {
      QTest::keyClicks(grid, QString::fromLatin1(row));
    }
    mWin->findChild<QComboBox*>(QStringLiteral("CBoxFormat"))
        ->setCurrentIndex(static_cast<int>(DataFormat::kBin));
    mWin->findChild<QLineEdit*>(QStringLiteral("EditFind"))->setText(QStringLiteral("1011111011101111"));
    Trigger("FindNext");
    mWin->resize(1000, 560);
    QCoreApplication::processEvents();
    EXPECT_TRUE(
        mWin->grab().save(QDir(QString::fromLocal8Bit(dir)).filePath(QStringLiteral("segment-editor.png"))));
    ASSERT_EQ(grid->Release(mList), 0);
    QenSegmentPool::Delete("Demo/Binary", mList);
  }
}

// A save refused under another user's lock keeps what was typed; it goes out once the lock is gone.
TEST_F(SegmentEditTest, ALockDuringSaveKeepsTheEdits) {
  SegmentGridManager* grid = mWin->Grid();
  QTest::keyClicks(grid, QStringLiteral("c3"));
  Control(":TEST:LOCK ON");
  Trigger("Save");
  EXPECT_TRUE(grid->IsDirty());
  EXPECT_EQ(mWin->MessageText(), SegmentGridManager::LockedText());
  // The grid still shows the data; typing is refused and says why.
  EXPECT_EQ(Row(grid, 0), QStringLiteral("c300"));
  mWin->findChild<QLabel*>(QStringLiteral("LabelMessage"))->clear();
  QTest::keyClick(grid, Qt::Key_F);
  EXPECT_EQ(mWin->MessageText(), SegmentGridManager::LockedText());
  EXPECT_EQ(Row(grid, 1), QStringLiteral("0000"));
  Control(":TEST:LOCK OFF");
  Trigger("Save");
  EXPECT_FALSE(grid->IsDirty());
  mWin.reset();
  mWin = OpenWindow();
  ASSERT_EQ(mWin->OpenSegment(kName, mList), 0) << mList.ToText();
  ExpectRows(mWin->Grid(), {{0, "c300"}});
}

// Scrolling to the end of a long segment reads only the lines around the ones shown.
TEST_F(SegmentEditTest, TheGridHoldsAFewScreensWhateverTheLength) {
  SegmentProperties properties;
  properties.name = "Edit/Long";
  properties.length = 1 << 20;
  properties.width = 16;
  properties.coding = "01";
  ASSERT_EQ(mWin->CreateSegment(properties, mList), 0) << mList.ToText();
  SegmentGridManager* grid = mWin->Grid();
  const long screen = grid->GetNumDispVectors(0);
  ASSERT_GT(screen, 10);
  ASSERT_EQ(grid->GoToVectorTrace((1 << 20) - 1, 0, mList), 0);
  QTest::keyClicks(grid, QStringLiteral("7"));
  long lines = 0;
  grid->GetNumVectors(0, lines);
  EXPECT_EQ(lines, 1 << 20);
  EXPECT_EQ(Row(grid, (1 << 20) - 1), QStringLiteral("0007"));
  EXPECT_LE(grid->HeldVectors(), 5 * screen);
  // Going back to the start writes the typed digit out before the buffer moves.
  ASSERT_EQ(grid->GoToVectorTrace(0, 0, mList), 0);
  EXPECT_LE(grid->HeldVectors(), 5 * screen);
  EXPECT_EQ(Row(grid, 0), QStringLiteral("0000"));
  EXPECT_EQ(Other(":EDIT:SEGM:EXIS? \"Edit/Long\""), "TRUE");
  ASSERT_EQ(grid->Release(mList), 0);
  QenSegmentPool::Delete("Edit/Long", mList);
}

// The editor's text goes out and comes back bit-identical over other contents; a file of the
// wrong width is refused with the line it failed on and the grid keeps what it had.
TEST_F(SegmentEditTest, TextExportImportsBackAndAWrongWidthIsRefused) {
  SegmentGridManager* grid = mWin->Grid();
  QTest::keyClicks(grid, QStringLiteral("12ab34cd"));
  const Dstring text = sDataDir + "/edit.txt";
  ASSERT_EQ(grid->ExportText(text, mList), 0) << mList.ToText();
  Trigger("SelectAll");
  Trigger("Fill1");
  EXPECT_EQ(Row(grid, 1), QStringLiteral("ffff"));
  ASSERT_EQ(grid->ImportText(text, mList), 0) << mList.ToText();
  ExpectRows(grid, {{0, "12ab"}, {1, "34cd"}});

  const Dstring wide = sDataDir + "/wide.txt";
  std::ofstream(wide) << "1234\n12345\n";
  ConditionList list;
  EXPECT_NE(grid->ImportText(wide, list), 0);
  EXPECT_NE(list.ToText().find("Line 2 of"), std::string::npos) << list.ToText();
  ExpectRows(grid, {{0, "12ab"}, {1, "34cd"}});
  EXPECT_NE(grid->ExportVcd(sDataDir + "/no/such/dir/edit.vcd", list), 0);
  EXPECT_NE(list.ToText().find("could not be written"), std::string::npos) << list.ToText();
}

// Choosing another segment with unsaved edits asks too: the instrument would forget them.
TEST_F(SegmentEditTest, OpeningAnotherSegmentWithUnsavedEditsAsks) {
  MakeSegment("Edit/Other", 8, 4);
  ASSERT_EQ(mWin->ReadCatalog(mList), 0);
  QTest::keyClicks(mWin->Grid(), QStringLiteral("77"));
  QListWidget* list = mWin->SegmentList();
  const auto pick = [list](const char* name) {
    list->setCurrentItem(list->findItems(QString::fromLatin1(name), Qt::MatchExactly).front());
  };
  mToolkit.QueueAnswer(ToolkitPort::kCancel);
  pick("Edit/Other");
  EXPECT_EQ(mWin->Grid()->GetSegmentDs()->GetName(), Dstring(kName));
  EXPECT_EQ(list->currentItem()->text(), QString::fromLatin1(kName));
  EXPECT_TRUE(mWin->Grid()->IsDirty());
  mToolkit.QueueAnswer(ToolkitPort::kYes);
  pick("Edit/Other");
  EXPECT_EQ(mWin->Grid()->GetSegmentDs()->GetName(), Dstring("Edit/Other"));
  ASSERT_EQ(mWin->OpenSegment(kName, mList), 0) << mList.ToText();
  ExpectRows(mWin->Grid(), {{0, "7700"}});
  QenSegmentPool::Delete("Edit/Other", mList);
}

// Closing with unsaved edits asks: going back keeps the window and the edits, saving saves them.
TEST_F(SegmentEditTest, ClosingWithUnsavedEditsAsks) {
  QTest::keyClicks(mWin->Grid(), QStringLiteral("9e"));
  mToolkit.QueueAnswer(ToolkitPort::kCancel);
  EXPECT_FALSE(mWin->close());
  EXPECT_TRUE(mWin->Grid()->IsDirty());
  mToolkit.QueueAnswer(ToolkitPort::kYes);
  EXPECT_TRUE(mWin->close());
  EXPECT_FALSE(mWin->Grid()->IsDirty());
  mWin.reset();
  mWin = OpenWindow();
  ASSERT_EQ(mWin->OpenSegment(kName, mList), 0) << mList.ToText();
  ExpectRows(mWin->Grid(), {{0, "9e00"}});
}

// Traces in and out, serial and back, another coding: the grid follows the segment's new shape.
TEST_F(SegmentEditTest, ReshapingCommandsKeepTheGridInStep) {
  SegmentGridManager* grid = mWin->Grid();
  QTest::keyClicks(grid, QStringLiteral("8001"));
  long digits = 0;
  ASSERT_EQ(grid->GoToVectorTrace(0, 4, mList), 0);
  Trigger("DeleteTraces");
  grid->GetNumDigits(0, digits);
  EXPECT_EQ(digits, 3);
  EXPECT_EQ(Row(grid, 0).left(3), QStringLiteral("801"));

  Trigger("SerializeLsb");
  long vectors = 0;
  grid->GetNumVectors(0, vectors);
  EXPECT_EQ(vectors, 64 * 12);
  EXPECT_TRUE(mWin->Action(QStringLiteral("Deserialize"))->isEnabled());
  EXPECT_FALSE(mWin->Action(QStringLiteral("SerializeLsb"))->isEnabled());
  ConditionList refused;
  EXPECT_NE(grid->ModifyDeserialize(12, 64 * 12, refused), 0);
  ASSERT_EQ(grid->ModifyDeserialize(12, 0, mList), 0) << mList.ToText();
  grid->GetNumVectors(0, vectors);
  grid->GetNumDigits(0, digits);
  EXPECT_EQ(vectors, 64);
  EXPECT_EQ(digits, 3);
  EXPECT_EQ(Row(grid, 0).left(3), QStringLiteral("801"));

  grid->SetTargetCoding("01X");
  ASSERT_EQ(grid->ModifyCoding(mList), 0) << mList.ToText();
  Dstring coding;
  ASSERT_EQ(grid->GetSegmentDs()->GetCoding(coding, mList, true), 0);
  EXPECT_EQ(coding, "01X");
  EXPECT_EQ(Row(grid, 0).left(3), QStringLiteral("801"));
  // A state letter is typed as it is: "X" sets every trace of the digit, shown as "?".
  ASSERT_EQ(grid->GoToVectorTrace(1, 0, mList), 0);
  QTest::keyClicks(grid, QStringLiteral("X"));
  EXPECT_EQ(Row(grid, 1).left(3), QStringLiteral("00?"));
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
}

// Copy puts the selection on the system clipboard as text; Paste Text puts text at the cursor,
// and text that does not fit from there is refused whole.
TEST_F(SegmentEditTest, TheSystemClipboardCarriesDigitsBothWays) {
  SegmentGridManager* grid = mWin->Grid();
  QTest::keyClicks(grid, QStringLiteral("12ab34cd"));
  ASSERT_EQ(grid->SetSelection(0, 0, 1, 1, 2, 0, mList), 0);
  Trigger("Copy");
  EXPECT_EQ(QGuiApplication::clipboard()->text(), QStringLiteral("2a\n4c\n"));
  ASSERT_EQ(grid->GoToVectorTrace(10, 12, mList), 0);
  Trigger("PasteText");
  ExpectRows(grid, {{0, "12ab"}, {1, "34cd"}, {10, "2a00"}, {11, "4c00"}});

  const std::pair<QString, const char*> refused[] = {{"12345\n", "room for 4"}, {"1\n2\n", "room for 1;"}};
  ASSERT_EQ(grid->GoToVectorTrace(63, 12, mList), 0);
  for (const auto& [text, expected] : refused) {
    QGuiApplication::clipboard()->setText(text);
    mAlerts.clear();
    Trigger("PasteText");
    QCoreApplication::processEvents();  // refusals are shown after the event
    ASSERT_EQ(mAlerts.size(), 1u);
    EXPECT_NE(mAlerts[0].find(expected), std::string::npos) << mAlerts[0];
  }
  ExpectRows(grid, {{0, "12ab"}, {1, "34cd"}, {10, "2a00"}, {11, "4c00"}});
}

// A fill over millions of vectors shows how far the instrument is; Cancel has it put the
// segment back, edits typed before included, and the window says so instead of an error.
TEST_F(SegmentEditTest, ALongFillShowsItsProgressAndCancelLeavesTheSegmentAsItWas) {
  constexpr long kLength = 4L << 20;
  SegmentProperties properties;
  properties.name = "Edit/Huge";
  properties.length = kLength;
  properties.width = 8;
  properties.coding = "01";
  ASSERT_EQ(mWin->CreateSegment(properties, mList), 0) << mList.ToText();
  SegmentGridManager* grid = mWin->Grid();
  QTest::keyClicks(grid, QStringLiteral("a5"));
  Trigger("SelectAll");
  Other(":EDIT:SEGM:PACE 200");
  bool sawProgress = false;
  QTimer cancel;
  QObject::connect(&cancel, &QTimer::timeout, [&] {
    auto* dialog = mWin->findChild<QProgressDialog*>(QStringLiteral("ServerWorkProgress"));
    auto* button = dialog && dialog->isVisible() ? dialog->findChild<QPushButton*>() : nullptr;
    if (button && button->isEnabled()) {
      sawProgress = true;
      QTest::mouseClick(button, Qt::LeftButton);
    }
  });
  cancel.start(10);
  Trigger("Fill1");
  cancel.stop();
  Other(":EDIT:SEGM:PACE 0");
  EXPECT_TRUE(sawProgress);
  EXPECT_TRUE(mWin->MessageText().startsWith(QStringLiteral("Cancelled"))) << mWin->MessageText().toStdString();
  EXPECT_TRUE(mAlerts.empty());
  const GridDisp* digits = grid->findChild<GridDisp*>(QStringLiteral("digits"));
  for (long vector : {0L, kLength - 1}) {
    ASSERT_EQ(grid->SetVectorOffset(0, vector, mList), 0) << mList.ToText();
    const QString row = grid->DispCell(*digits, vector, 0).text + grid->DispCell(*digits, vector, 1).text;
    EXPECT_EQ(row, vector == 0 ? QStringLiteral("a5") : QStringLiteral("00")) << "vector " << vector;
  }
  Dstring number = Other(":EDIT:SEGM:OPEN? \"Edit/Huge\"");
  EXPECT_EQ(Other(":EDIT:SEGM" + number + ":PATT:DATA? 0,0,7,0,BIN"), Dstring(std::string("#500008\x80\0\x80\0\0\x80\0\x80", 15)));
  Other(":EDIT:SEGM" + number + ":CLOS");
  ASSERT_EQ(grid->Release(mList), 0);
  QenSegmentPool::Delete("Edit/Huge", mList);
}

namespace {

// What the user does when another client changed the segment under the digits typed here: the
// buttons clicked on the dialogs that come up, in order (the compare dialog after "Look First").
struct Answer {
  const char* name;
  std::vector<const char*> buttons;
};

class ChangedElsewhereTest : public SegmentEditTest, public testing::WithParamInterface<Answer> {
 protected:
  // Clicks the buttons in order, each on the next modal dialog once it shows; what the dialogs
  // said is kept, and what the instrument held while the first one was up.
  void ClickWhenShown(std::vector<const char*> buttons) {
    auto* timer = new QTimer(mWin.get());
    timer->setInterval(0);
    QObject::connect(timer, &QTimer::timeout, [this, timer, buttons, next = std::size_t{0}]() mutable {
      QWidget* dialog = QApplication::activeModalWidget();
      if (dialog == nullptr || (next > 0 && dialog == mLastDialog)) return;
      mLastDialog = dialog;
      if (auto* box = qobject_cast<QMessageBox*>(dialog)) mSaid.push_back(box->text());
      if (auto* text = dialog->findChild<QPlainTextEdit*>(QStringLiteral("TextDifferences")))
        mSaid.push_back(text->toPlainText());
      if (next == 0) mHeldThen = OtherVector(35);
      dialog->findChild<QPushButton*>(QLatin1String(buttons[next]))->click();
      if (++next == buttons.size()) timer->deleteLater();
    });
    timer->start();
  }
  QString OtherVector(long vector) { return SegmentEditTest::OtherVector(mNumber, vector); }

  Dstring mNumber;
  // Guarded: the next dialog may well be made where the last one was.
  QPointer<QWidget> mLastDialog;
  QStringList mSaid;
  QString mHeldThen;
};

}  // namespace

// Digits typed at vector 0 and not yet written; another client fills vector 35. The poll that
// reports it writes nothing: the editor asks first, and does what the user chose.
TEST_P(ChangedElsewhereTest, TheEditorAsksBeforeItWritesOverAnotherClientsChange) {
  SegmentGridManager* grid = mWin->Grid();
  QTest::keyClicks(grid, QStringLiteral("c3"));
  mNumber = Other(":EDIT:SEGM:OPEN? \"Edit/Work\"");
  Other(":EDIT:SEGM" + mNumber + ":PATT:MOD:FILL 0,35,15,35,1");
  ClickWhenShown(GetParam().buttons);
  Poll();
  QCoreApplication::processEvents();
  EXPECT_EQ(mHeldThen, QStringLiteral("ffff")) << "nothing was written before the question";
  ASSERT_FALSE(mSaid.isEmpty());
  EXPECT_TRUE(mSaid.front().startsWith(
      QStringLiteral("Another client changed the segment \"Edit/Work\" while digits you typed")))
      << mSaid.front().toStdString();
  const std::string name = GetParam().name;
  if (name == "look") {
    ASSERT_EQ(mSaid.size(), 2);
    EXPECT_EQ(mSaid[1], QStringLiteral("Vector    Before  Yours   Theirs\n"
                                       "0         0000    c300    0000\n"
                                       "35        0000    0000    ffff\n"));
    // Decided later: the digits stay, nothing is written, and a save says why.
    EXPECT_TRUE(grid->GetSegmentDs()->IsChangedElsewhere());
    Trigger("Save");
    QCoreApplication::processEvents();
    EXPECT_EQ(OtherVector(0), QStringLiteral("0000"));
    ASSERT_FALSE(mAlerts.empty());
    EXPECT_NE(mAlerts.back().find("nothing was written. Choose first"), std::string::npos) << mAlerts.back();
    mAlerts.clear();
    Trigger("KeepMine");
  }
  const bool mine = name != "theirs";
  EXPECT_FALSE(grid->GetSegmentDs()->IsChangedElsewhere());
  EXPECT_TRUE(grid->IsDirty()) << "their change is not saved either";
  EXPECT_FALSE(grid->GetSegmentDs()->HasUnwrittenStates());
  EXPECT_EQ(Row(grid, 0), mine ? QStringLiteral("c300") : QStringLiteral("0000"));
  EXPECT_EQ(Row(grid, 35), QStringLiteral("ffff")) << "their vector survives either way";
  EXPECT_EQ(OtherVector(0), Row(grid, 0));
  EXPECT_EQ(OtherVector(35), QStringLiteral("ffff"));
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
  Other(":EDIT:SEGM" + mNumber + ":CLOS");
}

INSTANTIATE_TEST_SUITE_P(Choices, ChangedElsewhereTest,
                         testing::Values(Answer{"mine", {"PButKeepMine"}},
                                         Answer{"theirs", {"PButTakeTheirs"}},
                                         Answer{"look", {"PButLookFirst", "PButLater"}}),
                         [](const testing::TestParamInfo<Answer>& info) {
                           return std::string(info.param.name);
                         });

// A change of the other client outside the vectors held here is no conflict: the digits typed
// are written as before, and nothing is asked.
TEST_F(SegmentEditTest, AnotherClientsChangeElsewhereInTheSegmentAsksNothing) {
  SegmentProperties properties;
  properties.name = "Edit/Far";
  properties.length = 1 << 16;
  properties.width = 16;
  properties.coding = "01";
  ASSERT_EQ(mWin->CreateSegment(properties, mList), 0) << mList.ToText();
  SegmentGridManager* grid = mWin->Grid();
  ASSERT_LT(grid->HeldVectors(), 60000);
  QTest::keyClicks(grid, QStringLiteral("5a"));
  const Dstring number = Other(":EDIT:SEGM:OPEN? \"Edit/Far\"");
  Other(":EDIT:SEGM" + number + ":PATT:MOD:FILL 0,60000,15,60000,1");
  Poll();
  QCoreApplication::processEvents();
  EXPECT_EQ(QApplication::activeModalWidget(), nullptr);
  EXPECT_FALSE(grid->GetSegmentDs()->IsChangedElsewhere());
  EXPECT_EQ(OtherVector(number, 0), QStringLiteral("5a00")) << "the digits typed were written";
  EXPECT_EQ(Row(grid, 60000), QStringLiteral("ffff"));
  Other(":EDIT:SEGM" + number + ":CLOS");
  ASSERT_EQ(grid->Release(mList), 0);
  QenSegmentPool::Delete("Edit/Far", mList);
}
