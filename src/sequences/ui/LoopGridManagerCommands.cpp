// The loop grid's commands: each is one edit of the sequence, run through the grid's steps.
#include "params/ui/BoundControl.h"
#include "sequences/CSequence.h"
#include "sequences/CSequenceBlock.h"
#include "sequences/SequenceCellEdit.h"
#include "sequences/SequenceLoopRules.h"
#include "sequences/SequenceUndo.h"
#include "sequences/ui/LoopGridManager.h"

// --- Commands ----------------------------------------------------------------------------------

int LoopGridManager::Apply(const std::function<int(ConditionList&)>& edit, ConditionList& list) {
  if (mSequence == nullptr || mUndo == nullptr) return 0;
  const int status = mUndo->Run(edit, list);
  // Refused or not, the grid shows what the instrument holds now.
  Sync();
  return status;
}

int LoopGridManager::Run(const std::function<int(ConditionList&)>& edit) {
  ConditionList list;
  const int status = Apply(edit, list);
  BoundControl::Report(list);
  return status;
}

int LoopGridManager::Reported(int (LoopGridManager::*modify)(ConditionList&)) {
  ConditionList list;
  const int status = (this->*modify)(list);
  BoundControl::Report(list);
  return status;
}

// The editing commands a pattern-editor window asks the grid with the focus for: whole blocks.
int LoopGridManager::ModifyCopy(ConditionList& list) {
  return mSequence == nullptr ? 0 : mSequence->CopyBlock(CursorBlock(), list);
}

int LoopGridManager::ModifyPaste(ConditionList& list) {
  const unsigned long block = CursorBlock();
  return Apply([&](ConditionList& l) { return mSequence->PasteBlockAfter(block, l); }, list);
}

int LoopGridManager::ModifyInsert(VectorTrace, InsertMode mode, long count, ConditionList& list) {
  const unsigned long block = CursorBlock();
  return Apply(
      [&](ConditionList& l) {
        for (long n = 0; n < count; ++n) {
          const int status = mode == InsertMode::kBefore ? mSequence->AddBlockBefore(block, l)
                                                         : mSequence->AddBlockAfter(block, l);
          if (status != 0) return status;
        }
        return 0;
      },
      list);
}

int LoopGridManager::ModifyDelete(ConditionList& list) {
  const unsigned long block = CursorBlock();
  return Apply([&](ConditionList& l) { return mSequence->DeleteBlock(block, l); }, list);
}

int LoopGridManager::InsertBlock(bool before) {
  const unsigned long block = CursorBlock();
  const int status = Run([&](ConditionList& l) {
    return before ? mSequence->AddBlockBefore(block, l) : mSequence->AddBlockAfter(block, l);
  });
  if (status == 0) SetCursor(before ? block : block + 1, mField);
  return status;
}

int LoopGridManager::DeleteBlock() {
  return Reported(&LoopGridManager::ModifyDelete);
}

int LoopGridManager::MoveBlock(long distance) {
  const unsigned long block = CursorBlock();
  const long target = static_cast<long>(block) + distance;
  if (target < 1 || target > DispLineCount()) return 0;
  const int status = Run([&](ConditionList& l) { return mSequence->MoveBlock(block, distance, l); });
  if (status == 0) SetCursor(static_cast<unsigned long>(target), mField);
  return status;
}

int LoopGridManager::CutBlock() {
  const unsigned long block = CursorBlock();
  return Run([&](ConditionList& l) { return mSequence->CutBlock(block, l); });
}

int LoopGridManager::CopyBlock() {
  return Reported(&LoopGridManager::ModifyCopy);
}

bool LoopGridManager::IsPastePossible() {
  return mSequence != nullptr && CSequence::IsPasteBlockPossible();
}

int LoopGridManager::PasteBlock() {
  const unsigned long block = CursorBlock();
  const int status = Reported(&LoopGridManager::ModifyPaste);
  if (status == 0) SetCursor(block + 1, mField);
  return status;
}

int LoopGridManager::AddLoop() {
  const unsigned long first = FirstSelected();
  const unsigned long last = LastSelected();
  return Run([&](ConditionList& l) {
    unsigned long level = LevelOf(mField);
    if (level != 0) {
      if (int status = SequenceLoopRules::Check(*mSequence, first, last, level, l)) return status;
    } else if ((level = SequenceLoopRules::FreeLevel(*mSequence, first, last, l)) == 0) {
      return CSequence::kStatusError;
    }
    // A new loop runs twice until told otherwise; the top level runs for ever.
    return mSequence->SetLoop(first, level, l, last - first + 1, 2, 0, Dstring());
  });
}

int LoopGridManager::RemoveLoop() {
  const unsigned long block = CursorBlock();
  unsigned long level = LevelOf(mField);
  for (unsigned long l = 1; level == 0 && l <= mLevels; ++l) {
    if (mSequence->GetLoopStatus(block, l) != CSequence::LOOP_NONE) level = l;
  }
  if (level == 0 || mSequence->GetLoopStatus(block, level) == CSequence::LOOP_NONE) return 0;
  return Run([&](ConditionList& l) { return mSequence->DeleteLoop(block, level, l); });
}

int LoopGridManager::Undo() {
  return Step(true);
}
int LoopGridManager::Redo() {
  return Step(false);
}

int LoopGridManager::Step(bool back) {
  if (mUndo == nullptr) return 0;
  ConditionList list;
  const int status = back ? mUndo->Undo(list) : mUndo->Redo(list);
  Sync();
  BoundControl::Report(list);
  return status;
}

int LoopGridManager::SetCellText(unsigned long block, int field, const QString& text) {
  return Run([&](ConditionList& l) -> int {
    const Dstring typed = text.trimmed().toStdString();
    if (field == LabelField()) return mSequence->SetLabel(block, typed, l);
    if (field == LengthField()) return SequenceCellEdit::SetLength(*mSequence, block, typed, l);
    if (const unsigned long level = LevelOf(field)) {
      return SequenceLoopRules::SetCount(*mSequence, block, level, typed, mLargestCount, l);
    }
    const unsigned long port = PortOf(field);
    return port == 0 ? 0 : SequenceCellEdit::SetSegment(*mSequence, block, port, typed, l);
  });
}

int LoopGridManager::GetSegmentName(long row, long column, Dstring& name, ConditionList&) {
  const auto block = static_cast<unsigned long>(row) + 1;
  const unsigned long port = PortOf(static_cast<int>(column));
  name = mSequence != nullptr && port != 0 && mSequence->GetType(block, port) == CSequence::SEG_NAMED
             ? mSequence->GetSegment(block, port)
             : Dstring();
  return 0;
}
