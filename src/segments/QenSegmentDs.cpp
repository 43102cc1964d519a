#include "segments/QenSegmentDs.h"

#include <algorithm>
#include <array>
#include <climits>

#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "segments/QenSegmentPool.h"
#include "segments/SegmentBuffer.h"
#include "segments/SegmentCopy.h"
#include "segments/SegmentReply.h"
#include "segments/SegmentStatus.h"
#include "segments/SegmentTextFile.h"
#include "support/FWBlocker.h"
#include "support/LgsDebug.h"

namespace {

constexpr std::string_view kZeroStates = "0nNkKlL";
constexpr std::string_view kOneStates = "1pPrRhH";
constexpr std::string_view kErroredStates = "kKrR";

Dstring Number(long n) {
  return Dstring::Format("%ld", n);
}

}  // namespace

int QenSegmentDs::BitOf(char state) {
  if (kZeroStates.find(state) != std::string_view::npos) return 0;
  if (kOneStates.find(state) != std::string_view::npos) return 1;
  return -1;
}

bool QenSegmentDs::IsErrored(char state) { return kErroredStates.find(state) != std::string_view::npos; }

char QenSegmentDs::DigitOfStates(const char* states, long count, DataFormat format) {
  unsigned value = 0;
  bool unknown = false, errored = false;
  for (long i = count - 1; i >= 0; --i) {
    const int bit = BitOf(states[i]);
    unknown = unknown || bit < 0;
    errored = errored || IsErrored(states[i]);
    value = (value << 1) | (bit > 0 ? 1u : 0u);
  }
  return !unknown ? InfoOf(format).digits[value] : (errored ? '!' : '?');
}

QenSegmentDs::QenSegmentDs(const Dstring& name) : mName(name) {
  mBuffers.reserve(64);
  QenSegmentPool::Enter(this);
}

QenSegmentDs::~QenSegmentDs() {
  QenSegmentPool::Forget(this);
}

Dstring QenSegmentDs::Cmd(const char* tail) const {
  return Dstring::Format("%s:EDIT:SEGM%u%s", QenGuiInst::GetAppHandle().c_str(), mNumber, tail);
}

int QenSegmentDs::Send(const Dstring& cmd, ConditionList& list) {
  Dstring reply;
  return QenGuiInst::Call(cmd, reply, list);
}

int QenSegmentDs::Query(const Dstring& cmd, Dstring& reply, ConditionList& list) {
  return QenGuiInst::Call(cmd, reply, list);
}

int QenSegmentDs::QueryNumber(const Dstring& cmd, long& value, ConditionList& list) {
  Dstring reply;
  if (int status = Query(cmd, reply, list)) return status;
  if (SegmentReply::Number(reply, 0, INT_MAX, value)) return SegmentStatus::kOk;
  return SegmentReply::Refuse(list, "GUI_SEGMENTDS_BAD_REPLY", {cmd, SegmentReply::Shown(reply)},
                              SegmentStatus::kBadReply);
}

int QenSegmentDs::CheckOpen(ConditionList& list) const {
  if (mNumber != 0) return SegmentStatus::kOk;
  return SegmentReply::Refuse(list, "GUI_SEGMENTDS_NOT_OPEN", {mName}, SegmentStatus::kNotOpen);
}

