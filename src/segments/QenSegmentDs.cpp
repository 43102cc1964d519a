#include "segments/QenSegmentDs.h"

#include <algorithm>
#include <climits>

#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "segments/QenSegmentPool.h"
#include "segments/SegmentBuffer.h"
#include "segments/SegmentReply.h"
#include "segments/SegmentStatus.h"
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
  return SegmentStatus::kOk;
}

int QenSegmentDs::Save(ConditionList& list) {
  FWBlocker guard("QenSegmentDs::Save", list);
  if (int status = guard.Block()) return status;
  if (int status = CheckOpen(list)) return status;
  if (int status = Write(list)) return status;
  if (int status = Send(Cmd(":SAVE"), list)) return status;
  mModified = false;
  return SegmentStatus::kOk;
}

int QenSegmentDs::SaveAs(const Dstring& name, ConditionList& list) {
  FWBlocker guard("QenSegmentDs::SaveAs", list);
  if (int status = guard.Block()) return status;
  if (int status = CheckOpen(list)) return status;
  if (int status = CommandText::CheckArgument(name, list)) return status;
  if (int status = Write(list)) return status;
  return Send(Cmd(Dstring::Format(":SAVE \"%s\"", name.c_str()).c_str()), list);
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
  if (int status = FindBuffer(buffer, list)) return status;
  return buffer->SetBufferLength(length, list);
}

int QenSegmentDs::SetBufferStart(SegmentBuffer* buffer, long start, ConditionList& list) {
  if (int status = FindBuffer(buffer, list)) return status;
  return buffer->SetBufferStart(start, list);
}

int QenSegmentDs::SetBufferStartAndLength(SegmentBuffer* buffer, long start, long length,
                                          ConditionList& list) {
  if (int status = FindBuffer(buffer, list)) return status;
  return buffer->SetBufferStartAndLength(start, length, list);
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
  return buffer->Write(list);
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
    if (int status = buffer->Write(list)) return status;
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
  unsigned value = 0;
  bool unknown = false, errored = false;
  for (long t = high; t >= low; --t) {
    char state = 0;
    if (int status = buffer->GetState(vector, t, state, list)) return status;
    const int bit = BitOf(state);
    unknown = unknown || bit < 0;
    errored = errored || IsErrored(state);
    value = (value << 1) | (bit > 0 ? 1u : 0u);
  }
  digit = !unknown ? info.digits[value] : (errored ? '!' : '?');
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
  return Notify(kUpdatedAll, list);
}
