#pragma once

// Status codes of the segment sources and buffers, apart from the instrument client's
// (QenStatus) and the guard's, so that a caller can tell a refused request from a failed call.
namespace SegmentStatus {
inline constexpr int kOk = 0;
inline constexpr int kBadReply = -40;
inline constexpr int kOutOfRange = -41;
inline constexpr int kBlockTooLarge = -42;
inline constexpr int kUnknownState = -43;
inline constexpr int kNotOpen = -44;
inline constexpr int kBadArgument = -45;
// Another client changed the segment under states typed here; the user has not chosen yet.
inline constexpr int kChangedElsewhere = -46;
}  // namespace SegmentStatus