int QenSegmentDs::Open(ConditionList& list) {
  LgsDebug trace("QenSegmentDs::Open ", "segments");
  FWBlocker guard("QenSegmentDs::Open", list);
  if (int status = guard.Block()) return status;
  if (mOpenCount == 0) {
    if (int status = CommandText::CheckArgument(mName, list)) return status;
    const Dstring handle = QenGuiInst::GetAppHandle();
    const Dstring cmd = Dstring::Format("%s:EDIT:SEGM:OPEN? \"%s\"", handle.c_str(), mName.c_str());
    Dstring reply, path;
    long number = 0;
    if (int status = Query(cmd, reply, list)) return status;
    if (!SegmentReply::Number(reply, 1, UINT_MAX, number)) {
      return SegmentReply::Refuse(list, "GUI_SEGMENTDS_BAD_REPLY", {cmd, SegmentReply::Shown(reply)},
                                  SegmentStatus::kBadReply);
    }
    mNumber = static_cast<unsigned>(number);
    if (int status = QenSegmentPool::RealPath(mName, path, list)) {
      // Half open is not open: the server's handle goes back.
      ConditionList ignored;
      Send(Cmd(":CLOS"), ignored);
      mNumber = 0;
      return status;
    }
    // No file yet (its query fails) means the contents are not saved anywhere.
    ConditionList ignored;
    mModified =
        Query(Dstring::Format("%s:MMEM:INF? \"%s\"", handle.c_str(), path.c_str()), reply, ignored) != 0;
    trace.Printf("%s is segment %u%s\n", mName.c_str(), mNumber, mModified ? ", not saved" : "");
    KeepCopy();
  }
  if (mNumber != 0) ++mOpenCount;
  return SegmentStatus::kOk;
}

int QenSegmentDs::Close(ConditionList& list) {
  FWBlocker guard("QenSegmentDs::Close", list);
  if (int status = guard.Block()) return status;
  if (mOpenCount > 0) --mOpenCount;
  if (mOpenCount > 0 || mNumber == 0) return SegmentStatus::kOk;
  if (int status = Send(Cmd(":CLOS"), list)) {
    // Still open on the server: the last Close may be tried again.
    mOpenCount = 1;
    return status;
  }
  mNumber = 0;
  mChangedElsewhere = false;
  mCopy.reset();
  return SegmentStatus::kOk;
}

int QenSegmentDs::Save(ConditionList& list) {
  FWBlocker guard("QenSegmentDs::Save", list);
  if (int status = guard.Block()) return status;
  if (int status = CheckOpen(list)) return status;
  if (int status = Write(list)) return status;
  if (int status = Send(Cmd(":SAVE"), list)) return status;
  mModified = false;
  mCopy.reset();
  QenSegmentPool::NfyCatalogChanged();
  return SegmentStatus::kOk;
}

int QenSegmentDs::SaveAs(const Dstring& name, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SaveAs", list);
  if (int status = guard.Block()) return status;
  if (int status = CheckOpen(list)) return status;
  if (int status = CommandText::CheckArgument(name, list)) return status;
  if (int status = Write(list)) return status;
  if (int status = Send(Cmd(Dstring::Format(":SAVE \"%s\"", name.c_str()).c_str()), list)) return status;
  QenSegmentPool::NfyCatalogChanged();
  return SegmentStatus::kOk;
}

int QenSegmentDs::GetLength(long& length, ConditionList& list, bool force) {
  if (!force && First() && First()->mHasDimension) {
    length = First()->mSegmentLength;
    return SegmentStatus::kOk;
  }
  if (int status = CheckOpen(list)) return status;
  return QueryNumber(Cmd(":PATT:LENG?"), length, list);
}

int QenSegmentDs::GetWidth(long& width, ConditionList& list, bool force) {
  if (!force && First() && First()->mHasDimension) {
    width = First()->mWidth;
    return SegmentStatus::kOk;
  }
  if (int status = CheckOpen(list)) return status;
  return QueryNumber(Cmd(":PATT:WIDT?"), width, list);
}

int QenSegmentDs::GetCoding(Dstring& coding, ConditionList& list, bool force) {
  if (!force && First() && First()->mHasDimension) {
    coding = First()->mAlphabet;
    return SegmentStatus::kOk;
  }
  if (int status = CheckOpen(list)) return status;
  Dstring reply;
  if (int status = Query(Cmd(":PATT:COD?"), reply, list)) return status;
  if (SegmentReply::FirstItemText(reply, coding)) return SegmentStatus::kOk;
  return SegmentReply::Refuse(list, "GUI_SEGMENTDS_BAD_CODING", {SegmentReply::Shown(reply)},
                              SegmentStatus::kBadReply);
}

