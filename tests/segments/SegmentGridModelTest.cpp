// The segment grid's model against a qensim process over a real socket, without a widget.
#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "instrument/QenStatus.h"
#include "segments/SegmentGridModel.h"
#include "segments/SegmentSimFixture.h"

namespace {

// A view with room for a fixed number of lines and digit cells that keeps what it is told.
class FixedView : public SegmentGridModel::Observer {
 public:
  long LinesShown() const override { return mLines; }
  long DigitCellsShown() const override { return mCells; }
  void NfySegmentChanged(bool elsewhere) override { mChanges.push_back(elsewhere); }
  void NfyMessage(const Dstring& text) override { mMessages.push_back(text); }

  long mLines = 4;
  long mCells = 8;
  std::vector<bool> mChanges;
  std::vector<Dstring> mMessages;
};

class SegmentGridModelTest : public SegmentSimFixture {
 protected:
  void SetUp() override {
    SegmentSimFixture::SetUp();
    mModel = std::make_unique<SegmentGridModel>();
    mModel->SetObserver(&mView);
  }

  void TearDown() override {
    Lock(false);
    mModel.reset();
    SegmentSimFixture::TearDown();
  }

  // A two-state segment made on the server and opened in the model.
  void Open(const Dstring& name, long length, long width) {
    SegmentProperties p;
    p.name = name;
    p.coding = "01";
    p.length = length;
    p.width = width;
    unsigned created = 0;
    ASSERT_EQ(QenSegmentPool::Create(p, created, mList), 0) << mList.ToText();
    ASSERT_EQ(mModel->HookOn(name, mList), 0) << mList.ToText();
  }

  void Lock(bool on) {
    Dstring reply;
    if (mOther.IsConnected()) {
      ASSERT_EQ(mOther.Call(on ? ":TEST:LOCK ON" : ":TEST:LOCK OFF", reply), 0);
    }
  }

  // The digits of a vector as the grid shows them, the most significant first.
  std::string Row(long vector) {
    if (vector < mModel->HeldStart() || vector >= mModel->HeldStart() + mModel->HeldVectors()) {
      EXPECT_EQ(mModel->SetVectorOffset(vector, mList), 0) << mList.ToText();
    }
    std::string text;
    for (long column = 0; column < mModel->Digits(); ++column) text += mModel->CellAt(vector, column).text;
    return text;
  }

  void Place(long vector, long digit) {
    ASSERT_EQ(mModel->GoToVectorTrace(vector, digit * mModel->TracesPerDigit(), mList), 0) << mList.ToText();
  }

