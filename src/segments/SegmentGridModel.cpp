#include "segments/SegmentGridModel.h"

#include <algorithm>
#include <cstring>

#include "data/QenDsView.h"
#include "segments/QenSegmentDs.h"
#include "segments/QenSegmentPool.h"
#include "segments/SegmentBuffer.h"
#include "segments/SegmentTextFile.h"
#include "segments/SegmentVcdWriter.h"
#include "support/NumberText.h"

namespace {

// The buffer holds this many screens of lines around the ones shown.
constexpr long kScreensHeld = 4;

}  // namespace

// Another editor or client changed the segment: its dimensions may have changed too. When
// another client changed it under digits typed here, nothing was read: the buffer still holds
// them, and whoever shows the grid asks the user what to do.
class SegmentGridModel::View : public QenDsView {
 public:
  explicit View(SegmentGridModel& model) : mModel(model) {}
  int NfyViewDataUpdated(QenDs* source, ConditionList& list) override {
    const bool elsewhere = static_cast<QenSegmentDs*>(source)->GetChangeKind() == QenSegmentDs::kChangedElsewhere;
    const int status = elsewhere ? 0 : mModel.ReadDimensions(list);
    if (mModel.mObserver != nullptr) mModel.mObserver->NfySegmentChanged(elsewhere);
    return status;
  }

 private:
  SegmentGridModel& mModel;
};

SegmentGridModel::SegmentGridModel() : mView(std::make_unique<View>(*this)) {}

// What cannot be written when the model goes is lost: an owner that must say so releases first.
SegmentGridModel::~SegmentGridModel() {
  ConditionList ignored;
  if (Release(ignored) != 0) Abandon();
}

void SegmentGridModel::Forget() {
  mDs = nullptr;
  mBuffer = nullptr;
  mLength = mWidth = mDigits = 0;
  mFirst = mDigitOffset = mCursorVector = mCursorDigit = 0;
  mFoundVector = mFoundTrace = -1;
  mSelecting = false;
}

int SegmentGridModel::Release(ConditionList& list) {
  if (mDs == nullptr) return 0;
  // What was typed goes to the server before the segment is let go; a refusal keeps it here.
  if (int status = mDs->Write(list)) return status;
  int status = mDs->Close(list);
  mDs->DestroyBuffer(mBuffer, list);
  QenSegmentPool::UnregisterView(mDs, mView.get(), list);
  Forget();
  return status;
}

void SegmentGridModel::Abandon() {
  if (mDs == nullptr) return;
  ConditionList ignored;
  mDs->Close(ignored);
  mDs->DestroyBuffer(mBuffer, ignored);
  // The view leaves the source, which would otherwise tell a model that is gone.
  QenSegmentPool::UnregisterView(mDs, mView.get(), ignored);
  Forget();
}

int SegmentGridModel::HookOn(const Dstring& segment, ConditionList& list) {
  if (int status = Release(list)) return status;
  if (int status = QenSegmentPool::RegisterView(segment, mView.get(), list)) return status;
  mDs = QenSegmentPool::GetSegmentDsByName(segment);
  int status = mDs->Open(list);
  if (status == 0) status = mDs->CreateBuffer(mBuffer, list);
  if (status == 0) status = mDs->Init(mBuffer, list);
  if (status != 0) {
    if (mBuffer != nullptr) mDs->DestroyBuffer(mBuffer, list);
    if (mDs->GetNumber() != 0) mDs->Close(list);
    QenSegmentPool::UnregisterView(mDs, mView.get(), list);
    Forget();
    return status;
  }
  // Reading the dimensions also moves the buffer over the lines shown.
  status = ReadDimensions(list);
  // The cursor starts on the first vector's most significant digit, where typing reads left to right.
  mCursorVector = 0;
  mCursorDigit = std::max(0L, mDigits - 1);
  return status;
}

int SegmentGridModel::ReadDimensions(ConditionList& list) {
  if (mDs == nullptr) return 0;
  if (int status = mDs->GetLength(mLength, list, true)) return status;
  if (int status = mDs->GetWidth(mWidth, list, true)) return status;
  mDigits = mWidth > 0 ? QenSegmentDs::MaxDigitOf(mFormat, mWidth) + 1 : 0;
  const long lastVector = std::max(0L, mLength - 1);
  const long lastDigit = std::max(0L, mDigits - 1);
  mCursorVector = std::clamp(mCursorVector, 0L, lastVector);
  mCursorDigit = std::clamp(mCursorDigit, 0L, lastDigit);
  mAnchorVector = std::clamp(mAnchorVector, 0L, lastVector);
  mAnchorDigit = std::clamp(mAnchorDigit, 0L, lastDigit);
  mFirst = std::clamp(mFirst, 0L, lastVector);
  mDigitOffset = std::clamp(mDigitOffset, 0L, lastDigit);
  return CoverShown(list);
}