int QenSegmentDs::GetStateWidth(long& bits, ConditionList& list, bool force) {
  if (!force && First() && First()->mHasDimension) {
    bits = First()->mStateWidth;
    return SegmentStatus::kOk;
  }
  Dstring coding;
  if (int status = GetCoding(coding, list, true)) return status;
  // An empty coding leaves the width as it was.
  if (!coding.empty()) {
    bits = SegmentBuffer::StateWidthOf(coding);
  } else if (First() && First()->mHasDimension) {
    bits = First()->mStateWidth;
  }
  return SegmentStatus::kOk;
}

int QenSegmentDs::SetLength(long length, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SetLength", list);
  if (int status = guard.Block()) return status;
  return ResetDimension("VECT", length, kLengthChanged, list);
}

int QenSegmentDs::SetWidth(long width, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SetWidth", list);
  if (int status = guard.Block()) return status;
  return ResetDimension("TRAC", width, kWidthChanged, list);
}

// Deletes every vector (trace) and inserts `count` new ones: the old contents go on purpose.
// Once the delete has gone through, the buffers are read again whatever happens next.
int QenSegmentDs::ResetDimension(const char* what, long count, ChangeKind kind, ConditionList& list) {
  if (int status = CheckOpen(list)) return status;
  if (count < 0 || count > INT_MAX) {
    return SegmentReply::Refuse(list, "GUI_SEGMENTDS_BAD_ARGUMENT", {Dstring(what), Number(count)},
                                SegmentStatus::kBadArgument);
  }
  const bool vectors = kind == kLengthChanged;
  long current = 0;
  if (int status = vectors ? GetLength(current, list) : GetWidth(current, list)) return status;
  mModified = true;
  const Dstring del = vectors ? Dstring::Format(":PATT:MOD:DEL 0,VECT,%ld", current)
                              : Dstring::Format(":PATT:MOD:DEL 0,TRAC,%ld,NORM", current);
  if (int status = Send(Cmd(del.c_str()), list)) return status;
  int status = Send(Cmd(Dstring::Format(":PATT:MOD:INS 0,%s,BEF,%ld", what, count).c_str()), list);
  int reread = Reread(true, list);
  if (status == 0) status = reread;
  KeepCopy();
  int told = Notify(kind, list);
  return status != 0 ? status : told;
}

int QenSegmentDs::SetCoding(const Dstring& coding, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SetCoding", list);
  if (int status = guard.Block()) return status;
  if (int status = CommandText::CheckArgument(coding, list)) return status;
  return Modify({Cmd(Dstring::Format(":PATT:COD \"%s\"", coding.c_str()).c_str())}, kCodingChanged, true,
                list);
}

int QenSegmentDs::ConvertCoding(const Dstring& from, const Dstring& to, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::ConvertCoding", list);
  if (int status = guard.Block()) return status;
  if (int status = CommandText::CheckArgument(from + to, list)) return status;
  const Dstring cmd = Cmd(Dstring::Format(":PATT:MOD:CONV \"%s\",\"%s\"", from.c_str(), to.c_str()).c_str());
  return Modify({cmd}, kCodingChanged, true, list);
}

int QenSegmentDs::CreateBuffer(SegmentBuffer*& buffer, ConditionList&) {
  mBuffers.push_back(std::unique_ptr<SegmentBuffer>(new SegmentBuffer(this)));
  buffer = mBuffers.back().get();
  return SegmentStatus::kOk;
}

int QenSegmentDs::FindBuffer(const SegmentBuffer* buffer, ConditionList& list) const {
  auto it = std::find_if(mBuffers.begin(), mBuffers.end(), [&](const auto& b) { return b.get() == buffer; });
  if (buffer != nullptr && it != mBuffers.end()) return SegmentStatus::kOk;
  return SegmentReply::Refuse(list, "GUI_SEGMENTDS_UNKNOWN_BUFFER", {mName}, SegmentStatus::kBadArgument);
}

int QenSegmentDs::DestroyBuffer(SegmentBuffer* buffer, ConditionList& list) {
  if (int status = FindBuffer(buffer, list)) return status;
  std::erase_if(mBuffers, [&](const auto& b) { return b.get() == buffer; });
  return SegmentStatus::kOk;
}

