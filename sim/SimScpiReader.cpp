#include "SimScpiReader.h"

#include <algorithm>

namespace {

bool IsDigit(char c) {
  return c >= '0' && c <= '9';
}

bool StartsToken(char c) {
  return c == ' ' || c == '\t' || c == ',' || c == ';' || c == '(' || c == ':';
}

}  // namespace

void SimScpiReader::Feed(const char* data, std::size_t size) {
  mBuffer.append(data, size);
}

SimScpiReader::Result SimScpiReader::Next(std::string& message) {
  const bool ended = Scan();
  if (!ended) {
    // An overlong message is dropped as it comes, so the buffer never holds more than the limit.
    if (mScan > kMaxMessage) {
      mOverrun = true;
      mBuffer.erase(0, mScan);
      mScan = 0;
    }
    return Result::None;
  }
  const bool overrun = mOverrun || mScan > kMaxMessage;
  std::size_t end = mScan;
  if (end > 0 && mBuffer[end - 1] == '\r') --end;
  if (!overrun) message.assign(mBuffer, 0, end);
  mBuffer.erase(0, mScan + 1);
  mScan = 0;
  mTokenStart = true;
  mOverrun = false;
  return overrun ? Result::Overrun : Result::Message;
}

bool SimScpiReader::Scan() {
  while (mScan < mBuffer.size()) {
    if (mBlockLeft > 0) {
      const std::size_t step = std::min(mBlockLeft, mBuffer.size() - mScan);
      mScan += step;
      mBlockLeft -= step;
      continue;
    }
    const char c = mBuffer[mScan];
    if (c == '\n') return true;
    if (c == '#' && mTokenStart) {
      if (!StepBlockHeader()) return false;
      continue;
    }
    mTokenStart = StartsToken(c);
    ++mScan;
  }
  return false;
}

// "#0" (indefinite length) and a malformed header are plain bytes: the line feed ends them.
bool SimScpiReader::StepBlockHeader() {
  if (mScan + 1 >= mBuffer.size()) return false;
  const char n = mBuffer[mScan + 1];
  const std::size_t digits = n >= '1' && n <= '9' ? static_cast<std::size_t>(n - '0') : 0;
  if (mScan + 2 + digits > mBuffer.size()) return false;
  mTokenStart = false;
  if (digits == 0) {
    ++mScan;
    return true;
  }
  std::size_t length = 0;
  for (std::size_t i = mScan + 2; i < mScan + 2 + digits; ++i) {
    if (!IsDigit(mBuffer[i])) {
      ++mScan;
      return true;
    }
    length = length * 10 + static_cast<std::size_t>(mBuffer[i] - '0');
  }
  mScan += 2 + digits;
  mBlockLeft = length;
  return true;
}