  FixedView mView;
  std::unique_ptr<SegmentGridModel> mModel;
};

// 10 vectors of 6 traces in hexadecimal: digit 1 (traces 4, 5) on the left, digit 0 on the
// right; four lines shown, so a page moves three.
TEST_F(SegmentGridModelTest, CursorKeysStopAtTheEdgesAndTheLinesShownFollow) {
  Open("Grid/Keys", 10, 6);
  using K = SegmentGridModel::Key;
  const struct {
    long vector, digit;
    K key;
    bool far;
    long toVector, toDigit, first;
  } cases[] = {
      {0, 1, K::kUp, false, 0, 1, 0},       {9, 1, K::kDown, false, 9, 1, 6},
      {3, 1, K::kDown, false, 4, 1, 1},     {2, 1, K::kDown, false, 3, 1, 0},
      {0, 1, K::kLeft, false, 0, 1, 0},     {0, 0, K::kRight, false, 0, 0, 0},
      {0, 1, K::kRight, false, 0, 0, 0},    {0, 0, K::kLeft, false, 0, 1, 0},
      {5, 0, K::kPageDown, false, 8, 0, 5}, {7, 0, K::kPageDown, false, 9, 0, 6},
      {3, 0, K::kPageUp, false, 0, 0, 0},   {2, 0, K::kPageUp, false, 0, 0, 0},
      {5, 0, K::kHome, false, 5, 1, 2},     {5, 1, K::kEnd, false, 5, 0, 2},
      {5, 0, K::kHome, true, 0, 1, 0},      {5, 1, K::kEnd, true, 9, 0, 6},
  };
  for (const auto& c : cases) {
    ASSERT_EQ(mModel->SetVectorOffset(0, mList), 0);
    Place(c.vector, c.digit);
    mModel->PressKey(c.key, false, c.far);
    EXPECT_EQ(mModel->CursorVector(), c.toVector) << "from " << c.vector << "," << c.digit;
    EXPECT_EQ(mModel->CursorDigit(), c.toDigit) << "from " << c.vector << "," << c.digit;
    EXPECT_EQ(mModel->FirstLine(), c.first) << "from " << c.vector << "," << c.digit;
    EXPECT_FALSE(mModel->HasSelection());
  }
}

TEST_F(SegmentGridModelTest, ShiftSelectsARectangleAndASelectionMustLieInside) {
  Open("Grid/Select", 10, 6);
  Place(2, 0);
  mModel->PressKey(SegmentGridModel::Key::kDown, true, false);
  mModel->PressKey(SegmentGridModel::Key::kLeft, true, false);
  ASSERT_TRUE(mModel->HasSelection());
  StateRange r = mModel->SelectedRange();
  // Digit 1 of six traces holds traces 4 and 5 only.
  EXPECT_EQ(std::vector<long>({r.GetFirstVector(), r.GetLastVector(), r.GetFirstTrace(), r.GetLastTrace()}),
            std::vector<long>({2, 3, 0, 5}));
  EXPECT_EQ(mModel->CursorText(), "Vector 3, trace 4 \u00b7 selected: vectors 2\u20133, traces 0\u20135");
  mModel->PressKey(SegmentGridModel::Key::kUp, false, false);
  EXPECT_FALSE(mModel->HasSelection());

  const struct {
    long firstVector, lastVector, firstDigit, lastDigit;
    int status;
  } selections[] = {
      {0, 9, 0, 1, 0}, {9, 9, 1, 1, 0}, {0, 10, 0, 1, 1}, {-1, 3, 0, 1, 1},
      {0, 3, 0, 2, 1}, {0, 3, -1, 1, 1}, {4, 3, 0, 1, 1}, {0, 3, 1, 0, 1},
  };
  for (const auto& s : selections) {
    ASSERT_EQ(mModel->SetSelection(5, 6, 0, 0, mList), 0);
    EXPECT_EQ(mModel->SetSelection(s.firstVector, s.lastVector, s.firstDigit, s.lastDigit, mList), s.status)
        << s.firstVector << ".." << s.lastVector << " / " << s.firstDigit << ".." << s.lastDigit;
    r = mModel->SelectedRange();
    const long expectedFirst = s.status == 0 ? s.firstVector : 5;
    EXPECT_EQ(r.GetFirstVector(), expectedFirst) << "a refused selection keeps the one before";
  }
}

// Nine lines shown make a page of ten and a buffer of forty vectors.
TEST_F(SegmentGridModelTest, TheBufferHoldsFourPagesAndMovesOnlyWhenTheLinesShownLeaveIt) {
  mView.mLines = 9;
  Open("Grid/Window", 1000, 8);
  EXPECT_EQ(mModel->HeldStart(), 0);
  EXPECT_EQ(mModel->HeldVectors(), 40);
  const struct {
    long first, heldStart;
  } scrolls[] = {{30, 0}, {31, 21}, {21, 21}, {20, 10}, {995, 960}, {0, 0}};
  for (const auto& s : scrolls) {
    ASSERT_EQ(mModel->ScrollTo(s.first, mList), 0) << mList.ToText();
    EXPECT_EQ(mModel->HeldStart(), s.heldStart) << "first line " << s.first;
    EXPECT_EQ(mModel->HeldVectors(), 40) << "first line " << s.first;
  }
  // A digit typed at the start goes to the server before the buffer leaves it.
  Place(0, 1);
  ASSERT_EQ(mModel->Type('A', mList), 0) << mList.ToText();
  EXPECT_EQ(mModel->CursorDigit(), 0);
  ASSERT_EQ(mModel->GoToVectorTrace(999, 0, mList), 0);
  EXPECT_EQ(mModel->HeldStart(), 960);
  EXPECT_FALSE(mModel->GetSegmentDs()->IsBufferDirty(mModel->GetBuffer()));
  EXPECT_EQ(Row(0), "a0");
}

// 800 traces of one bit: a block carries 124 bytes a trace, 992 vectors, fewer than four pages
// of 300 lines.
TEST_F(SegmentGridModelTest, AWideSegmentHoldsWhatOneBlockCarries) {
  mView.mLines = 299;
  Open("Grid/Wide", 5000, 800);
  EXPECT_EQ(mModel->HeldVectors(), 992);
  ASSERT_EQ(mModel->GoToVectorTrace(4999, 0, mList), 0);
  EXPECT_EQ(mModel->FirstLine(), 4701);
  EXPECT_EQ(mModel->HeldStart(), 5000 - 992);
  // A jump shows the cursor's digit in the middle of the eight cells shown; a move shows it
  // with the least scrolling.
  EXPECT_EQ(mModel->DigitOffset(), mModel->ColumnOfDigit(0) - 4);
  mModel->PressKey(SegmentGridModel::Key::kHome, false, false);
  EXPECT_EQ(mModel->DigitOffset(), 0);
  mModel->PressKey(SegmentGridModel::Key::kEnd, false, false);
  EXPECT_EQ(mModel->DigitOffset(), mModel->ColumnOfDigit(0) - 7);
}

// While unsaved work is kept for a rescue, the digits typed in a window the grid moves away
// from stay in the copy of the segment, and only they change there.
TEST_F(SegmentGridModelTest, EditsLeftBehindByAMoveStayInTheRescueCopy) {
  QenSegmentPool::SetKeepCopies(true);
  mView.mLines = 9;
  Open("Grid/Rescue", 1000, 8);
  Place(0, 1);
  for (char c : std::string("a5")) ASSERT_EQ(mModel->Type(c, mList), 0);
  Place(900, 1);
  for (char c : std::string("3c")) ASSERT_EQ(mModel->Type(c, mList), 0);
  Place(500, 1);
  std::vector<QenSegmentDs::HeldText> texts;
  mModel->GetSegmentDs()->GetHeldTexts(texts);
  QenSegmentPool::SetKeepCopies(false);
  ASSERT_EQ(texts.size(), 1u);
  ASSERT_TRUE(texts[0].whole);
  const std::string& text = texts[0].text;
  const std::size_t body = text.find('\n') + 1;
  const auto line = [&](long v) { return text.substr(body + static_cast<std::size_t>(v) * 3, 2); };
  EXPECT_EQ(line(0), "a5");
  EXPECT_EQ(line(900), "3c");
  EXPECT_EQ(line(899) + line(901) + line(500), "000000");
}

TEST_F(SegmentGridModelTest, TypingSetsTheDigitMovesRightAndARefusalLeavesTheCursor) {
  Open("Grid/Type", 3, 6);
  Place(0, 1);
  for (char c : std::string("3F7")) ASSERT_EQ(mModel->Type(c, mList), 0) << mList.ToText();
  EXPECT_EQ(mModel->CursorVector(), 1);
  EXPECT_EQ(mModel->CursorDigit(), 0);
  // A hex digit over two traces keeps its low two bits.
  EXPECT_EQ(Row(0), "3f");
  EXPECT_EQ(Row(1), "30");
  EXPECT_NE(mModel->Type('X', mList), 0);
  EXPECT_TRUE(mList.HasKey("GUI_SEGMENTBUFFER_UNKNOWN_STATE_CODE"));
  EXPECT_EQ(mModel->CursorDigit(), 0);
  // The last digit of the last vector keeps the cursor.
  Place(2, 0);
  ASSERT_EQ(mModel->Type('1', mList), 0);
  EXPECT_EQ(mModel->CursorVector(), 2);
  EXPECT_EQ(mModel->CursorDigit(), 0);
  EXPECT_TRUE(mModel->IsDirty());
}

// Each command on a segment of 8 vectors of 8 traces, vector 2 holding "01" and the selection
// (when the row asks for one) vectors 2..3 over both digits. The row says what the command
// leaves; under another client's lock the command stays offered, is refused with -19 and
// leaves segment and selection as they were.
struct Edit {
  const char* name;
  bool select;
  std::function<bool(const SegmentGridModel&)> possible;
  std::function<int(SegmentGridModel&, ConditionList&)> run;
  long length, width;
  std::vector<std::string> rows;  // vectors 2, 3 and 4 afterwards
};

class SegmentGridEditTest : public SegmentGridModelTest, public testing::WithParamInterface<Edit> {};

TEST_P(SegmentGridEditTest, IsOfferedWhenItCanRunAndTheLockChangesNothing) {
  const Edit& e = GetParam();
  mView.mLines = 8;
  Open("Grid/Edit", 8, 8);
  Place(2, 0);
  ASSERT_EQ(mModel->Type('1', mList), 0);
  Place(2, 0);
  if (e.select) {
    ASSERT_EQ(mModel->SetSelection(2, 3, 0, 1, mList), 0);
  }
  mModel->SetFindText("01");
  mModel->SetTargetCoding("01X");
  ASSERT_EQ(mModel->GetSegmentDs()->Write(mList), 0) << mList.ToText();
  ASSERT_TRUE(e.possible(*mModel));

  // The model alone never knows of the lock before a command meets it.
  Lock(true);
  EXPECT_EQ(e.run(*mModel, mList), QenStatus::kLocked);
  EXPECT_TRUE(e.possible(*mModel));
  EXPECT_EQ(mModel->HasSelection(), e.select);
  Lock(false);
  EXPECT_EQ(std::vector<std::string>({Row(2), Row(3), Row(4)}), std::vector<std::string>({"01", "00", "00"}));
  Place(2, 0);
  if (e.select) {
    ASSERT_EQ(mModel->SetSelection(2, 3, 0, 1, mList), 0);
  }

  ConditionList list;
  ASSERT_EQ(e.run(*mModel, list), 0) << list.ToText();
  EXPECT_EQ(mModel->Length(), e.length);
  EXPECT_EQ(mModel->Width(), e.width);
  if (!e.rows.empty()) {
    EXPECT_EQ(std::vector<std::string>({Row(2), Row(3), Row(4)}), e.rows);
  }
}

const Edit kEdits[] = {
    {"Fill", true, &SegmentGridModel::IsFillPossible, &SegmentGridModel::ModifyFill, 8, 8, {"ff", "ff", "00"}},
    {"Invert", true, &SegmentGridModel::IsInvertPossible, &SegmentGridModel::ModifyInvert, 8, 8, {"fe", "ff", "00"}},
    {"MirrorVectors", true, &SegmentGridModel::IsMirrorPossible,
     [](SegmentGridModel& m, ConditionList& l) { return m.ModifyMirror(MirrorMode::kVector, l); }, 8, 8,
     {"00", "01", "00"}},
    {"InsertAfter", false, &SegmentGridModel::IsInsertPossible,
     [](SegmentGridModel& m, ConditionList& l) { return m.ModifyInsert(VectorTrace::kVector, InsertMode::kAfter, 2, l); },
     10, 8, {"01", "00", "00"}},
    {"InsertBefore", false, &SegmentGridModel::IsInsertPossible,
     [](SegmentGridModel& m, ConditionList& l) { return m.ModifyInsert(VectorTrace::kVector, InsertMode::kBefore, 1, l); },
     9, 8, {"00", "01", "00"}},
    {"DeleteVectors", true, &SegmentGridModel::IsDeletePossible, &SegmentGridModel::ModifyDelete, 6, 8,
     {"00", "00", "00"}},
    {"DeleteTraces", false, &SegmentGridModel::IsEditable, &SegmentGridModel::DeleteTraces, 8, 4, {"0", "0", "0"}},
    {"Serialize", false, &SegmentGridModel::IsSerializePossible,
     [](SegmentGridModel& m, ConditionList& l) { return m.ModifySerialize(Direction::kLsbFirst, l); }, 64, 1, {}},
    {"Coding", false, &SegmentGridModel::IsCodingPossible, &SegmentGridModel::ModifyCoding, 8, 8, {"01", "00", "00"}},
    {"CopyPaste", true, &SegmentGridModel::IsCopyPossible,
     [](SegmentGridModel& m, ConditionList& l) {
       Dstring text;
       if (int status = m.ModifyCopy(text, l)) return status;
       if (text.empty() || m.IsPastePossible() != true) return 1;
       if (int status = m.GoToVectorTrace(3, 0, l)) return status;
       return m.ModifyPaste(l);
     },
     8, 8, {"01", "01", "00"}},
    {"FindNext", false, &SegmentGridModel::IsFindPossible,
     [](SegmentGridModel& m, ConditionList& l) { return m.FindPattern(FindDirection::kNext, VectorTrace::kVector, l); }, 8,
     8, {"01", "00", "00"}},
};

INSTANTIATE_TEST_SUITE_P(Commands, SegmentGridEditTest, testing::ValuesIn(kEdits),
                         [](const testing::TestParamInfo<Edit>& info) { return std::string(info.param.name); });

// Each command is offered only where it can run: without a segment none; the ones on a
// selection only with one; deserialise only on one trace.
TEST_F(SegmentGridModelTest, CommandsAreOfferedOnlyWhereTheyCanRun) {
  using Offers = std::vector<bool>;
  const auto offers = [this] {
    const SegmentGridModel& m = *mModel;
    return Offers{m.IsFillPossible(), m.IsInvertPossible(), m.IsMirrorPossible(),     m.IsCopyPossible(),
                  m.IsPastePossible(), m.IsInsertPossible(), m.IsDeletePossible(),    m.IsSerializePossible(),
                  m.IsDeserializePossible(), m.IsCodingPossible(), m.IsFindPossible(), m.CanShowGoto()};
  };
  EXPECT_EQ(offers(), Offers(12, false));
  ConditionList list;
  EXPECT_EQ(mModel->ModifyFill(list) + mModel->ModifyDelete(list) + mModel->ModifySerialize(Direction::kMsbFirst, list), 0);
  EXPECT_TRUE(list.IsEmpty());

  Open("Grid/Offers", 2, 1);
  EXPECT_EQ(offers(), (Offers{true, true, false, true, false, true, false, false, true, true, false, true}));
  mModel->SetFindText("1");
  ASSERT_EQ(mModel->SetSelection(0, 1, 0, 0, mList), 0);
  EXPECT_EQ(offers(), (Offers{true, true, true, true, false, true, true, false, true, true, true, true}));
  // Deserialising takes traces that fit in the serial trace's states: two from state 0, not from 1.
  EXPECT_EQ(mModel->ModifyDeserialize(2, 1, mList), 1);
  EXPECT_EQ(mModel->Width(), 1);
  ASSERT_EQ(mModel->ModifyDeserialize(2, 0, mList), 0) << mList.ToText();
  EXPECT_EQ(mModel->Width(), 2);
  EXPECT_EQ(mModel->Length(), 1);
  EXPECT_EQ(offers(), (Offers{true, true, false, true, false, true, false, true, false, true, true, true}));
  // Every trace selected: a segment keeps one.
  ASSERT_EQ(mModel->SetSelection(0, 0, 0, 0, mList), 0);
  EXPECT_EQ(mModel->DeleteTraces(mList), 1);
  EXPECT_TRUE(mModel->HasSelection());
  EXPECT_EQ(mModel->Width(), 2);
}

// Another client's change reaches the model through the segment's views: the dimensions are
// read again and the owner told.
TEST_F(SegmentGridModelTest, AnotherEditorsChangeIsReadAndTold) {
  Open("Grid/Shared", 4, 8);
  SegmentGridModel second;
  ASSERT_EQ(second.HookOn("Grid/Shared", mList), 0) << mList.ToText();
  ASSERT_EQ(second.ModifyInsert(VectorTrace::kVector, InsertMode::kAfter, 3, mList), 0) << mList.ToText();
  EXPECT_EQ(mModel->Length(), 7);
  ASSERT_FALSE(mView.mChanges.empty());
  EXPECT_FALSE(mView.mChanges.back());
  ASSERT_EQ(second.Release(mList), 0);
}

}  // namespace
