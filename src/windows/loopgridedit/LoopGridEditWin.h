#pragma once

#include <QWidget>
#include <memory>

#include "support/ConditionList.h"

class CSequence;
class LoopGridManager;
class QLabel;
class QListWidget;
class SegmentCatalogFollower;
class SequenceFollower;

namespace Ui {
class LoopGridEditWin;
}

// The loop grid editor ("LoopGridEdit.Win"): the loop grid of the one sequence, the list of the
// instrument's segments to drag onto a port's cell, and the run controls the Instrument menu
// has. The state line says how many blocks and loop levels there are and what the marks mean.
// A cell's segment opens in the segment editor, a block's reactions in its event window: one
// window per segment and port, one per block, raised when asked for again.
class LoopGridEditWin : public QWidget {
  Q_OBJECT

 public:
  explicit LoopGridEditWin(QWidget* parent = nullptr);
  ~LoopGridEditWin() override;

  int Load(ConditionList& list);
  // The sequence the editor works on: the application's one model.
  static CSequence* GetSequence();
  LoopGridManager* Grid() const { return mGrid; }
  QListWidget* Segments() const { return mSegments; }
  // Reads the instrument's catalogue of segments into the list and the grid (which marks a
  // port naming a segment the instrument does not have); the list follows it within a poll.
  int FillSegments(ConditionList& list);

 private:
  void ShowState();
  void RunAction(int (*action)(ConditionList&));
  void HitPButOpenSegment(unsigned long block, unsigned long port);
  void HitPButEvents(unsigned long block);
  void HitSegmentDoubleClicked();
  void ShowSegments();

  LoopGridManager* mGrid = nullptr;
  QListWidget* mSegments = nullptr;
  QLabel* mState = nullptr;
  std::unique_ptr<SequenceFollower> mFollower;
  std::unique_ptr<SegmentCatalogFollower> mCatalog;
  std::unique_ptr<Ui::LoopGridEditWin> mUi;
};