int QenSegmentDs::Init(SegmentBuffer* buffer, ConditionList& list) {
  if (int status = FindBuffer(buffer, list)) return status;
  return buffer->Init(list);
}

int QenSegmentDs::SetBufferLength(SegmentBuffer* buffer, long length, ConditionList& list) {
  return MoveBuffer(
      buffer, [&] { return buffer->SetBufferLength(length, list); }, list);
}

int QenSegmentDs::SetBufferStart(SegmentBuffer* buffer, long start, ConditionList& list) {
  return MoveBuffer(
      buffer, [&] { return buffer->SetBufferStart(start, list); }, list);
}

int QenSegmentDs::SetBufferStartAndLength(SegmentBuffer* buffer, long start, long length,
                                          ConditionList& list) {
  return MoveBuffer(
      buffer, [&] { return buffer->SetBufferStartAndLength(start, length, list); }, list);
}

// A move writes a dirty buffer back first: its vectors go into the copy before they leave.
int QenSegmentDs::MoveBuffer(SegmentBuffer* buffer, const std::function<int()>& move, ConditionList& list) {
  if (int status = FindBuffer(buffer, list)) return status;
  if (int status = CheckWrite(buffer, list)) return status;
  const bool wasDirty = buffer->mDirty && mNumber != 0;
  const bool copied = wasDirty && CopyEdits(buffer);
  if (int status = move()) return status;
  AfterWrite(wasDirty, copied);
  return SegmentStatus::kOk;
}

long QenSegmentDs::GetBufferLength(const SegmentBuffer* buffer) const {
  return buffer ? buffer->mBufferLength : 0;
}
long QenSegmentDs::GetBufferStart(const SegmentBuffer* buffer) const {
  return buffer ? buffer->mBufferStart : 0;
}
bool QenSegmentDs::IsBufferDirty(const SegmentBuffer* buffer) const {
  return buffer && buffer->mDirty;
}

int QenSegmentDs::ReadDimension(SegmentBuffer* buffer, ConditionList& list) {
  if (int status = FindBuffer(buffer, list)) return status;
  return buffer->ReadDimension(list);
}

int QenSegmentDs::Read(SegmentBuffer* buffer, ConditionList& list) {
  if (int status = FindBuffer(buffer, list)) return status;
  return buffer->Read(list);
}

int QenSegmentDs::Write(SegmentBuffer* buffer, ConditionList& list) {
  if (int status = FindBuffer(buffer, list)) return status;
  if (int status = CheckWrite(buffer, list)) return status;
  const bool wasDirty = buffer->mDirty;
  const bool copied = wasDirty && CopyEdits(buffer);
  if (int status = buffer->Write(list)) return status;
  AfterWrite(wasDirty, copied);
  return SegmentStatus::kOk;
}

int QenSegmentDs::Read(ConditionList& list) {
  FWBlocker guard("QenSegmentDs::Read", list);
  if (mBuffers.empty()) return SegmentStatus::kOk;
  if (int status = guard.Block()) return status;
  for (const auto& buffer : mBuffers) {
    if (int status = buffer->Read(list)) return status;
  }
  return SegmentStatus::kOk;
}

int QenSegmentDs::Write(ConditionList& list) {
  FWBlocker guard("QenSegmentDs::Write", list);
  if (mBuffers.empty()) return SegmentStatus::kOk;
  if (int status = guard.Block()) return status;
  for (const auto& buffer : mBuffers) {
    if (int status = CheckWrite(buffer.get(), list)) return status;
    const bool wasDirty = buffer->mDirty;
    const bool copied = wasDirty && CopyEdits(buffer.get());
    if (int status = buffer->Write(list)) return status;
    AfterWrite(wasDirty, copied);
  }
  return SegmentStatus::kOk;
}

int QenSegmentDs::GetState(SegmentBuffer* buffer, long vector, long trace, char& state, ConditionList& list) {
  if (int status = FindBuffer(buffer, list)) return status;
  return buffer->GetState(vector, trace, state, list);
}

