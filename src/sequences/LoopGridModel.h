#pragma once

#include <functional>
#include <memory>

#include "support/ConditionList.h"
#include "support/Dstring.h"
#include "toolkit/GridKey.h"

class CSequence;
class SequenceUndo;

// What the loop grid edits, without a widget: a line per block of the sequence and, across it,
// its fields: a lane per loop level (the top level first), the label, the length and a field
// per port. The cursor is a block and a field; a selection is the run of blocks between the
// anchor and the cursor, which a new loop covers. Every command is one edit of the sequence,
// written to the instrument and read back, and can be taken back (SequenceUndo); refused or
// not, the model holds what the instrument holds afterwards.
class LoopGridModel {
 public:
  // `far` (Ctrl) takes Home and End to the first and last block.
  using Key = GridKey;

  LoopGridModel();
  ~LoopGridModel();
  LoopGridModel(const LoopGridModel&) = delete;
  LoopGridModel& operator=(const LoopGridModel&) = delete;

  // Edits this sequence (not owned; it must outlive the model or be set to null first).
  void SetSequence(CSequence* sequence);
  CSequence* GetSequence() const { return mSequence; }
  SequenceUndo* Steps() const { return mUndo.get(); }
  // Takes the sequence's shape again (levels, ports, blocks) and keeps the cursor inside it.
  void Sync();
  // The largest count a loop may have on the instrument; 0 when not known.
  void SetLargestCount(unsigned long largest) { mLargestCount = largest; }

  long Lines() const;
  unsigned long Levels() const { return mLevels; }
  unsigned long Ports() const { return mPorts; }
  int NumFields() const { return static_cast<int>(mLevels + 2 + mPorts); }
  int LabelField() const { return static_cast<int>(mLevels); }
  int LengthField() const { return static_cast<int>(mLevels) + 1; }
  int LaneField(unsigned long level) const { return static_cast<int>(mLevels - level); }
  int PortField(unsigned long port) const { return static_cast<int>(mLevels + 1 + port); }
  // The level of a lane field, the port of a port field; 0 for other fields.
  unsigned long LevelOf(int field) const;
  unsigned long PortOf(int field) const;

  // The cursor's block counts from 1; 0 without a sequence.
  unsigned long CursorBlock() const { return mSequence == nullptr ? 0 : static_cast<unsigned long>(mRow) + 1; }
  long CursorRow() const { return mRow; }
  int CursorField() const { return mField; }
  unsigned long FirstSelected() const;
  unsigned long LastSelected() const;
  // Whether the block is in a selected run of more than one block.
  bool IsSelected(unsigned long block) const;
  // Moves the cursor to a block and field, inside the sequence; `extend` keeps the anchor.
  void SetCursor(unsigned long block, int field, bool extend = false);
  // A page moves one line less than `linesShown`.
  void PressKey(Key key, bool extend, bool far, long linesShown);

  // The text of a cell as shown and edited: a label, a length, a count ("INF" for endless;
  // empty off a loop), a segment.
  Dstring CellText(unsigned long block, int field) const;
  // The marks of a block: M measurement start, S sync, T trigger, R reactions.
  static Dstring MarksOf(const CSequence& sequence, unsigned long block);
  // The segment a port of a block plays by name; empty for a built-in kind.
  Dstring NamedSegment(unsigned long block, unsigned long port) const;

  int InsertBlocks(bool before, long count, ConditionList& list);
  // One block before or after the cursor's; the cursor goes to it.
  int InsertBlock(bool before, ConditionList& list);
  int DeleteBlock(ConditionList& list);
  // Moves the cursor's block; a move past either end does nothing.
  int MoveBlock(long distance, ConditionList& list);
  int CutBlock(ConditionList& list);
  int CopyBlock(ConditionList& list);
  bool IsPastePossible() const;
  // After the cursor's block; the cursor goes to the pasted one.
  int PasteBlock(ConditionList& list);
  // A loop over the selected blocks: on the cursor's lane, or on the lowest level that fits.
  int AddLoop(ConditionList& list);
  // The loop of the cursor's lane, or the innermost loop of the cursor's block.
  int RemoveLoop(ConditionList& list);
  int SetCellText(unsigned long block, int field, const Dstring& text, ConditionList& list);
  int Undo(ConditionList& list);
  int Redo(ConditionList& list);

 private:
  // An edit through the steps; the model follows what the instrument holds afterwards.
  int Apply(const std::function<int(ConditionList&)>& edit, ConditionList& list);
  int Step(bool back, ConditionList& list);

  CSequence* mSequence = nullptr;
  std::unique_ptr<SequenceUndo> mUndo;
  unsigned long mLargestCount = 0;
  unsigned long mLevels = 0;
  unsigned long mPorts = 0;
  long mRow = 0;
  long mAnchor = 0;
  int mField = 0;
};
