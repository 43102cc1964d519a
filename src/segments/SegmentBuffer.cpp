#include "segments/SegmentBuffer.h"

#include <algorithm>
#include <cstring>
#include <utility>

#include "instrument/QenGuiInst.h"
#include "segments/QenSegmentDs.h"
#include "segments/SegmentReply.h"
#include "segments/SegmentStatus.h"
#include "support/DataParcel.h"
#include "support/FWBlocker.h"
#include "support/ParserExpression.h"

namespace {

struct TogglePair {
  char a;
  char b;
};

constexpr std::size_t kJoinedReadRoom = 128;

constexpr TogglePair kTogglePairs[] = {{'0', '1'}, {'l', 'h'}, {'L', 'H'}};

// The partner of a state under toggling; the state itself when it has none.
char PartnerOf(char state) {
  for (const TogglePair& p : kTogglePairs) {
    if (state == p.a) return p.b;
    if (state == p.b) return p.a;
  }
  return state;
}

Dstring Number(long n) {
  return Dstring::Format("%ld", n);
}

}  // namespace

long SegmentBuffer::StateWidthOf(const Dstring& alphabet) {
  long bits = 0;
  while ((1L << bits) < static_cast<long>(alphabet.size())) ++bits;
  return bits;
}

int SegmentBuffer::Init(ConditionList& list) {
  FWBlocker guard("SegmentBuffer::Init", list);
  if (int status = guard.Block()) return status;
  if (int status = ReadDimension(list)) return status;
  return Read(list);
}

int SegmentBuffer::ReadDimension(ConditionList& list) {
  FWBlocker guard("SegmentBuffer::ReadDimension", list);
  if (int status = guard.Block()) return status;
  Dstring coding;
  long length = 0, width = 0;
  if (int status = mSegment->GetCoding(coding, list, true)) return status;
  if (int status = mSegment->GetLength(length, list, true)) return status;
  if (int status = mSegment->GetWidth(width, list, true)) return status;
  // An empty coding leaves the state width as it was.
  mAlphabet = coding;
  if (!coding.empty()) mStateWidth = StateWidthOf(coding);
  mSegmentLength = length;
  mWidth = width;
  // The window stays inside the segment and within one block, so that it can always be
  // written back.
  const long fitting = mWidth > 0 && mStateWidth > 0 ? VectorsPerBlock(mWidth, mStateWidth) : mBufferLength;
  mBufferLength = std::min({mBufferLength, length, fitting});
  mBufferStart = std::clamp(mBufferStart, 0L, length - mBufferLength);
  mRows.assign(static_cast<std::size_t>(BlockBytes()), 0);
  mDirty = false;
  mHasDimension = true;
  return SegmentStatus::kOk;
}

Dstring SegmentBuffer::RangeArgs(long start, long length) const {
  return Dstring::Format("%ld,%ld,%ld,%ld", 0L, start, mWidth - 1, start + length - 1);
}

int SegmentBuffer::CheckOpen(ConditionList& list) const {
  if (mSegment->GetNumber() != 0) return SegmentStatus::kOk;
  return SegmentReply::Refuse(list, "GUI_SEGMENTDS_NOT_OPEN", {mSegment->GetName()}, SegmentStatus::kNotOpen);
}

Dstring SegmentBuffer::ReadCommand(long start, long length) const {
  if (length == 0 || mWidth == 0) return {};
  return Dstring::Format("%s:EDIT:SEGM%u:PATT:DATA? %s,BIN", QenGuiInst::GetAppHandle().c_str(),
                         mSegment->GetNumber(), RangeArgs(start, length).c_str());
}

int SegmentBuffer::WriteCommand(Dstring& cmd, ConditionList& list) const {
  cmd.clear();
  if (!mDirty || mBufferLength == 0 || mWidth == 0) return SegmentStatus::kOk;
  const long bytes = BlockBytes();
  if (bytes > kMaxBlockBytes) {
    return SegmentReply::Refuse(list, "GUI_SEGMENTBUFFER_BLOCK_TOO_LARGE",
                                {Number(mBufferLength), Number(mWidth), Number(bytes)},
                                SegmentStatus::kBlockTooLarge);
  }
  cmd = Dstring::Format("%s:EDIT:SEGM%u:PATT:DATA %s,#5%05u", QenGuiInst::GetAppHandle().c_str(),
                        mSegment->GetNumber(), RangeArgs(mBufferStart, mBufferLength).c_str(),
                        static_cast<unsigned>(bytes));
  // Room for the read that a move joins to it, so that the bytes are copied once.
  cmd.reserve(cmd.size() + mRows.size() + kJoinedReadRoom);
  cmd.append(mRows.begin(), mRows.end());
  return SegmentStatus::kOk;
}