long SegmentGridModel::Page() const { return std::max(1L, (mObserver != nullptr ? mObserver->LinesShown() : 0) + 1); }

int SegmentGridModel::CoverShown(ConditionList& list) {
  if (!IsEditable() || mBuffer == nullptr) return 0;
  const long page = Page();
  const long start = mDs->GetBufferStart(mBuffer);
  const long held = mDs->GetBufferLength(mBuffer);
  const long lastShown = std::min(mLength, mFirst + page);
  if (mFirst >= start && lastShown <= start + held && held > 0) return 0;
  long bits = 1;
  if (int status = mDs->GetStateWidth(bits, list)) return status;
  // One block carries it all: a very wide segment holds fewer lines.
  const long fits = std::max(1L, SegmentBuffer::VectorsPerBlock(mWidth, std::max(1L, bits)));
  const long length = std::min({kScreensHeld * page, fits, mLength});
  const long from = std::clamp(mFirst - page, 0L, mLength - length);
  return mDs->SetBufferStartAndLength(mBuffer, from, length, list);
}

long SegmentGridModel::HeldVectors() const { return mDs == nullptr ? 0 : mDs->GetBufferLength(mBuffer); }
long SegmentGridModel::HeldStart() const { return mDs == nullptr ? 0 : mDs->GetBufferStart(mBuffer); }

StateRange SegmentGridModel::SelectedRange() const {
  const long lowDigit = mSelecting ? std::min(mAnchorDigit, mCursorDigit) : mCursorDigit;
  const long highDigit = mSelecting ? std::max(mAnchorDigit, mCursorDigit) : mCursorDigit;
  const long firstVector = mSelecting ? std::min(mAnchorVector, mCursorVector) : mCursorVector;
  const long lastVector = mSelecting ? std::max(mAnchorVector, mCursorVector) : mCursorVector;
  const long k = TracesPerDigit();
  return StateRange(lowDigit * k, firstVector, std::min(highDigit * k + k - 1, mWidth - 1), lastVector);
}

Dstring SegmentGridModel::CursorText() const {
  if (!IsEditable()) return mDs == nullptr ? Dstring() : Dstring("The segment is empty.");
  Dstring text = "Vector " + NumberText::Grouped(mCursorVector) + ", trace " + NumberText::Grouped(CursorTrace());
  if (mSelecting) {
    const StateRange r = SelectedRange();
    text += " \u00b7 selected: vectors " + NumberText::Grouped(r.GetFirstVector()) + "\u2013" +
            NumberText::Grouped(r.GetLastVector()) + ", traces " + NumberText::Grouped(r.GetFirstTrace()) + "\u2013" +
            NumberText::Grouped(r.GetLastTrace());
  }
  return text;
}

int SegmentGridModel::SetDataFormat(DataFormat format, ConditionList& list) {
  if (InfoOf(format).tracesPerDigit == 0) {
    list.Add(1, "The data format is not one of binary, octal and hexadecimal.");
    return 1;
  }
  // The cursor and the selection stay on the same traces.
  const long cursorTrace = CursorTrace();
  const long anchorTrace = mAnchorDigit * TracesPerDigit();
  mFormat = format;
  mCursorDigit = cursorTrace / TracesPerDigit();
  mAnchorDigit = anchorTrace / TracesPerDigit();
  mDigitOffset = 0;
  return ReadDimensions(list);
}

Dstring SegmentGridModel::GetSegmentName() const { return mDs == nullptr ? Dstring() : mDs->GetName(); }

int SegmentGridModel::GetSegmentProperties(SegmentProperties& properties, ConditionList& list) {
  return mDs == nullptr ? 0 : mDs->GetProperties(properties, list);
}

int SegmentGridModel::SaveSegment(ConditionList& list) { return mDs == nullptr ? 0 : mDs->Save(list); }

int SegmentGridModel::SaveSegmentAs(const Dstring& name, ConditionList& list) {
  if (mDs == nullptr) return 0;
  if (int status = mDs->SaveAs(name, list)) return status;
  // The editor goes on with the copy, as a word processor's Save As does.
  return HookOn(name, list);
}

