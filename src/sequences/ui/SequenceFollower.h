#pragma once

#include <functional>

#include "sequences/SequenceChangeObserver.h"

class CSequence;
class QObject;

// Keeps a window in step with the sequence: a read may report many changes, and the window is
// refreshed once, after the event that read. The refresh is bound to `context` and ends with it.
class SequenceFollower : public SequenceChangeObserver {
 public:
  SequenceFollower(QObject* context, std::function<void()> refresh);
  ~SequenceFollower() override;
  SequenceFollower(const SequenceFollower&) = delete;
  SequenceFollower& operator=(const SequenceFollower&) = delete;

  // Follows this sequence (not owned); null follows none.
  void Follow(CSequence* sequence);
  CSequence* GetSequence() const { return mSequence; }
  // The window is about to show the model itself: a refresh that is due is not needed.
  void Refreshed() { mStale = false; }
  bool IsStale() const { return mStale; }

  int NfyChanged(ConditionList& cond) override;

 private:
  QObject* mContext;
  std::function<void()> mRefresh;
  CSequence* mSequence = nullptr;
  bool mStale = false;
};