int QenSegmentDs::SetState(SegmentBuffer* buffer, long vector, long trace, char state, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SetState", list);
  if (int status = guard.Block()) return status;
  if (int status = FindBuffer(buffer, list)) return status;
  if (int status = buffer->SetState(vector, trace, state, list)) return status;
  mModified = true;
  mLastModifiedRange = StateRange(trace, vector, trace, vector);
  return Notify(kStatesChanged, list);
}

int QenSegmentDs::ToggleState(SegmentBuffer* buffer, long vector, long trace, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::ToggleState", list);
  if (int status = guard.Block()) return status;
  if (int status = FindBuffer(buffer, list)) return status;
  if (int status = buffer->ToggleState(vector, trace, list)) return status;
  mModified = true;
  mLastModifiedRange = StateRange(trace, vector, trace, vector);
  return Notify(kStatesChanged, list);
}

long QenSegmentDs::MaxDigitOf(DataFormat format, long width) {
  const int k = InfoOf(format).tracesPerDigit;
  return k == 0 ? 0 : (width + k - 1) / k - 1;
}

int QenSegmentDs::MaxDigit(DataFormat format, long& max, ConditionList& list) {
  long width = 0;
  if (int status = GetWidth(width, list)) return status;
  max = MaxDigitOf(format, width);
  return SegmentStatus::kOk;
}

namespace {

// The digit index of `trace`, checked against the digits of `width` traces.
int DigitIndex(long trace, DataFormat format, long width, long& digit, ConditionList& list) {
  const DataFormatInfo& info = InfoOf(format);
  if (info.tracesPerDigit == 0) {
    return SegmentReply::Refuse(list, "GUI_SEGMENTDS_BAD_ARGUMENT",
                                {"DataFormat", Number(static_cast<int>(format))},
                                SegmentStatus::kBadArgument);
  }
  digit = trace < 0 ? -1 : trace / info.tracesPerDigit;
  const long max = QenSegmentDs::MaxDigitOf(format, width);
  if (digit >= 0 && digit <= max) return SegmentStatus::kOk;
  return SegmentReply::Refuse(list, "GUI_SEGMENTDS_DIGIT_NOT_IN_RANGE",
                              {info.word, Number(digit), Number(max)}, SegmentStatus::kOutOfRange);
}

}  // namespace

int QenSegmentDs::GetDigit(SegmentBuffer* buffer, long vector, long trace, DataFormat format, char& digit,
                           ConditionList& list) {
  FWBlocker guard("QenSegmentDs::GetDigit", list);
  if (int status = guard.Block()) return status;
  return DigitOf(buffer, vector, trace, format, digit, list);
}

int QenSegmentDs::DigitOf(const SegmentBuffer* buffer, long vector, long trace, DataFormat format, char& digit,
                          ConditionList& list) const {
  if (int status = FindBuffer(buffer, list)) return status;
  long d = 0;
  if (int status = DigitIndex(trace, format, buffer->mWidth, d, list)) return status;
  const DataFormatInfo& info = InfoOf(format);
  const long low = d * info.tracesPerDigit;
  const long high = std::min(low + info.tracesPerDigit, buffer->mWidth) - 1;
  char states[4];
  for (long t = low; t <= high; ++t) {
    if (int status = buffer->GetState(vector, t, states[t - low], list)) return status;
  }
  digit = DigitOfStates(states, high - low + 1, format);
  return SegmentStatus::kOk;
}