bool SegmentGridModel::IsDirty() const { return mDs != nullptr && (mDs->IsDirty() || mDs->IsBufferDirty(mBuffer)); }

int SegmentGridModel::ScrollTo(long first, ConditionList& list) {
  mFirst = first;
  return CoverShown(list);
}

int SegmentGridModel::SetVectorOffset(long first, ConditionList& list) {
  return ScrollTo(std::clamp(first, 0L, std::max(0L, mLength - 1)), list);
}

void SegmentGridModel::SetDigitOffset(long first) { mDigitOffset = std::clamp(first, 0L, std::max(0L, mDigits - 1)); }

void SegmentGridModel::ShowLine(long line) {
  const long shown = std::max(1L, mObserver != nullptr ? mObserver->LinesShown() : 0);
  if (line < mFirst) {
    mFirst = line;
  } else if (line >= mFirst + shown) {
    mFirst = line - shown + 1;
  }
}

// The least movement that shows the column, or, for a jump, the column in the middle.
void SegmentGridModel::ShowColumn(long column, bool centred) {
  const long cells = mObserver != nullptr ? mObserver->DigitCellsShown() : 0;
  const long shown = std::max(1L, std::min(cells, mDigits - mDigitOffset));
  if (column >= mDigitOffset && column < mDigitOffset + shown) return;
  if (centred) {
    mDigitOffset = std::max(0L, column - shown / 2);
  } else {
    mDigitOffset = column < mDigitOffset ? column : column - shown + 1;
  }
}

void SegmentGridModel::Tell(const Dstring& text) const {
  if (mObserver != nullptr) mObserver->NfyMessage(text);
}

void SegmentGridModel::MoveCursor(long vector, long digit, bool extend) {
  if (!IsEditable()) return;
  if (extend && !mSelecting) {
    mAnchorVector = mCursorVector;
    mAnchorDigit = mCursorDigit;
  }
  mSelecting = extend;
  mCursorVector = std::clamp(vector, 0L, mLength - 1);
  mCursorDigit = std::clamp(digit, 0L, mDigits - 1);
  ShowLine(mCursorVector);
  ShowColumn(ColumnOfDigit(mCursorDigit), false);
  ConditionList list;
  if (CoverShown(list) != 0) Tell(list.ToText());
}

void SegmentGridModel::PressKey(Key key, bool extend, bool far) {
  const long page = std::max(1L, (mObserver != nullptr ? mObserver->LinesShown() : 0) - 1);
  switch (key) {
    case Key::kUp: MoveCursor(mCursorVector - 1, mCursorDigit, extend); break;
    case Key::kDown: MoveCursor(mCursorVector + 1, mCursorDigit, extend); break;
    case Key::kLeft: MoveCursor(mCursorVector, mCursorDigit + 1, extend); break;
    case Key::kRight: MoveCursor(mCursorVector, mCursorDigit - 1, extend); break;
    case Key::kPageUp: MoveCursor(mCursorVector - page, mCursorDigit, extend); break;
    case Key::kPageDown: MoveCursor(mCursorVector + page, mCursorDigit, extend); break;
    case Key::kHome: MoveCursor(far ? 0 : mCursorVector, mDigits - 1, extend); break;
    case Key::kEnd: MoveCursor(far ? mLength - 1 : mCursorVector, 0, extend); break;
  }
}

int SegmentGridModel::Type(char typed, ConditionList& list) {
  if (!IsEditable()) return 0;
  // Digits in either case; any other letter as typed, a state such as "X" or "Z".
  const char lower = typed >= 'A' && typed <= 'Z' ? static_cast<char>(typed - 'A' + 'a') : typed;
  const char digit = std::strchr(InfoOf(mFormat).digits, lower) != nullptr ? lower : typed;
  ShowLine(mCursorVector);
  if (int status = CoverShown(list)) return status;
  if (int status = mDs->SetDigit(mBuffer, mCursorVector, CursorTrace(), mFormat, digit, list)) return status;
  // On to the next digit to the right, and at the end of a vector to the next vector.
  if (mCursorDigit > 0) {
    MoveCursor(mCursorVector, mCursorDigit - 1, false);
  } else if (mCursorVector + 1 < mLength) {
    MoveCursor(mCursorVector + 1, mDigits - 1, false);
  }
  return 0;
}

int SegmentGridModel::ResetSelection() {
  mSelecting = false;
  return 0;
}