// The reply must be exactly one block of `bytes`; otherwise `rows` stays as it was. A reply that
// is the bare block, as the server sends it, is taken without parsing it.
int SegmentBuffer::CopyBlock(const Dstring& reply, long bytes, std::vector<std::uint8_t>& rows,
                             ConditionList& list) const {
  if (const char* data = BareBlock(reply, bytes)) {
    rows.assign(data, data + bytes);
    return SegmentStatus::kOk;
  }
  DataParcel items;
  ConditionList ignored;
  const bool isBlock = ParserExpression::Parse(reply, items, ignored) == 0 && items.size() == 1 &&
                       items[0].GetType() == DataItemType::Block &&
                       static_cast<long>(items[0].GetText().size()) == bytes;
  if (!isBlock) {
    return SegmentReply::Refuse(list, "GUI_SEGMENTBUFFER_BAD_BLOCK",
                                {SegmentReply::Shown(reply), Number(bytes)}, SegmentStatus::kBadReply);
  }
  rows.assign(items[0].GetText().begin(), items[0].GetText().end());
  return SegmentStatus::kOk;
}

const char* SegmentBuffer::BareBlock(const Dstring& reply, long bytes) {
  if (reply.size() < 3 || reply[0] != '#' || reply[1] < '1' || reply[1] > '9') return nullptr;
  const std::size_t digits = static_cast<std::size_t>(reply[1] - '0');
  if (reply.size() != 2 + digits + static_cast<std::size_t>(bytes)) return nullptr;
  long count = 0;
  for (std::size_t i = 2; i < 2 + digits; ++i) {
    if (reply[i] < '0' || reply[i] > '9') return nullptr;
    count = count * 10 + (reply[i] - '0');
  }
  return count == bytes ? reply.data() + 2 + digits : nullptr;
}

int SegmentBuffer::TakeBlock(const Dstring& reply, ConditionList& list) {
  if (int status = CopyBlock(reply, BlockBytes(), mRows, list)) return status;
  mDirty = false;
  return SegmentStatus::kOk;
}

int SegmentBuffer::Read(ConditionList& list) {
  const Dstring cmd = ReadCommand();
  if (cmd.empty()) return SegmentStatus::kOk;
  if (int status = CheckOpen(list)) return status;
  Dstring reply;
  if (int status = QenGuiInst::Call(cmd, reply, list)) return status;
  return TakeBlock(reply, list);
}

int SegmentBuffer::ReadRows(std::vector<std::uint8_t>& rows, ConditionList& list) const {
  rows.assign(mRows.size(), 0);
  const Dstring cmd = ReadCommand();
  if (cmd.empty()) return SegmentStatus::kOk;
  if (int status = CheckOpen(list)) return status;
  Dstring reply;
  if (int status = QenGuiInst::Call(cmd, reply, list)) return status;
  return CopyBlock(reply, BlockBytes(), rows, list);
}

char SegmentBuffer::StateIn(const std::vector<std::uint8_t>& rows, long vector, long trace) const {
  const unsigned number = ReadBitsOf(rows, vector, trace);
  return number < mAlphabet.size() ? mAlphabet[number] : '?';
}

void SegmentBuffer::MergeOnto(const std::vector<std::uint8_t>& theirs) {
  std::vector<std::uint8_t> mine = theirs;
  std::swap(mRows, mine);
  // A clean buffer changed nothing: its rows were its base.
  for (long t = 0; mDirty && t < mWidth; ++t) {
    for (long v = mBufferStart; v < mBufferStart + mBufferLength; ++v) {
      const unsigned state = ReadBitsOf(mine, v, t);
      if (state != ReadBitsOf(mBase, v, t)) WriteBits(v, t, state);
    }
  }
  mBase = theirs;
  mDirty = true;
  mMerged = true;
}

