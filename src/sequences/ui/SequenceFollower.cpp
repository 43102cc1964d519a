#include "sequences/ui/SequenceFollower.h"

#include <QTimer>

#include "sequences/CSequence.h"

SequenceFollower::SequenceFollower(QObject* context, std::function<void()> refresh)
    : mContext(context), mRefresh(std::move(refresh)) {}

SequenceFollower::~SequenceFollower() {
  Follow(nullptr);
}

void SequenceFollower::Follow(CSequence* sequence) {
  if (mSequence != nullptr) mSequence->RemoveObserver(this);
  mSequence = sequence;
  if (mSequence != nullptr) mSequence->AddObserver(this);
}

int SequenceFollower::NfyChanged(ConditionList&) {
  if (mStale) return 0;
  mStale = true;
  QTimer::singleShot(0, mContext, [this] {
    if (!mStale) return;
    mStale = false;
    mRefresh();
  });
  return 0;
}
