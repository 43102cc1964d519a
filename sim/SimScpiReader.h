#pragma once

#include <cstddef>
#include <string>

// Cuts the program messages of a raw SCPI connection out of a byte stream that arrives in
// arbitrary pieces. A message ends at a line feed (a carriage return before it is dropped),
// except inside an IEEE 488.2 definite-length block ("#<n><length><bytes>", standing where a
// token starts), whose bytes are taken whole whatever they hold. A message longer than
// kMaxMessage is not kept: its bytes are dropped up to its end, which reports an overrun.
class SimScpiReader {
 public:
  // Room for the largest segment block a frame carries, and its command.
  static constexpr std::size_t kMaxMessage = 16u * 1024u * 1024u + 4096u;

  enum class Result { None, Message, Overrun };

  void Feed(const char* data, std::size_t size);
  // The next complete message (without its terminator), or None when more bytes are needed.
  Result Next(std::string& message);

 private:
  // Moves the scan over the bytes that are there; true when a terminator was reached.
  bool Scan();
  // Steps over a block header at mScan; false when its digits have not all arrived.
  bool StepBlockHeader();

  std::string mBuffer;
  std::size_t mScan = 0;         // how far the current message is scanned
  std::size_t mBlockLeft = 0;    // bytes of a block still to step over
  bool mTokenStart = true;
  bool mOverrun = false;         // the current message is being dropped
};
