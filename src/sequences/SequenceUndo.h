#pragma once

#include <cstddef>
#include <functional>
#include <vector>

#include "sequences/SequenceChangeObserver.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

class CSequence;

// The steps back and forward of a sequence editor. A step is the sequence text the instrument
// held before an edit; taking it back writes that text whole and reads it back, and the text it
// replaces becomes the step forward. Any report of the sequence that is not of an edit run here
// (another client's change, another window's edit) forgets every step: undoing would undo that
// change too. Each editor window keeps its own.
class SequenceUndo : public SequenceChangeObserver {
 public:
  static constexpr std::size_t kMaxSteps = 50;

  explicit SequenceUndo(CSequence& sequence, std::size_t maxSteps = kMaxSteps);
  ~SequenceUndo() override;
  SequenceUndo(const SequenceUndo&) = delete;
  SequenceUndo& operator=(const SequenceUndo&) = delete;

  // Runs an edit of the sequence; when the instrument's text changed, the text before becomes
  // a step back and the steps forward are dropped. The edit's status is returned.
  int Run(const std::function<int(ConditionList&)>& edit, ConditionList& cond);
  int Undo(ConditionList& cond);
  int Redo(ConditionList& cond);
  bool CanUndo() const { return !mUndo.empty(); }
  bool CanRedo() const { return !mRedo.empty(); }
  void Forget();
  // Whether an edit or a step of this is being written: its reports are its own.
  bool IsEditing() const { return mEditing; }

  int NfyChanged(ConditionList& cond) override;

 private:
  int Step(std::vector<Dstring>& from, std::vector<Dstring>& to, ConditionList& cond);

  CSequence& mSequence;
  std::size_t mMaxSteps;
  std::vector<Dstring> mUndo;
  std::vector<Dstring> mRedo;
  bool mEditing = false;
};