int SegmentGridModel::SetSelection(long firstVector, long lastVector, long firstDigit, long lastDigit,
                                   ConditionList& list) {
  if (!IsEditable() || firstVector < 0 || lastVector >= mLength || firstDigit < 0 || lastDigit >= mDigits ||
      firstVector > lastVector || firstDigit > lastDigit) {
    list.Add(1, Dstring::Format("The selection of vectors %ld to %ld and digits %ld to %ld is not inside the segment.",
                                firstVector, lastVector, firstDigit, lastDigit));
    return 1;
  }
  mAnchorVector = firstVector;
  mAnchorDigit = lastDigit;
  mCursorVector = lastVector;
  mCursorDigit = firstDigit;
  mSelecting = true;
  ShowLine(mCursorVector);
  return CoverShown(list);
}

int SegmentGridModel::SetVectorSelection(long first, long last, ConditionList& list) {
  return SetSelection(first, last, 0, std::max(0L, mDigits - 1), list);
}

int SegmentGridModel::SetDigitSelection(long first, long last, ConditionList& list) {
  return SetSelection(0, std::max(0L, mLength - 1), first, last, list);
}

int SegmentGridModel::GoToVectorTrace(long vector, long trace, ConditionList& list) {
  if (!IsEditable() || vector < 0 || vector >= mLength || trace < 0 || trace >= mWidth) {
    list.Add(1, Dstring::Format("Vector %ld, trace %ld is not in the segment (%ld vectors of %ld traces).", vector, trace,
                                mLength, mWidth));
    return 1;
  }
  mSelecting = false;
  mCursorVector = vector;
  mCursorDigit = trace / TracesPerDigit();
  ShowLine(vector);
  ShowColumn(ColumnOfDigit(mCursorDigit), true);
  return CoverShown(list);
}

int SegmentGridModel::MoveToError(ERR_DIR direction, ConditionList& list) {
  if (!IsEditable()) return 0;
  long vector = -1;
  long trace = -1;
  int status = 0;
  switch (direction) {
    case ERR_DIR::kFirst: status = mDs->GetFirstError(vector, trace, list); break;
    case ERR_DIR::kNext: status = mDs->GetNextError(vector, trace, mCursorVector, CursorTrace(), list); break;
    case ERR_DIR::kPrevious: status = mDs->GetPrevError(vector, trace, mCursorVector, CursorTrace(), list); break;
  }
  if (status != 0) return status;
  if (vector < 0) {
    Tell(direction == ERR_DIR::kPrevious ? "No error vector before the cursor." : "No error vector after the cursor.");
    return 0;
  }
  return GoToVectorTrace(vector, std::max(0L, trace), list);
}

int SegmentGridModel::GetIsErrorInVector(long vector, bool& error, ConditionList& list) {
  error = false;
  if (!IsEditable()) return 0;
  long found = -1;
  long trace = -1;
  if (int status = mDs->GetNextError(found, trace, vector, -1, list)) return status;
  error = found == vector;
  return 0;
}

// A pattern the format cannot read is refused in words, before anything is sent. What is found
// is selected: the digits the pattern covers on its vector (or the vectors it covers on its
// trace); a word says when the search went round the end.
int SegmentGridModel::FindPattern(FindDirection direction, VectorTrace what, ConditionList& list) {
  if (!IsFindPossible()) return 0;
  if (!IsPatternOf(mFindText, mFormat)) {
    ConditionList refused;
    long vector = -1;
    long trace = -1;
    const int status = mDs->FindPattern(vector, trace, 0, 0, mFindText, mFormat, direction, what, refused);
    // Said in words alone: it is the user's typing, not the instrument's error.
    Dstring words;
    for (const Condition& c : refused) words += (words.empty() ? "" : " ") + c.GetMessage();
    Tell(words);
    return status;
  }
  const long k = TracesPerDigit();
  // After a find the cursor's digit may start below the match: the next one starts at the match.
  const bool atFound = mFoundTrace >= 0 && mFoundVector == mCursorVector && mFoundTrace / k == mCursorDigit;
  const long fromVector = mCursorVector;
  const long fromTrace = atFound ? mFoundTrace : CursorTrace();
  long vector = -1;
  long trace = -1;
  if (int status = mDs->FindPattern(vector, trace, fromVector, fromTrace, mFindText, mFormat, direction, what, list)) {
    return status;
  }
  if (vector < 0) {
    Tell("\"" + mFindText + "\" was not found in the segment.");
    return 0;
  }
  trace = std::max(0L, trace);
  // The server searches in the order of the lines (or of the traces) and goes on round the end.
  const bool alongVectors = what == VectorTrace::kVector;
  const auto order = [&](long v, long t) { return alongVectors ? v * mWidth + t : t * mLength + v; };
  const bool wrapped = (direction == FindDirection::kNext && order(vector, trace) <= order(fromVector, fromTrace)) ||
                       (direction == FindDirection::kPrevious && order(vector, trace) >= order(fromVector, fromTrace));
  if (int status = GoToVectorTrace(vector, trace, list)) return status;
  const long span = static_cast<long>(mFindText.size()) * k;
  const long lastTrace = std::min(mWidth - 1, alongVectors ? trace + span - 1 : trace);
  const long lastVector = std::min(mLength - 1, alongVectors ? vector : vector + span - 1);
  if (int status = SetSelection(vector, lastVector, trace / k, lastTrace / k, list)) return status;
  // The cursor stays on the vector found, where the next search starts.
  mCursorVector = vector;
  mAnchorVector = lastVector;
  mFoundVector = vector;
  mFoundTrace = trace;
  if (wrapped) {
    Tell(direction == FindDirection::kPrevious ? "The search passed the start of the segment and went on from its end."
                                               : "The search passed the end of the segment and went on from its start.");
  }
  return 0;
}

