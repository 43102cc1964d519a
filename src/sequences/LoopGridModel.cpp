#include "sequences/LoopGridModel.h"

#include <algorithm>

#include "sequences/CSequence.h"
#include "sequences/CSequenceBlock.h"
#include "sequences/SequenceCellEdit.h"
#include "sequences/SequenceLoopRules.h"
#include "sequences/SequenceUndo.h"

LoopGridModel::LoopGridModel() = default;

LoopGridModel::~LoopGridModel() = default;

void LoopGridModel::SetSequence(CSequence* sequence) {
  mUndo.reset();
  mSequence = sequence;
  mField = static_cast<int>(sequence == nullptr ? 0 : CSequence::GetNumLoopLevels());
  if (mSequence != nullptr) mUndo = std::make_unique<SequenceUndo>(*mSequence);
  Sync();
}

void LoopGridModel::Sync() {
  mPorts = mSequence == nullptr ? 0 : mSequence->GetNumPorts();
  mLevels = mSequence == nullptr ? 0 : CSequence::GetNumLoopLevels();
  const long last = std::max(0L, Lines() - 1);
  mRow = std::clamp(mRow, 0L, last);
  mAnchor = std::clamp(mAnchor, 0L, last);
  mField = std::clamp(mField, 0, std::max(0, NumFields() - 1));
}

long LoopGridModel::Lines() const { return mSequence == nullptr ? 0 : static_cast<long>(mSequence->GetNumBlocks()); }

unsigned long LoopGridModel::LevelOf(int field) const {
  return field >= 0 && field < LabelField() ? mLevels - static_cast<unsigned long>(field) : 0;
}

unsigned long LoopGridModel::PortOf(int field) const {
  return field > LengthField() && field < NumFields() ? static_cast<unsigned long>(field - LengthField()) : 0;
}

unsigned long LoopGridModel::FirstSelected() const { return static_cast<unsigned long>(std::min(mRow, mAnchor)) + 1; }
unsigned long LoopGridModel::LastSelected() const { return static_cast<unsigned long>(std::max(mRow, mAnchor)) + 1; }

bool LoopGridModel::IsSelected(unsigned long block) const {
  return mRow != mAnchor && block >= FirstSelected() && block <= LastSelected();
}

void LoopGridModel::SetCursor(unsigned long block, int field, bool extend) {
  const long lines = Lines();
  if (lines == 0) return;
  mRow = std::clamp(static_cast<long>(block) - 1, 0L, lines - 1);
  mField = std::clamp(field, 0, NumFields() - 1);
  if (!extend) mAnchor = mRow;
}

void LoopGridModel::PressKey(Key key, bool extend, bool far, long linesShown) {
  const long page = std::max(1L, linesShown - 1);
  const long row = mRow + 1;
  switch (key) {
    case Key::kUp: return SetCursor(static_cast<unsigned long>(std::max(1L, row - 1)), mField, extend);
    case Key::kDown: return SetCursor(static_cast<unsigned long>(row + 1), mField, extend);
    case Key::kLeft: return SetCursor(static_cast<unsigned long>(row), std::max(0, mField - 1), extend);
    case Key::kRight: return SetCursor(static_cast<unsigned long>(row), mField + 1, extend);
    case Key::kPageUp: return SetCursor(static_cast<unsigned long>(std::max(1L, row - page)), mField, extend);
    case Key::kPageDown: return SetCursor(static_cast<unsigned long>(row + page), mField, extend);
    case Key::kHome: return SetCursor(far ? 1 : static_cast<unsigned long>(row), far ? mField : LabelField(), extend);
    case Key::kEnd:
      return SetCursor(static_cast<unsigned long>(far ? Lines() : row), far ? mField : NumFields() - 1, extend);
  }
}

Dstring LoopGridModel::CellText(unsigned long block, int field) const {
  if (mSequence == nullptr || block < 1 || block > mSequence->GetNumBlocks()) return {};
  if (field == LabelField()) return mSequence->GetLabel(block);
  if (field == LengthField()) return Dstring::Format("%lu", mSequence->GetBlockLength(block));
  if (const unsigned long port = PortOf(field)) return mSequence->GetSegment(block, port);
  if (const unsigned long level = LevelOf(field)) {
    if (mSequence->GetLoopStatus(block, level) == CSequence::LOOP_NONE) return {};
    const unsigned long iterations = mSequence->GetNumIterations(block, level);
    return iterations == 0 ? Dstring("INF") : Dstring::Format("%lu", iterations);
  }
  return {};
}

Dstring LoopGridModel::MarksOf(const CSequence& sequence, unsigned long block) {
  Dstring marks;
  const auto add = [&marks](const Dstring& mark) { marks += (marks.empty() ? "" : " ") + mark; };
  if (sequence.GetBlockMeasurementStart(block) != 0) add("M");
  if (sequence.GetBlockSync(block) != 0) add("S");
  if (sequence.GetBlockTrigger(block) != 0) add(Dstring::Format("T%lu", sequence.GetBlockTrigger(block)));
  if (const unsigned long n = sequence.GetBlockNumBranches(block)) add(Dstring::Format("R%lu", n));
  return marks;
}

