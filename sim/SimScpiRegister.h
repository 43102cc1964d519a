#pragma once

#include <cstdint>

// One SCPI status register (STATus:OPERation, STATus:QUEStionable): the condition the
// instrument is in, the event register that latches the transitions the transition filters
// let through, and the enable mask of its summary bit. Bit 15 is never used.
class SimScpiRegister {
 public:
  static constexpr std::uint16_t kMask = 0x7fff;

  // A new condition; its transitions since the last one are latched as the filters say.
  void Sample(std::uint16_t condition);
  std::uint16_t Condition() const { return mCondition; }
  // The event register, which reading clears.
  std::uint16_t TakeEvent();
  bool Summary() const { return (mEvent & mEnable) != 0; }
  void ClearEvent() { mEvent = 0; }
  // STATus:PRESet: enable none, report every rise and no fall.
  void Preset();

  std::uint16_t mEnable = 0;
  std::uint16_t mRising = kMask;  // PTRansition
  std::uint16_t mFalling = 0;     // NTRansition

 private:
  std::uint16_t mCondition = 0;
  std::uint16_t mEvent = 0;
};