int SegmentGridModel::ModifyFill(ConditionList& list) {
  return IsFillPossible() ? mDs->ModifyFill(SelectedRange(), mFillState, list) : 0;
}

int SegmentGridModel::ModifyInvert(ConditionList& list) {
  return IsInvertPossible() ? mDs->ModifyInvert(SelectedRange(), list) : 0;
}

int SegmentGridModel::ModifyMirror(MirrorMode mode, ConditionList& list) {
  return IsMirrorPossible() ? mDs->ModifyMirror(SelectedRange(), mode, list) : 0;
}

int SegmentGridModel::ModifyCopy(Dstring& text, ConditionList& list) {
  text.clear();
  if (!IsCopyPossible()) return 0;
  if (int status = mDs->ModifyCopy(SelectedRange(), list)) return status;
  return SegmentTextFile::RangeText(*mDs, mFormat, SelectedRange(), text, list);
}

bool SegmentGridModel::IsPastePossible() const {
  if (!IsEditable()) return false;
  ConditionList ignored;
  bool possible = false;
  return mDs->IsPastePossible(CursorTrace(), mCursorVector, possible, ignored) == 0 && possible;
}

int SegmentGridModel::ModifyPaste(ConditionList& list) {
  return IsEditable() ? mDs->ModifyPaste(CursorTrace(), mCursorVector, list) : 0;
}

int SegmentGridModel::PasteText(const Dstring& text, ConditionList& list) {
  if (!IsEditable()) return 0;
  if (int status = mDs->Write(list)) return status;
  const long top = std::min(CursorTrace() + TracesPerDigit() - 1, mWidth - 1);
  int status = SegmentTextFile::Paste(*mDs, mFormat, text, mCursorVector, top, list);
  // The paste went through a buffer of its own: the grid's is read again.
  if (int read = mDs->Read(mBuffer, list); status == 0) status = read;
  return status;
}

int SegmentGridModel::ModifyInsert(VectorTrace what, InsertMode mode, long count, ConditionList& list) {
  if (!IsInsertPossible()) return 0;
  const long position = what == VectorTrace::kVector ? mCursorVector : CursorTrace();
  return mDs->ModifyInsert(position, what, mode, count, list);
}

int SegmentGridModel::ModifyDelete(ConditionList& list) {
  if (!IsDeletePossible()) return 0;
  const StateRange r = SelectedRange();
  const long count = r.GetLastVector() - r.GetFirstVector() + 1;
  if (int status = mDs->ModifyDelete(r.GetFirstVector(), VectorTrace::kVector, count, DeleteMode::kNormal, list)) {
    return status;
  }
  mSelecting = false;
  mCursorVector = std::min(r.GetFirstVector(), std::max(0L, mLength - 1));
  return 0;
}

int SegmentGridModel::DeleteTraces(ConditionList& list) {
  if (!IsEditable()) return 0;
  const StateRange r = SelectedRange();
  const long count = r.GetLastTrace() - r.GetFirstTrace() + 1;
  if (count >= mWidth) {
    list.Add(1, "A segment keeps at least one trace: select fewer digits to delete.");
    return 1;
  }
  return Unselected(mDs->ModifyDelete(r.GetFirstTrace(), VectorTrace::kTrace, count, DeleteMode::kNormal, list));
}

