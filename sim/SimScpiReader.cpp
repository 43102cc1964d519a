#include "SimScpiReader.h"

#include <algorithm>

namespace {

bool IsDigit(char c) {
  return c >= '0' && c <= '9';
}

bool StartsToken(char c) {
  return c == ' ' || c == '\t' || c == ',' || c == ';' || c == '(' || c == ':';
}

// A message from this size on takes the buffer over rather than a copy of its bytes.
constexpr std::size_t kHandOver = 65536;

// What may stand right after a block's bytes.
bool EndsArgument(char c) {
  return c == '\n' || c == '\r' || c == ';' || c == ',' || c == ' ' || c == '\t' || c == ')';
}

}  // namespace

void SimScpiReader::Feed(const char* data, std::size_t size) {
  mBuffer.append(data, size);
}

char* SimScpiReader::Room(std::size_t size) {
  mBuffer.resize(mBuffer.size() + size);
  return mBuffer.data() + mBuffer.size() - size;
}

void SimScpiReader::Keep(std::size_t room, std::size_t came) {
  mBuffer.resize(mBuffer.size() - room + came);
}

SimScpiReader::Result SimScpiReader::Next(std::string& message) {
  const bool ended = Scan();
  if (!ended) {
    // An overlong message is dropped as it comes, so the buffer never holds more than the limit.
    if (mScan > kMaxMessage) {
      mOverrun = true;
      mBuffer.erase(0, mScan);
      mScan = 0;
      mBlockStart = 0;
    }
    return Result::None;
  }
  const bool overrun = mOverrun || mScan > kMaxMessage;
  const Result result = overrun ? Result::Overrun : mShort ? Result::ShortBlock : Result::Message;
  std::size_t end = mScan;
  if (end > 0 && mBuffer[end - 1] == '\r') --end;
  if (result == Result::Message && end >= kHandOver && mBuffer.size() - mScan - 1 < end) {
    // A large message with less after it: the buffer becomes the message.
    std::string rest = mBuffer.substr(mScan + 1);
    message = std::move(mBuffer);
    message.resize(end);
    mBuffer = std::move(rest);
  } else {
    if (result == Result::Message) message.assign(mBuffer, 0, end);
    mBuffer.erase(0, mScan + 1);
  }
  mScan = 0;
  mTokenStart = true;
  mOverrun = false;
  mShort = false;
  return result;
}

void SimScpiReader::Recycle(std::string room) {
  if (room.capacity() <= mBuffer.capacity()) return;
  room.assign(mBuffer);
  mBuffer.swap(room);
}

void SimScpiReader::CutBlock() {
  if (mBlockLeft == 0) return;
  mBlockLeft = 0;
  EndShort();
}

std::size_t SimScpiReader::FindIndefiniteBlock(std::string_view message) {
  bool tokenStart = true;
  bool quoted = false;
  for (std::size_t i = 0; i < message.size(); ++i) {
    const char c = message[i];
    if (quoted) {
      quoted = c != '"';
      continue;
    }
    if (c == '#' && tokenStart && i + 1 < message.size()) {
      const char n = message[i + 1];
      if (n == '0') return i;
      // A definite block: step over its bytes.
      if (n >= '1' && n <= '9' && i + 2 + static_cast<std::size_t>(n - '0') <= message.size()) {
        const std::size_t digits = static_cast<std::size_t>(n - '0');
        std::size_t length = 0;
        for (std::size_t d = i + 2; d < i + 2 + digits && IsDigit(message[d]); ++d)
          length = length * 10 + static_cast<std::size_t>(message[d] - '0');
        i += 1 + digits + length;
        tokenStart = false;
        continue;
      }
    }
    quoted = c == '"';
    tokenStart = StartsToken(c);
  }
  return std::string_view::npos;
}

bool SimScpiReader::Scan() {
  while (mScan < mBuffer.size()) {
    if (mBlockLeft > 0) {
      const std::size_t step = std::min(mBlockLeft, mBuffer.size() - mScan);
      mScan += step;
      mBlockLeft -= step;
      mBlockEnded = mBlockLeft == 0;
      continue;
    }
    if (mBlockEnded) {
      mBlockEnded = false;
      if (!BlockEndsWell()) {
        EndShort();
        continue;
      }
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

bool SimScpiReader::BlockEndsWell() const {
  return EndsArgument(mBuffer[mScan]);
}

void SimScpiReader::EndShort() {
  mShort = true;
  mBlockEnded = false;
  const std::size_t feed = mBuffer.find('\n', mBlockStart);
  if (feed < mScan) mScan = feed;
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
  mBlockStart = mScan;
  mBlockLeft = length;
  mBlockEnded = length == 0;
  return true;
}
