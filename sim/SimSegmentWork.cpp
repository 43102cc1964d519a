#include "SimSegmentWork.h"

#include <algorithm>
#include <string>

int SimSegmentWork::Fill(SimSegment& segment, long t0, long v0, long t1, long v1, long state) {
  return OverVectors(segment, t0, v0, t1, v1,
                     [&](long from, long to) { return segment.Fill(t0, from, t1, to, state); });
}

int SimSegmentWork::Invert(SimSegment& segment, long t0, long v0, long t1, long v1) {
  return OverVectors(segment, t0, v0, t1, v1, [&](long from, long to) { return segment.Invert(t0, from, t1, to); });
}

int SimSegmentWork::OverVectors(SimSegment& segment, long t0, long v0, long t1, long v1,
                                const std::function<int(long from, long to)>& op) {
  if (v1 < v0 || v1 - v0 < kStep || segment.IsGenerated()) return op(v0, v1);
  // Only a client that follows the work can cancel it; part way, nothing else can fail.
  const bool keep = mContext.IsFollowed();
  std::string before;
  if (keep) {
    if (int rc = segment.Keep(t0, v0, t1, v1, before)) return rc;
  }
  const long long total = v1 - v0 + 1LL;
  for (long from = v0; from <= v1; from += kStep) {
    const long to = std::min(v1, from + kStep - 1);
    int rc = op(from, to);
    if (rc == 0 && !Step(to - v0 + 1LL, total)) rc = SimContext::kCancelled;
    if (rc != 0) {
      if (keep) segment.PutBack(t0, v0, t1, v1, before);
      return rc;
    }
  }
  return 0;
}

int SimSegmentWork::Insert(SimSegment& segment, long position, bool vectors, bool after, long count) {
  // A trace is a whole row of vectors: traces go one step each.
  const long step = vectors ? kStep : std::max(1L, kStep / std::max(1L, segment.GetLength()));
  if (count <= step) return segment.Insert(position, vectors, after, count);
  for (long done = 0; done < count;) {
    const long now = std::min(step, count - done);
    int rc = segment.Insert(position, vectors, after, now);
    if (rc == 0) done += now;
    if (rc == 0 && !Step(done, count)) rc = SimContext::kCancelled;
    if (rc != 0) {
      if (done > 0) segment.Delete(after ? position + 1 : position, vectors, done, false);
      return rc;
    }
  }
  return 0;
}
