#pragma once

#include <QWidget>
#include <functional>
#include <memory>

#include "support/ConditionList.h"

class CSequence;
class QCheckBox;
class QLabel;
class SequenceFollower;
class QPushButton;
class QSpinBox;
class QTableView;

namespace Ui {
class SeqeditEventWin;
}
class BlockReactionModel;

// The event window of one block ("seqedit.EventWin"): the block's reactions (if, go to label,
// trigger, VXI trigger: what the sequencer does when an event comes while the block plays), its
// sync mark, its measurement start and its trigger. Each change is an edit of the sequence
// model, written and read back; a refusal is shown and the window shows what the instrument
// holds. It follows the sequence; a block that is gone is said so.
class SeqeditEventWin : public QWidget {
  Q_OBJECT

 public:
  explicit SeqeditEventWin(QWidget* parent = nullptr);
  ~SeqeditEventWin() override;

  int Load(ConditionList& list);
  // Shows block `block` (from 1).
  void ShowBlock(unsigned long block);
  unsigned long Block() const { return mBlock; }
  QTableView* Table() const { return mTable; }
  BlockReactionModel* Model() const { return mModel; }
  // Shows the block's label, marks and state as the sequence now is; the table follows the
  // model's reports itself.
  void Fill();
  // The edits the window's controls make, on its block.
  int NewReaction();
  int DeleteReaction(unsigned long n);
  int SetSync(bool sync);

 private:
  int Run(const std::function<int(CSequence&, ConditionList&)>& edit);

  QLabel* mBlockLabel = nullptr;
  QLabel* mState = nullptr;
  QCheckBox* mSync = nullptr;
  QCheckBox* mMeasure = nullptr;
  QSpinBox* mTrigger = nullptr;
  QTableView* mTable = nullptr;
  BlockReactionModel* mModel = nullptr;
  QPushButton* mNew = nullptr;
  QPushButton* mDelete = nullptr;
  std::unique_ptr<SequenceFollower> mFollower;
  std::unique_ptr<Ui::SeqeditEventWin> mUi;
  unsigned long mBlock = 1;
  bool mFilling = false;
  // The current cell last seen, restored when the model is reset.
  int mLastRow = 0;
  int mLastColumn = 0;
};
