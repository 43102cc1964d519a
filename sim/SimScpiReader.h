#pragma once

#include <cstddef>
#include <string>
#include <string_view>

#include "SimSegment.h"

// Cuts the program messages of a raw SCPI connection out of a byte stream that arrives in
// arbitrary pieces. A message ends at a line feed (a carriage return before it is dropped),
// except inside an IEEE 488.2 definite-length block ("#<n><length><bytes>", standing where a
// token starts), whose bytes are taken whole whatever they hold. A message longer than
// kMaxMessage is not kept: its bytes are dropped up to its end, which reports an overrun.
// A block that is not followed by the end of its argument was shorter than it said: the
// message ends at the first line feed inside the bytes it took, which reports a short block,
// and what follows is read as the next messages. So does a block cut off by CutBlock.
class SimScpiReader {
 public:
  // Room for the largest segment block, its header and its command.
  static constexpr std::size_t kMaxMessage = SimSegment::kMaxBlockBytes + 4096u;

  enum class Result { None, Message, Overrun, ShortBlock };

  void Feed(const char* data, std::size_t size);
  // `size` bytes of room after what the buffer holds, to receive into straight; Keep then
  // says how many of them came.
  char* Room(std::size_t size);
  void Keep(std::size_t room, std::size_t came);
  // The next complete message (without its terminator), or None when more bytes are needed.
  Result Next(std::string& message);
  // A definite-length block has begun and not all its bytes have come.
  bool InBlock() const { return mBlockLeft > 0; }
  // The bytes of the block will not come: it ends as a short one.
  void CutBlock();
  // Storage a message was done with, taken as the buffer when it has more room, so that the
  // next large message arrives without new memory.
  void Recycle(std::string room);
  // Where an indefinite-length block ("#0", running to the message's end) starts in a
  // message, outside strings and definite blocks; npos when there is none.
  static std::size_t FindIndefiniteBlock(std::string_view message);

 private:
  // Moves the scan over the bytes that are there; true when a terminator was reached.
  bool Scan();
  // Steps over a block header at mScan; false when its digits have not all arrived.
  bool StepBlockHeader();
  // The block ended at mScan: false when what follows shows it was short.
  bool BlockEndsWell() const;
  // Ends the message at the first line feed inside the block, when there is one.
  void EndShort();

  std::string mBuffer;
  std::size_t mScan = 0;         // how far the current message is scanned
  std::size_t mBlockLeft = 0;    // bytes of a block still to step over
  std::size_t mBlockStart = 0;   // where the bytes of the last block began
  bool mBlockEnded = false;      // a block's bytes end at mScan
  bool mTokenStart = true;
  bool mOverrun = false;         // the current message is being dropped
  bool mShort = false;           // the current message holds a short block
};