int SegmentGridModel::ModifySerialize(Direction direction, ConditionList& list) {
  return IsSerializePossible() ? Unselected(mDs->ModifySerialize(direction, list)) : 0;
}

int SegmentGridModel::ModifyDeserialize(long width, long offset, ConditionList& list) {
  if (!IsDeserializePossible()) return 0;
  if (width < 1 || offset < 0 || offset >= mLength || width > mLength - offset) {
    list.Add(1, Dstring::Format("%ld traces from state %ld do not fit in the %ld states of the serial trace.", width,
                                offset, mLength));
    return 1;
  }
  return Unselected(mDs->ModifyDeserialize(width, offset, list));
}

// A command that reshapes the segment ends the selection; a refused one keeps it.
int SegmentGridModel::Unselected(int status) {
  if (status == 0) mSelecting = false;
  return status;
}

int SegmentGridModel::ModifyCoding(ConditionList& list) {
  if (!IsCodingPossible() || mTargetCoding.empty()) return 0;
  Dstring coding;
  if (int status = mDs->GetCoding(coding, list)) return status;
  return coding == mTargetCoding ? 0 : mDs->ConvertCoding(coding, mTargetCoding, list);
}

int SegmentGridModel::ExportText(const Dstring& path, ConditionList& list) {
  if (!IsEditable()) return 0;
  if (int status = mDs->Write(list)) return status;
  return SegmentTextFile::Export(*mDs, mFormat, path, list);
}

int SegmentGridModel::ExportVcd(const Dstring& path, ConditionList& list) {
  if (!IsEditable()) return 0;
  if (int status = mDs->Write(list)) return status;
  return SegmentVcdWriter::WriteFile(*mDs, path, list);
}

int SegmentGridModel::ImportText(const Dstring& path, ConditionList& list) {
  if (mDs == nullptr) return 0;
  if (int status = mDs->Write(list)) return status;
  int status = SegmentTextFile::Import(*mDs, mFormat, path, list);
  // The grid's own window was not part of the import: it reads what the server now holds.
  if (int read = ReadDimensions(list); status == 0) status = read;
  if (int read = mDs->Read(mBuffer, list); status == 0) status = read;
  return status;
}

Dstring SegmentGridModel::ColumnHeader(long column) const {
  const long digit = DigitAtColumn(column);
  // Once trace numbers take two figures, every other digit is labelled, so that they do not collide.
  const bool wide = (mDigits - 1) * TracesPerDigit() >= 10;
  if (digit < 0 || (wide && digit % 2 != 0)) return {};
  return Dstring::Format("%ld", digit * TracesPerDigit());
}

Dstring SegmentGridModel::AddressText(long line) const {
  return Dstring::Format(mAddrFormat == AddrFormat::kHex ? "%lX" : "%ld", line);
}

SegmentGridModel::Cell SegmentGridModel::CellAt(long line, long column) const {
  Cell out;
  const long digit = DigitAtColumn(column);
  if (mDs == nullptr || digit < 0) return out;
  const StateRange r = SelectedRange();
  const long k = TracesPerDigit();
  out.cursor = line == mCursorVector && digit == mCursorDigit;
  out.selected = mSelecting && line >= r.GetFirstVector() && line <= r.GetLastVector() &&
                 digit * k >= r.GetFirstTrace() && digit * k <= r.GetLastTrace();
  const long start = mDs->GetBufferStart(mBuffer);
  if (line < start || line >= start + mDs->GetBufferLength(mBuffer)) return out;
  char ch = 0;
  ConditionList ignored;
  if (mDs->DigitOf(mBuffer, line, digit * k, mFormat, ch, ignored) == 0) out.text = ch;
  return out;
}

bool SegmentGridModel::EndsGroup(long column) const {
  const long digit = DigitAtColumn(column);
  return digit > 0 && digit % kDigitsPerGroup == 0;
}

void SegmentGridModel::PressCell(long line, long column, bool extend) {
  MoveCursor(line, DigitAtColumn(column), extend);
}

int SegmentGridModel::PressAddress(long line, bool extend, ConditionList& list) {
  return SetVectorSelection(extend ? std::min(mAnchorVector, line) : line, extend ? std::max(mAnchorVector, line) : line,
                            list);
}