std::vector<long> SegmentBuffer::ChangedVectors() const {
  std::vector<long> changed;
  if (mMerged || mBase.size() != mRows.size()) {
    for (long v = 0; v < mBufferLength; ++v) changed.push_back(mBufferStart + v);
    return changed;
  }
  // Equal stretches are passed over a chunk at a time: an edit is a few bytes of the block.
  constexpr long kChunk = 256;
  const long row = RowSize();
  // Only the bytes of the vectors between the first and the last edit can differ.
  const long firstByte = std::max(0L, (mEditFirst - mBufferStart) * mStateWidth / 8);
  const long endByte = std::min(row, ((mEditLast - mBufferStart + 1) * mStateWidth + 7) / 8);
  for (long t = 0; t < mWidth; ++t) {
    const std::uint8_t* mine = mRows.data() + t * row;
    const std::uint8_t* base = mBase.data() + t * row;
    for (long from = firstByte; from < endByte; from += kChunk) {
      const long to = std::min(endByte, from + kChunk);
      if (std::memcmp(mine + from, base + from, static_cast<std::size_t>(to - from)) == 0) continue;
      for (long i = from; i < to; ++i) {
        if (mine[i] == base[i]) continue;
        // The states with a bit in byte i.
        const long last = std::min(mBufferLength - 1, (i * 8 + 7) / mStateWidth);
        for (long v = i * 8 / mStateWidth; v <= last; ++v) changed.push_back(mBufferStart + v);
      }
    }
  }
  std::sort(changed.begin(), changed.end());
  changed.erase(std::unique(changed.begin(), changed.end()), changed.end());
  return changed;
}

int SegmentBuffer::Write(ConditionList& list) {
  Dstring cmd, reply;
  if (int status = WriteCommand(cmd, list)) return status;
  if (cmd.empty()) return SegmentStatus::kOk;
  if (int status = CheckOpen(list)) return status;
  if (int status = QenGuiInst::Call(cmd, reply, list)) return status;
  mDirty = false;
  return SegmentStatus::kOk;
}

int SegmentBuffer::SetBufferLength(long length, ConditionList& list) {
  FWBlocker guard("SegmentBuffer::SetBufferLength", list);
  if (int status = guard.Block()) return status;
  return Move(mBufferStart, length, list);
}

int SegmentBuffer::SetBufferStart(long start, ConditionList& list) {
  FWBlocker guard("SegmentBuffer::SetBufferStart", list);
  if (int status = guard.Block()) return status;
  return Move(start, mBufferLength, list);
}

int SegmentBuffer::SetBufferStartAndLength(long start, long length, ConditionList& list) {
  FWBlocker guard("SegmentBuffer::SetBufferStartAndLength", list);
  if (int status = guard.Block()) return status;
  return Move(start, length, list);
}

// A closed segment may change before it is opened again, so its last known length does not
// bound the window then: ReadDimension fits the window when the segment is read again.
int SegmentBuffer::CheckWindow(long start, long length, ConditionList& list) const {
  const bool bounded = mHasDimension && mSegment->GetNumber() != 0;
  if (start < 0 || length < 0 || (bounded && start + length > mSegmentLength)) {
    return SegmentReply::Refuse(list, "GUI_SEGMENTBUFFER_BAD_WINDOW",
                                {Number(start), Number(length), Number(mSegmentLength)},
                                SegmentStatus::kOutOfRange);
  }
  const long bytes = RowBytes(length, mStateWidth) * mWidth;
  if (bytes > kMaxBlockBytes) {
    return SegmentReply::Refuse(list, "GUI_SEGMENTBUFFER_BLOCK_TOO_LARGE",
                                {Number(length), Number(mWidth), Number(bytes)},
                                SegmentStatus::kBlockTooLarge);
  }
  return SegmentStatus::kOk;
}

