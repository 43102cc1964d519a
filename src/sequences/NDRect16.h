#pragma once

#include <cstdint>

// A window's rectangle as a window resource gives it (the legacy toolkit's NDRect16).
struct NDRect16 {
  std::int16_t x = 0;
  std::int16_t y = 0;
  std::int16_t width = 0;
  std::int16_t height = 0;
};
