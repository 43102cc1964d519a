#pragma once

#include <cstdint>

#include "SimConnection.h"
#include "SimWorkListener.h"

// A framed request whose client asked for progress: each step of its long work sends a
// progress frame (at most one every kMinGapMs, and the last one always) and looks for the
// client's cancel frame while the step's time passes.
class SimFrameFollower : public SimWorkListener {
 public:
  static constexpr long long kMinGapMs = 50;

  SimFrameFollower(SimConnection& connection, std::uint32_t id) : mConnection(connection), mId(id) {}

  bool Step(long long done, long long total, int waitMs) override;

 private:
  bool Cancelled() const;

  SimConnection& mConnection;
  std::uint32_t mId;
  long long mLastSentMs = -1;
  bool mGone = false;
};
