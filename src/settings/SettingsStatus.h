#pragma once

// Status codes of the profiles and the registry store, apart from the instrument client's
// (QenStatus) and the guard's, so that a caller can tell a bad stored value from a failed call.
namespace SettingsStatus {
inline constexpr int kOk = 0;
inline constexpr int kNoValue = -30;
inline constexpr int kBadEntry = -31;
inline constexpr int kBadValue = -32;
inline constexpr int kUnexpectedValue = -33;
inline constexpr int kWrongVersion = -34;
inline constexpr int kBadReply = -35;
inline constexpr int kRegistryError = -36;
inline constexpr int kNotFinite = -37;
inline constexpr int kBadStartUp = -38;
// The user cancelled the start-up dialog: the start ends.
inline constexpr int kStartCancelled = -39;
// The user answered no to a question the operation asked: nothing was done.
inline constexpr int kDeclined = -40;
}  // namespace SettingsStatus