// A digit character sets the digit's traces to its bits, lowest trace from the lowest bit;
// traces past the segment's width are skipped. Any other character is written as the state of
// every trace of the digit. Everything is checked before the first state changes.
int QenSegmentDs::SetDigit(SegmentBuffer* buffer, long vector, long trace, DataFormat format, char digit,
                           ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SetDigit", list);
  if (int status = guard.Block()) return status;
  if (int status = FindBuffer(buffer, list)) return status;
  long d = 0;
  if (int status = DigitIndex(trace, format, buffer->mWidth, d, list)) return status;
  const DataFormatInfo& info = InfoOf(format);
  const char* found =
      std::char_traits<char>::find(info.digits, std::char_traits<char>::length(info.digits), digit);
  const long low = d * info.tracesPerDigit;
  const long high = std::min(low + info.tracesPerDigit, buffer->mWidth) - 1;
  std::vector<char> states;
  for (long t = low, mask = 1; t <= high; ++t, mask <<= 1) {
    const char state = found == nullptr ? digit : (((found - info.digits) & mask) ? '1' : '0');
    if (buffer->StateNumber(state) < 0) {
      return SegmentReply::Refuse(list, "GUI_SEGMENTBUFFER_UNKNOWN_STATE_CODE",
                                  {Dstring(1, state), buffer->mAlphabet}, SegmentStatus::kUnknownState);
    }
    if (int status = buffer->CheckPosition(vector, t, list)) return status;
    states.push_back(state);
  }
  for (long t = low; t <= high; ++t)
    buffer->SetState(vector, t, states[static_cast<std::size_t>(t - low)], list);
  mModified = true;
  mLastModifiedRange = StateRange(low, vector, high, vector);
  return Notify(kStatesChanged, list);
}

int QenSegmentDs::Modify(const DstringList& cmds, ChangeKind kind, bool dimensions, ConditionList& list,
                         const StateRange* range) {
  if (int status = CheckOpen(list)) return status;
  mModified = true;
  if (int status = Write(list)) return status;
  for (const Dstring& cmd : cmds) {
    if (int status = Send(cmd, list)) return status;
  }
  if (int status = Reread(dimensions, list)) return status;
  if (range != nullptr) mLastModifiedRange = *range;
  if (range == nullptr && First() != nullptr) {
    mLastModifiedRange = StateRange(0, 0, First()->mWidth - 1, First()->mSegmentLength - 1);
  }
  KeepCopy();
  return Notify(kind, list);
}

int QenSegmentDs::Reread(bool dimensions, ConditionList& list) {
  for (const auto& buffer : mBuffers) {
    if (int status = dimensions ? buffer->Init(list) : buffer->Read(list)) return status;
  }
  return SegmentStatus::kOk;
}

int QenSegmentDs::Notify(ChangeKind kind, ConditionList& list) {
  mChangeKind = kind;
  return Update(list, 0);
}

int QenSegmentDs::UpdateAll(ConditionList& list) {
  FWBlocker guard("QenSegmentDs::UpdateAll", list);
  if (int status = guard.Block()) return status;
  if (int status = Write(list)) return status;
  if (int status = Reread(true, list)) return status;
  KeepCopy();
  return Notify(kUpdatedAll, list);
}

// --- Another client's change -------------------------------------------------------------------

bool QenSegmentDs::HasUnwrittenStates() const {
  return std::any_of(mBuffers.begin(), mBuffers.end(), [](const auto& b) { return b->mDirty; });
}

int QenSegmentDs::CheckWrite(const SegmentBuffer* buffer, ConditionList& list) const {
  if (!mChangedElsewhere || !buffer->mDirty) return SegmentStatus::kOk;
  return SegmentReply::Refuse(list, "GUI_SEGMENTDS_CHANGED_ELSEWHERE", {mName},
                              SegmentStatus::kChangedElsewhere);
}

int QenSegmentDs::IsShapeUnchanged(bool& unchanged, ConditionList& list) {
  unchanged = false;
  const SegmentBuffer* first = First();
  Dstring coding;
  long length = 0, width = 0;
  if (int status = GetCoding(coding, list, true)) return status;
  if (int status = GetLength(length, list, true)) return status;
  if (int status = GetWidth(width, list, true)) return status;
  unchanged = first != nullptr && coding == first->mAlphabet && length == first->mSegmentLength &&
              width == first->mWidth;
  return SegmentStatus::kOk;
}

int QenSegmentDs::IsHeldUnchanged(bool& unchanged, ConditionList& list) {
  if (int status = IsShapeUnchanged(unchanged, list)) return status;
  if (!unchanged) return SegmentStatus::kOk;
  unchanged = false;
  std::vector<std::uint8_t> theirs;
  for (const auto& buffer : mBuffers) {
    if (!buffer->mDirty) continue;
    if (int status = buffer->ReadRows(theirs, list)) return status;
    if (theirs != buffer->Base()) return SegmentStatus::kOk;
  }
  unchanged = true;
  return SegmentStatus::kOk;
}

