#pragma once

#include <QWidget>
#include <functional>
#include <memory>
#include <vector>

#include "support/ConditionList.h"
#include "support/Dstring.h"

class CSequence;
class SegmentCatalogFollower;
class SequenceFollower;
class SequenceUndo;
class QLabel;
class QPushButton;
class QTableView;

namespace Ui {
class SmseqeditWin;
}
class SequenceBlockModel;

// The simple sequence editor ("smseqedit.Win"): the sequence as one list of blocks, a line each
// with its label, its length and the segment of every port. Each change is an edit of the one
// sequence model, written to the instrument and read back; a refusal is shown and the table
// shows what the instrument holds. A change by another client reaches the table through the
// model's reports. A sequence with loops is shown but not changed here. A port naming a segment
// the instrument does not have (the catalogue, followed within a poll) is drawn in red.
class SmseqeditWin : public QWidget {
  Q_OBJECT

 public:
  explicit SmseqeditWin(QWidget* parent = nullptr);
  ~SmseqeditWin() override;

  int Load(ConditionList& list);
  static CSequence* GetSequence();
  QTableView* Table() const { return mTable; }
  SequenceBlockModel* Model() const { return mModel; }
  // The block of the current line, 1 the first; 0 with no line.
  unsigned long CurrentBlock() const;
  // The segment named in the current cell; empty for a word (PAUSE …) or another column.
  Dstring CurrentSegment() const;
  // Shows the state, the buttons and the current cell as the sequence now is; the table
  // follows the model's reports itself.
  void Rebuild();

  // Takes back the last step of this window (Ctrl+Z), or does it again (Ctrl+Shift+Z). Steps
  // are forgotten when another client changes the sequence.
  int Undo(ConditionList& list);
  int Redo(ConditionList& list);
  bool CanUndo() const;

 private:
  // Runs a command (a button's, a typed cell's) as one step of this window; a refusal is shown.
  int Run(const std::function<int(ConditionList&)>& command);
  bool IsEditable() const;
  // The buttons' commands on the current block.
  int AddBlock(ConditionList& list);
  int DeleteBlock(ConditionList& list);
  int MoveBlock(long distance, ConditionList& list);
  void AddBlockActions();
  // Makes `row` (from 0) the current line, in the current column.
  void SetCurrentRow(int row);
  void HitPButOpenSegment();

  QTableView* mTable = nullptr;
  SequenceBlockModel* mModel = nullptr;
  QLabel* mState = nullptr;
  QPushButton* mOpenSegment = nullptr;
  std::unique_ptr<SequenceFollower> mFollower;
  std::unique_ptr<Ui::SmseqeditWin> mUi;
  std::unique_ptr<SequenceUndo> mUndo;
  std::unique_ptr<SegmentCatalogFollower> mCatalog;
  // The current cell last seen, restored when the model is reset.
  int mLastRow = 0;
  int mLastColumn = 0;
};
