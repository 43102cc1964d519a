#pragma once

#include <QWidget>
#include <memory>

#include "support/ConditionList.h"

class QLabel;
class SequenceFollower;
class QTableWidget;

namespace Ui {
class SeqeditSeqEdWin;
}

// The sequence editor ("seqedit.SeqEdWin"): the sequence as a whole, a line per block with its
// label, length, the loops it is in, its marks and its reactions, and the table of sequence
// events of a central module, whose names and numbers are edited here. From here the loop grid, the simple
// sequence editor and a block's event window open. It follows the sequence: another client's change shows
// within the poll.
class SeqeditSeqEdWin : public QWidget {
  Q_OBJECT

 public:
  explicit SeqeditSeqEdWin(QWidget* parent = nullptr);
  ~SeqeditSeqEdWin() override;

  int Load(ConditionList& list);
  QTableWidget* Table() const { return mTable; }
  QLabel* Summary() const { return mSummary; }
  // Takes the model again.
  void Fill();
  // The loops block `block` is in, the top level first ("L2 ×3 2–4").
  static QString LoopsOf(unsigned long block);
  QTableWidget* EventTable() const { return mEvents; }
  // A typed name (column 0) or number (column 1) of event `index` goes to the instrument.
  int SetEventField(int index, int column, const QString& text);

 private:
  void FillEvents();
  unsigned long CurrentBlock() const;

  QLabel* mSummary = nullptr;
  QTableWidget* mTable = nullptr;
  QLabel* mEventsLabel = nullptr;
  QTableWidget* mEvents = nullptr;
  bool mFillingEvents = false;
  std::unique_ptr<SequenceFollower> mFollower;
  std::unique_ptr<Ui::SeqeditSeqEdWin> mUi;
};
