#include "sequences/SequenceUndo.h"

#include "sequences/CSequence.h"

SequenceUndo::SequenceUndo(CSequence& sequence, std::size_t maxSteps)
    : mSequence(sequence), mMaxSteps(maxSteps) {
  mSequence.AddObserver(this);
}

SequenceUndo::~SequenceUndo() {
  mSequence.RemoveObserver(this);
}

int SequenceUndo::Run(const std::function<int(ConditionList&)>& edit, ConditionList& cond) {
  const Dstring before = mSequence.GetLastExpression();
  mEditing = true;
  const int status = edit(cond);
  mEditing = false;
  // Before the first read there is nothing known to go back to.
  if (status == 0 && !before.empty() && mSequence.GetLastExpression() != before) {
    mUndo.push_back(before);
    if (mUndo.size() > mMaxSteps) mUndo.erase(mUndo.begin());
    mRedo.clear();
  }
  return status;
}

int SequenceUndo::Undo(ConditionList& cond) {
  return Step(mUndo, mRedo, cond);
}
int SequenceUndo::Redo(ConditionList& cond) {
  return Step(mRedo, mUndo, cond);
}

int SequenceUndo::Step(std::vector<Dstring>& from, std::vector<Dstring>& to, ConditionList& cond) {
  if (from.empty()) return 0;
  const Dstring now = mSequence.GetLastExpression();
  mEditing = true;
  int status = mSequence.fromExpression(from.back(), cond);
  if (status == 0) status = mSequence.WriteSequence(cond);
  mEditing = false;
  if (status != 0) {
    // Refused before anything was sent (another client's lock): the model shows the
    // instrument's text again, and the step stays for another try.
    ConditionList ignored;
    if (mSequence.GetLastExpression() == now && !now.empty()) mSequence.fromExpression(now, ignored);
    return status;
  }
  if (mSequence.GetLastExpression() == now) return 0;
  from.pop_back();
  to.push_back(now);
  return 0;
}

void SequenceUndo::Forget() {
  mUndo.clear();
  mRedo.clear();
}

int SequenceUndo::NfyChanged(ConditionList&) {
  if (!mEditing) Forget();
  return 0;
}
