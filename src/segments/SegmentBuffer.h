#pragma once

#include <cstdint>
#include <vector>

#include "support/ConditionList.h"
#include "support/Dstring.h"

class QenSegmentDs;

// A slice of a segment held on this side: `bufferLength` consecutive vectors from
// `bufferStart`, over all traces, packed exactly as the server's data block carries them.
// Each trace is a row of bufferLength states of stateWidth bits, most significant bit first
// and without gaps, padded to whole bytes; the block is the rows of traces 0 .. width-1 in
// that order. The rows lie back to back in one array, so a block read or write is one copy.
//
// Its only client is QenSegmentDs, which forwards each operation under the same name.
class SegmentBuffer {
 public:
  // One data block carries at most this many bytes.
  static constexpr long kMaxBlockBytes = 99999;

  // Bits per state for an alphabet of n characters: the smallest count that holds n states.
  static long StateWidthOf(const Dstring& alphabet);
  // The most vectors of `width` traces one block carries.
  static long VectorsPerBlock(long width, long stateWidth) {
    return width > 0 && stateWidth > 0 ? kMaxBlockBytes / width * 8 / stateWidth : 0;
  }
  // Bytes of one row of `length` states.
  static long RowBytes(long length, long stateWidth) { return (length * stateWidth + 7) / 8; }

 private:
  friend class QenSegmentDs;

  explicit SegmentBuffer(QenSegmentDs* segment) : mSegment(segment) {}

  int Init(ConditionList& list);
  int ReadDimension(ConditionList& list);
  int Read(ConditionList& list);
  int Write(ConditionList& list);
  int SetBufferLength(long length, ConditionList& list);
  int SetBufferStart(long start, ConditionList& list);
  int SetBufferStartAndLength(long start, long length, ConditionList& list);
  int SetState(long vector, long trace, char state, ConditionList& list);
  int GetState(long vector, long trace, char& state, ConditionList& list) const;
  int ToggleState(long vector, long trace, ConditionList& list);

  long RowSize() const { return RowBytes(mBufferLength, mStateWidth); }
  const std::vector<std::uint8_t>& Base() const { return mDirty ? mBase : mRows; }
  // The vectors, in order, whose states differ from the base: every held one after a merge,
  // whose base is the other side's.
  std::vector<long> ChangedVectors() const;
  long BlockBytes() const { return RowSize() * mWidth; }
  // The range checks of Set/GetState; a condition and nonzero when out of range.
  int CheckPosition(long vector, long trace, ConditionList& list) const;
  // The index of `state` in the alphabet, or -1.
  long StateNumber(char state) const;
  unsigned ReadBits(long vector, long trace) const { return ReadBitsOf(mRows, vector, trace); }
  unsigned ReadBitsOf(const std::vector<std::uint8_t>& rows, long vector, long trace) const;
  void WriteBits(long vector, long trace, unsigned value);
  int CheckOpen(ConditionList& list) const;
  // The block commands of the window; empty when there is nothing to send.
  Dstring ReadCommand() const { return ReadCommand(mBufferStart, mBufferLength); }
  Dstring ReadCommand(long start, long length) const;
  int WriteCommand(Dstring& cmd, ConditionList& list) const;
  int TakeBlock(const Dstring& reply, ConditionList& list);
  int CopyBlock(const Dstring& reply, long bytes, std::vector<std::uint8_t>& rows, ConditionList& list) const;
  // The data of `reply` when it is exactly a definite-length block of `bytes`; null otherwise.
  static const char* BareBlock(const Dstring& reply, long bytes);
  // The server's rows of the window as they are now, into `rows`; the buffer stays as it is.
  int ReadRows(std::vector<std::uint8_t>& rows, ConditionList& list) const;
  // The state of (vector, trace) in `rows`, rows of this window; the position must lie inside.
  char StateIn(const std::vector<std::uint8_t>& rows, long vector, long trace) const;
  // `theirs` (the server's rows now) with every state this buffer changed since the rows were
  // last read or written put over them; `theirs` becomes the base. The buffer stays dirty.
  void MergeOnto(const std::vector<std::uint8_t>& theirs);
  int CheckWindow(long start, long length, ConditionList& list) const;
  int Move(long start, long length, ConditionList& list);
  Dstring RangeArgs(long start, long length) const;

  long mBufferLength = 0;
  long mBufferStart = 0;
  std::vector<std::uint8_t> mRows;
  // The rows as last read from or written to the server: what the other side held then. A
  // state that differs from it is one the user changed here. Kept only while the buffer is
  // dirty (a clean buffer's rows are its base), so that a move copies no rows twice.
  std::vector<std::uint8_t> mBase;
  QenSegmentDs* mSegment;
  Dstring mAlphabet;
  long mStateWidth = 0;
  long mSegmentLength = 0;
  long mWidth = 0;
  bool mDirty = false;
  bool mMerged = false;  // while dirty: the base is the other side's rows, merged under the edits
  // While dirty: the first and last vector changed since the base, which bound the search.
  long mEditFirst = 0;
  long mEditLast = -1;
  bool mHasDimension = false;  // the segment's dimensions have been read
};
