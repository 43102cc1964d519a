#pragma once

#include <QWidget>
#include <memory>

#include "support/ConditionList.h"

class QLabel;
class ErrStateGridManager;

namespace Ui {
class ErrStateWin;
}

// The error state window ("errstate.ErrStateWin"): the error state grid of every analyser port
// and channel, the state of the run, what the cursor is on, and a reset of the counts. It is a
// view of the application's BerSvr and asks it for the channels while it is open, so the poll
// that reads the error rates while the instrument runs brings the channels in the same frame.
class ErrstateErrStateWin : public QWidget {
  Q_OBJECT

 public:
  explicit ErrstateErrStateWin(QWidget* parent = nullptr);
  ~ErrstateErrStateWin() override;

  int Load(ConditionList& list);
  ErrStateGridManager* Grid() const { return mGrid; }
  // Shows the service's counts and the state of the run.
  void ShowResults();

 private:
  class View;

  void HitPButReset();
  void ShowCursor();

  ErrStateGridManager* mGrid = nullptr;
  QLabel* mState = nullptr;
  QLabel* mCursor = nullptr;
  bool mWantsChannels = false;
  std::unique_ptr<View> mView;
  std::unique_ptr<Ui::ErrStateWin> mUi;
};