int QenSegmentDs::NfyChangedElsewhere(ConditionList& list) {
  FWBlocker guard("QenSegmentDs::NfyChangedElsewhere", list);
  if (int status = guard.Block()) return status;
  // Already waiting for the user, who is shown the server's vectors as they are then.
  if (mChangedElsewhere) return SegmentStatus::kOk;
  if (!HasUnwrittenStates()) return UpdateAll(list);
  bool unchanged = false;
  if (int status = IsHeldUnchanged(unchanged, list)) return status;
  if (unchanged) return UpdateAll(list);
  mChangedElsewhere = true;
  return Notify(kChangedElsewhere, list);
}

int QenSegmentDs::KeepMine(ConditionList& list) {
  FWBlocker guard("QenSegmentDs::KeepMine", list);
  if (int status = guard.Block()) return status;
  if (!mChangedElsewhere) return SegmentStatus::kOk;
  bool unchanged = false;
  if (int status = IsShapeUnchanged(unchanged, list)) return status;
  if (!unchanged) {
    return SegmentReply::Refuse(list, "GUI_SEGMENTDS_RESHAPED_ELSEWHERE", {mName},
                                SegmentStatus::kChangedElsewhere);
  }
  std::vector<std::uint8_t> theirs;
  for (const auto& buffer : mBuffers) {
    if (!buffer->mDirty) continue;
    if (int status = buffer->ReadRows(theirs, list)) return status;
    buffer->MergeOnto(theirs);
  }
  mChangedElsewhere = false;
  mModified = true;
  return UpdateAll(list);
}

int QenSegmentDs::TakeTheirs(ConditionList& list) {
  FWBlocker guard("QenSegmentDs::TakeTheirs", list);
  if (int status = guard.Block()) return status;
  for (const auto& buffer : mBuffers) buffer->mDirty = false;
  mChangedElsewhere = false;
  if (int status = Reread(true, list)) return status;
  KeepCopy();
  return Notify(kUpdatedAll, list);
}

int QenSegmentDs::GetDifferences(DataFormat format, std::vector<Difference>& differences,
                                 ConditionList& list) {
  FWBlocker guard("QenSegmentDs::GetDifferences", list);
  if (int status = guard.Block()) return status;
  differences.clear();
  std::vector<std::uint8_t> theirs;
  for (const auto& buffer : mBuffers) {
    if (!buffer->mDirty) continue;
    if (int status = buffer->ReadRows(theirs, list)) return status;
    const SegmentBuffer& b = *buffer;
    const auto line = [&](const std::vector<std::uint8_t>& rows, long v) {
      return SegmentTextFile::Line([&](long t) { return b.StateIn(rows, v, t); }, b.mWidth, b.mAlphabet,
                                   format);
    };
    for (long v = b.mBufferStart; v < b.mBufferStart + b.mBufferLength; ++v) {
      Difference d{v, line(b.Base(), v), line(b.mRows, v), line(theirs, v)};
      if (d.before != d.mine || d.before != d.theirs) differences.push_back(std::move(d));
    }
  }
  return SegmentStatus::kOk;
}

// --- Unsaved work when the server is gone ---------------------------------------------------------

Dstring QenSegmentDs::LineOf(const SegmentBuffer* buffer, long vector) const {
  return SegmentTextFile::Line([&](long t) { return buffer->StateIn(buffer->mRows, vector, t); },
                               buffer->mWidth, buffer->mAlphabet, DataFormat::kHex);
}

