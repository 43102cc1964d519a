#pragma once

#include <cstddef>

#include "sequences/SequenceTypes.h"
#include "support/Dstring.h"
#include "support/NodeArena.h"

class CSequence;

// One loop: it repeats the blocks start .. start + length - 1, which all point at it on its
// level (1 = innermost). Owned by the sequence's loop list; blocks only point at it.
class SequenceTypes::CLoop {
 public:
  CLoop(CSequence* owner, unsigned long start, unsigned long length)
      : mOwner(owner), mStart(start), mLength(length) {}
  virtual ~CLoop() = default;
  CLoop(const CLoop&) = default;
  CLoop& operator=(const CLoop&) = default;

  // Made and dropped with the blocks at every read, and kept beside them.
  static void* operator new(std::size_t size) {
    return NodeArena::Allocate(NodeArena::Stream::Records, size);
  }
  static void operator delete(void* loop, std::size_t size) noexcept { NodeArena::Free(loop, size); }

  CSequence* GetSequence() const { return mOwner; }
  unsigned long GetStart() const { return mStart; }
  void SetStart(unsigned long start) { mStart = start; }
  unsigned long GetLength() const { return mLength; }
  void SetLength(unsigned long length) { mLength = length; }
  // The last block: start + length - 1.
  unsigned long GetEnd() const { return mStart + mLength - 1; }
  bool Contains(unsigned long block) const { return block >= mStart && block - mStart < mLength; }
  // 0 means endless ("INF" on the wire).
  unsigned long GetNumIterations() const { return mIterations; }
  void SetNumIterations(unsigned long n) { mIterations = n; }
  unsigned long GetTrigger() const { return mTrigger; }
  void SetTrigger(unsigned long trigger) { mTrigger = trigger; }
  const Dstring& GetVXITrigger() const { return mVxi; }
  void SetVXITrigger(const Dstring& vxi) { mVxi = vxi; }
  unsigned long GetLevel() const { return mLevel; }
  void SetLevel(unsigned long level) { mLevel = level; }

  // Field by field, the owner aside: what the change analysis uses to find loops that stayed.
  bool equals(const CLoop* other) const {
    return other && mStart == other->mStart && mLength == other->mLength &&
           mIterations == other->mIterations && mTrigger == other->mTrigger && mVxi == other->mVxi &&
           mLevel == other->mLevel;
  }

 private:
  CSequence* mOwner;
  unsigned long mStart;
  unsigned long mLength;
  unsigned long mIterations = 0;
  unsigned long mTrigger = 0;
  Dstring mVxi;
  unsigned long mLevel = 0;
};
