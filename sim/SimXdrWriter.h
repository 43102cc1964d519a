#pragma once

#include <cstdint>
#include <string>
#include <string_view>

// Writes the XDR items of an ONC RPC message (see SimXdrReader).
class SimXdrWriter {
 public:
  SimXdrWriter& Uint(std::uint32_t value) {
    for (int shift = 24; shift >= 0; shift -= 8) mBytes.push_back(static_cast<char>((value >> shift) & 0xFF));
    return *this;
  }
  SimXdrWriter& Int(std::int32_t value) { return Uint(static_cast<std::uint32_t>(value)); }
  SimXdrWriter& Opaque(std::string_view data) {
    Uint(static_cast<std::uint32_t>(data.size()));
    mBytes.append(data);
    mBytes.append((4 - data.size() % 4) % 4, '\0');
    return *this;
  }
  const std::string& Bytes() const { return mBytes; }

 private:
  std::string mBytes;
};
