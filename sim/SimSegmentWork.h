#pragma once

#include <functional>

#include "SimContext.h"
#include "SimSegment.h"

// Work over a huge segment done in steps of kStep vectors (traces, or search positions), each
// reported to the client through the context and each taking the instrument's pace. When the
// client cancels, what was done is put back and the work ends with SimContext::kCancelled;
// a failure part way puts it back too, so a command changes all or nothing.
class SimSegmentWork {
 public:
  static constexpr long kStep = 1L << 20;

  SimSegmentWork(SimContext& context, int paceMs) : mContext(context), mPaceMs(paceMs) {}

  int Fill(SimSegment& segment, long t0, long v0, long t1, long v1, long state);
  int Invert(SimSegment& segment, long t0, long v0, long t1, long v1);
  int Insert(SimSegment& segment, long position, bool vectors, bool after, long count);
  // For a search: `done` of `total` positions looked at; false once the client cancelled.
  bool Step(long long done, long long total) { return mContext.Step(done, total, mPaceMs); }

 private:
  // Runs `op(from, to)` over vectors v0..v1 a step at a time; the range's states are kept
  // first when the client could cancel.
  int OverVectors(SimSegment& segment, long t0, long v0, long t1, long v1,
                  const std::function<int(long from, long to)>& op);

  SimContext& mContext;
  int mPaceMs;
};
