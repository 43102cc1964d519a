#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

// Reads the XDR items of an ONC RPC message: big-endian 32-bit words, and opaque data as a
// length word followed by the bytes padded to a whole word. Reading past the end sets the
// failed flag and yields zeros; the caller checks Failed() once after taking all it needs.
class SimXdrReader {
 public:
  explicit SimXdrReader(std::string_view bytes) : mBytes(bytes) {}

  std::uint32_t Uint() {
    if (mBytes.size() - mPos < 4 || mPos > mBytes.size()) {
      mFailed = true;
      mPos = mBytes.size();
      return 0;
    }
    std::uint32_t value = 0;
    for (int i = 0; i < 4; ++i) value = (value << 8) | static_cast<unsigned char>(mBytes[mPos++]);
    return value;
  }
  std::int32_t Int() { return static_cast<std::int32_t>(Uint()); }
  // Opaque data of at most `limit` bytes; longer ones fail.
  std::string_view Opaque(std::size_t limit) {
    const std::uint32_t size = Uint();
    const std::size_t padded = (static_cast<std::size_t>(size) + 3) & ~std::size_t{3};
    if (mFailed || size > limit || mBytes.size() - mPos < padded) {
      mFailed = true;
      mPos = mBytes.size();
      return {};
    }
    std::string_view data = mBytes.substr(mPos, size);
    mPos += padded;
    return data;
  }
  bool Failed() const { return mFailed; }

 private:
  std::string_view mBytes;
  std::size_t mPos = 0;
  bool mFailed = false;
};