Dstring LoopGridModel::NamedSegment(unsigned long block, unsigned long port) const {
  const bool named = mSequence != nullptr && port != 0 && block >= 1 && block <= mSequence->GetNumBlocks() &&
                     mSequence->GetType(block, port) == CSequence::SEG_NAMED;
  return named ? mSequence->GetSegment(block, port) : Dstring();
}

int LoopGridModel::Apply(const std::function<int(ConditionList&)>& edit, ConditionList& list) {
  if (mSequence == nullptr || mUndo == nullptr) return 0;
  const int status = mUndo->Run(edit, list);
  Sync();
  return status;
}

int LoopGridModel::InsertBlocks(bool before, long count, ConditionList& list) {
  const unsigned long block = CursorBlock();
  return Apply(
      [&](ConditionList& l) {
        for (long n = 0; n < count; ++n) {
          const int status = before ? mSequence->AddBlockBefore(block, l) : mSequence->AddBlockAfter(block, l);
          if (status != 0) return status;
        }
        return 0;
      },
      list);
}

int LoopGridModel::InsertBlock(bool before, ConditionList& list) {
  const unsigned long block = CursorBlock();
  const int status = InsertBlocks(before, 1, list);
  if (status == 0) SetCursor(before ? block : block + 1, mField);
  return status;
}

int LoopGridModel::DeleteBlock(ConditionList& list) {
  const unsigned long block = CursorBlock();
  return Apply([&](ConditionList& l) { return mSequence->DeleteBlock(block, l); }, list);
}

int LoopGridModel::MoveBlock(long distance, ConditionList& list) {
  const unsigned long block = CursorBlock();
  const long target = static_cast<long>(block) + distance;
  if (mSequence == nullptr || target < 1 || target > Lines()) return 0;
  const int status = Apply([&](ConditionList& l) { return mSequence->MoveBlock(block, distance, l); }, list);
  if (status == 0) SetCursor(static_cast<unsigned long>(target), mField);
  return status;
}

int LoopGridModel::CutBlock(ConditionList& list) {
  const unsigned long block = CursorBlock();
  return Apply([&](ConditionList& l) { return mSequence->CutBlock(block, l); }, list);
}

int LoopGridModel::CopyBlock(ConditionList& list) {
  return mSequence == nullptr ? 0 : mSequence->CopyBlock(CursorBlock(), list);
}

bool LoopGridModel::IsPastePossible() const { return mSequence != nullptr && CSequence::IsPasteBlockPossible(); }

int LoopGridModel::PasteBlock(ConditionList& list) {
  const unsigned long block = CursorBlock();
  const int status = Apply([&](ConditionList& l) { return mSequence->PasteBlockAfter(block, l); }, list);
  if (status == 0) SetCursor(block + 1, mField);
  return status;
}

int LoopGridModel::AddLoop(ConditionList& list) {
  const unsigned long first = FirstSelected();
  const unsigned long last = LastSelected();
  return Apply(
      [&](ConditionList& l) {
        unsigned long level = LevelOf(mField);
        if (level != 0) {
          if (int status = SequenceLoopRules::Check(*mSequence, first, last, level, l)) return status;
        } else if ((level = SequenceLoopRules::FreeLevel(*mSequence, first, last, l)) == 0) {
          return CSequence::kStatusError;
        }
        // A new loop runs twice until told otherwise; the top level runs for ever.
        return mSequence->SetLoop(first, level, l, last - first + 1, 2, 0, Dstring());
      },
      list);
}

int LoopGridModel::RemoveLoop(ConditionList& list) {
  if (mSequence == nullptr) return 0;
  const unsigned long block = CursorBlock();
  unsigned long level = LevelOf(mField);
  for (unsigned long l = 1; level == 0 && l <= mLevels; ++l) {
    if (mSequence->GetLoopStatus(block, l) != CSequence::LOOP_NONE) level = l;
  }
  if (level == 0 || mSequence->GetLoopStatus(block, level) == CSequence::LOOP_NONE) return 0;
  return Apply([&](ConditionList& l) { return mSequence->DeleteLoop(block, level, l); }, list);
}

int LoopGridModel::SetCellText(unsigned long block, int field, const Dstring& text, ConditionList& list) {
  return Apply(
      [&](ConditionList& l) -> int {
        if (field == LabelField()) return mSequence->SetLabel(block, text, l);
        if (field == LengthField()) return SequenceCellEdit::SetLength(*mSequence, block, text, l);
        if (const unsigned long level = LevelOf(field)) {
          return SequenceLoopRules::SetCount(*mSequence, block, level, text, mLargestCount, l);
        }
        const unsigned long port = PortOf(field);
        return port == 0 ? 0 : SequenceCellEdit::SetSegment(*mSequence, block, port, text, l);
      },
      list);
}

int LoopGridModel::Undo(ConditionList& list) { return Step(true, list); }
int LoopGridModel::Redo(ConditionList& list) { return Step(false, list); }

int LoopGridModel::Step(bool back, ConditionList& list) {
  if (mUndo == nullptr) return 0;
  const int status = back ? mUndo->Undo(list) : mUndo->Redo(list);
  Sync();
  return status;
}
