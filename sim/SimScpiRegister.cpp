#include "SimScpiRegister.h"

void SimScpiRegister::Sample(std::uint16_t condition) {
  condition &= kMask;
  const auto rose = static_cast<std::uint16_t>(condition & ~mCondition);
  const auto fell = static_cast<std::uint16_t>(mCondition & ~condition);
  mEvent |= static_cast<std::uint16_t>((rose & mRising) | (fell & mFalling));
  mCondition = condition;
}

std::uint16_t SimScpiRegister::TakeEvent() {
  const std::uint16_t event = mEvent;
  mEvent = 0;
  return event;
}

void SimScpiRegister::Preset() {
  mEnable = 0;
  mRising = kMask;
  mFalling = 0;
}
