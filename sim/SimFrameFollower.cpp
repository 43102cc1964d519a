#include "SimFrameFollower.h"

#include <poll.h>
#include <cerrno>
#include <chrono>
#include <cstdio>

#include "instrument/Frame.h"

namespace {

long long NowMs() {
  using namespace std::chrono;
  return duration_cast<milliseconds>(steady_clock::now().time_since_epoch()).count();
}

}  // namespace

bool SimFrameFollower::Step(long long done, long long total, int waitMs) {
  const long long now = NowMs();
  if (!mGone && (mLastSentMs < 0 || now - mLastSentMs >= kMinGapMs || done == total)) {
    char text[48];
    std::snprintf(text, sizeof text, "%lld,%lld", done, total);
    mConnection.Queue(EncodeFrame(FrameHeader{FrameHeader::kProgress, 0, mId, 0, 0}, text));
    mGone = !mConnection.Flush();
    mLastSentMs = now;
  }
  const long long until = now + waitMs;
  for (;;) {
    if (mGone || Cancelled()) return false;
    const long long left = until - NowMs();
    pollfd p{mConnection.GetFd(), POLLIN, 0};
    const int ready = poll(&p, 1, static_cast<int>(left > 0 ? left : 0));
    if (ready < 0 && errno == EINTR) continue;
    // The step's time is over and no cancel came.
    if (ready <= 0) return true;
    // A client that went away wants nothing more.
    mGone = !mConnection.Receive();
  }
}

bool SimFrameFollower::Cancelled() const { return mConnection.Decoder().Holds(FrameHeader::kCancel, mId); }
