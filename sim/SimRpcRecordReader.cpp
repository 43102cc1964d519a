#include "SimRpcRecordReader.h"

#include "SimXdrWriter.h"

namespace {

constexpr std::uint32_t kLastFragment = 0x80000000u;

std::uint32_t Word(const std::string& bytes) {
  std::uint32_t value = 0;
  for (int i = 0; i < 4; ++i) value = (value << 8) | static_cast<unsigned char>(bytes[i]);
  return value;
}

}  // namespace

SimRpcRecordReader::Result SimRpcRecordReader::Next(std::string& record) {
  if (mTooLarge) return Result::TooLarge;
  for (;;) {
    if (mBuffer.size() < 4) return Result::None;
    const std::uint32_t mark = Word(mBuffer);
    const std::size_t length = mark & ~kLastFragment;
    if (mRecord.size() + length > kMaxRecord) {
      mTooLarge = true;
      return Result::TooLarge;
    }
    if (mBuffer.size() - 4 < length) return Result::None;
    mRecord.append(mBuffer, 4, length);
    mBuffer.erase(0, 4 + length);
    if (mark & kLastFragment) {
      record.swap(mRecord);
      mRecord.clear();
      return Result::Record;
    }
  }
}

std::string SimRpcRecordReader::Mark(const std::string& record) {
  return SimXdrWriter().Uint(kLastFragment | static_cast<std::uint32_t>(record.size())).Bytes() + record;
}