// Unsaved edits are written back before the window moves, in the same frame as the read of
// the new window, so that a move costs one round trip. The buffer takes the new window only
// once the reply is in: if anything fails, or the server dies meanwhile, it still holds its
// window, its states and its dirty flag, and a write sent again sends the same bytes.
int SegmentBuffer::Move(long start, long length, ConditionList& list) {
  if (int status = CheckWindow(start, length, list)) return status;
  if (mSegment->GetNumber() == 0) {
    mBufferStart = start;
    if (std::exchange(mBufferLength, length) != length) {
      mRows.assign(static_cast<std::size_t>(BlockBytes()), 0);
      mBase = mRows;
    }
    return SegmentStatus::kOk;
  }
  Dstring cmd, reply;
  if (int status = WriteCommand(cmd, list)) return status;
  const bool writeBack = !cmd.empty();
  const Dstring read = ReadCommand(start, length);
  if (writeBack && !read.empty()) cmd += ";";
  cmd += read;
  if (!cmd.empty()) {
    if (int status = QenGuiInst::Call(cmd, reply, list)) return status;
  }
  // An empty read is an empty window: no rows.
  std::vector<std::uint8_t> rows;
  if (!read.empty()) {
    if (int status = CopyBlock(reply, RowBytes(length, mStateWidth) * mWidth, rows, list)) return status;
  }
  mBufferStart = start;
  mBufferLength = length;
  mRows = std::move(rows);
  mDirty = false;
  return SegmentStatus::kOk;
}

int SegmentBuffer::CheckPosition(long vector, long trace, ConditionList& list) const {
  if (vector < mBufferStart || vector >= mBufferStart + mBufferLength) {
    return SegmentReply::Refuse(
        list, "GUI_SEGMENTBUFFER_VECTOR_NOT_IN_BUFFER",
        {Number(vector), Number(mBufferStart), Number(mBufferStart + mBufferLength - 1)},
        SegmentStatus::kOutOfRange);
  }
  if (trace < 0 || trace >= mWidth) {
    return SegmentReply::Refuse(list, "GUI_SEGMENTBUFFER_TRACE_NOT_IN_RANGE", {Number(trace), Number(mWidth)},
                                SegmentStatus::kOutOfRange);
  }
  return SegmentStatus::kOk;
}

long SegmentBuffer::StateNumber(char state) const {
  const std::size_t at = mAlphabet.find(state);
  return at == Dstring::npos ? -1 : static_cast<long>(at);
}

unsigned SegmentBuffer::ReadBitsOf(const std::vector<std::uint8_t>& rows, long vector, long trace) const {
  const std::uint8_t* row = rows.data() + trace * RowSize();
  long bit = (vector - mBufferStart) * mStateWidth;
  unsigned value = 0;
  for (long i = 0; i < mStateWidth; ++i, ++bit)
    value = (value << 1) | ((row[bit >> 3] >> (7 - (bit & 7))) & 1u);
  return value;
}

void SegmentBuffer::WriteBits(long vector, long trace, unsigned value) {
  std::uint8_t* row = mRows.data() + trace * RowSize();
  long bit = (vector - mBufferStart) * mStateWidth;
  for (long i = mStateWidth - 1; i >= 0; --i, ++bit) {
    const auto mask = static_cast<std::uint8_t>(0x80u >> (bit & 7));
    row[bit >> 3] = ((value >> i) & 1u) ? (row[bit >> 3] | mask) : (row[bit >> 3] & ~mask);
  }
}

int SegmentBuffer::SetState(long vector, long trace, char state, ConditionList& list) {
  if (int status = CheckPosition(vector, trace, list)) return status;
  const long number = StateNumber(state);
  if (number < 0) {
    return SegmentReply::Refuse(list, "GUI_SEGMENTBUFFER_UNKNOWN_STATE_CODE", {Dstring(1, state), mAlphabet},
                                SegmentStatus::kUnknownState);
  }
  // The first change since the rows were last read or written keeps them as the base.
  if (!mDirty) {
    mBase = mRows;
    mMerged = false;
    mEditFirst = vector;
    mEditLast = vector;
  }
  mEditFirst = std::min(mEditFirst, vector);
  mEditLast = std::max(mEditLast, vector);
  WriteBits(vector, trace, static_cast<unsigned>(number));
  mDirty = true;
  return SegmentStatus::kOk;
}

// A state number outside the coding (a block the server should not have sent) reads as '?'.
int SegmentBuffer::GetState(long vector, long trace, char& state, ConditionList& list) const {
  if (int status = CheckPosition(vector, trace, list)) return status;
  const unsigned number = ReadBits(vector, trace);
  state = number < mAlphabet.size() ? mAlphabet[number] : '?';
  return SegmentStatus::kOk;
}

int SegmentBuffer::ToggleState(long vector, long trace, ConditionList& list) {
  char state = 0;
  if (int status = GetState(vector, trace, state, list)) return status;
  const char partner = PartnerOf(state);
  return partner == state ? SegmentStatus::kOk : SetState(vector, trace, partner, list);
}