void QenSegmentDs::KeepCopy() {
  if (!QenSegmentPool::mKeepCopies || !mModified || mNumber == 0) {
    mCopy.reset();
    return;
  }
  SegmentBuffer scratch(this);
  ConditionList ignored;
  if (scratch.ReadDimension(ignored) != 0) {
    mCopy.reset();
    return;
  }
  const long width = scratch.mWidth, length = scratch.mSegmentLength;
  const long columns = width == 0                  ? 0
                       : scratch.mAlphabet == "01" ? MaxDigitOf(DataFormat::kHex, width) + 1
                                                   : width;
  if (static_cast<std::size_t>(columns + 1) * static_cast<std::size_t>(length) > kMaxCopyChars) {
    mCopy.reset();
    return;
  }
  auto copy = std::make_unique<SegmentCopy>(scratch.mAlphabet, width, length, columns);
  const long step = std::max(1L, SegmentBuffer::VectorsPerBlock(width, scratch.mStateWidth));
  for (long from = 0; from < length && width > 0; from += step) {
    if (scratch.Move(from, std::min(step, length - from), ignored) != 0) {
      mCopy.reset();
      return;
    }
    for (long v = from; v < from + scratch.mBufferLength; ++v) copy->SetLine(v, LineOf(&scratch, v));
  }
  mCopy = std::move(copy);
}

// Only the vectors the buffer changed go into the copy: a move of a full buffer with one state
// typed costs a few lines, not the window's. The copy takes them before the write, which may
// fail; the overlay of dirty buffers in GetHeldTexts holds the same lines then.
bool QenSegmentDs::CopyEdits(const SegmentBuffer* buffer) {
  if (!QenSegmentPool::mKeepCopies || !mCopy || mCopy->GetWidth() != buffer->mWidth ||
      mCopy->GetLength() != buffer->mSegmentLength || mCopy->GetCoding() != buffer->mAlphabet) {
    return false;
  }
  for (const long v : buffer->ChangedVectors()) mCopy->SetLine(v, LineOf(buffer, v));
  return true;
}

void QenSegmentDs::AfterWrite(bool wasDirty, bool copied) {
  if (wasDirty && !copied && QenSegmentPool::mKeepCopies) KeepCopy();
}

void QenSegmentDs::GetHeldTexts(std::vector<HeldText>& texts) const {
  if (!HasUnsavedWork()) return;
  const SegmentBuffer* first = First();
  const bool whole = mCopy && (first == nullptr || (first->mWidth == mCopy->GetWidth() &&
                                                    first->mSegmentLength == mCopy->GetLength() &&
                                                    first->mAlphabet == mCopy->GetCoding()));
  // What was typed goes last, over what the other buffers hold of the same vectors.
  const std::array<bool, 2> order = {false, true};
  if (whole) {
    SegmentCopy copy = *mCopy;
    for (const bool dirty : order) {
      for (const auto& buffer : mBuffers) {
        if (buffer->mDirty != dirty) continue;
        for (long v = buffer->mBufferStart; v < buffer->mBufferStart + buffer->mBufferLength; ++v) {
          copy.SetLine(v, LineOf(buffer.get(), v));
        }
      }
    }
    const long length = copy.GetLength();
    texts.push_back(
        {copy.GetCoding(), copy.GetWidth(), length, 0, length, true,
         SegmentTextFile::Header(mName, length, copy.GetWidth(), copy.GetCoding(), DataFormat::kHex) + "\n" +
             copy.GetBody()});
    return;
  }
  // Without a copy only the held vectors are known.
  for (const bool dirty : order) {
    for (const auto& buffer : mBuffers) {
      const SegmentBuffer& b = *buffer;
      if (b.mDirty != dirty || !b.mHasDimension || b.mBufferLength == 0 || b.mWidth == 0) continue;
      Dstring text = SegmentTextFile::PartHeader(mName, b.mBufferStart, b.mBufferStart + b.mBufferLength - 1,
                                                 b.mSegmentLength, b.mWidth, b.mAlphabet, DataFormat::kHex) +
                     "\n";
      for (long v = b.mBufferStart; v < b.mBufferStart + b.mBufferLength; ++v) text += LineOf(&b, v) + "\n";
      texts.push_back(
          {b.mAlphabet, b.mWidth, b.mSegmentLength, b.mBufferStart, b.mBufferLength, false, std::move(text)});
    }
  }
}
