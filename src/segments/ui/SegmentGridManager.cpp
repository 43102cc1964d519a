#include "segments/ui/SegmentGridManager.h"

#include <QClipboard>
#include <QGuiApplication>
#include <QKeyEvent>
#include <QPainter>
#include <QStringList>
#include <algorithm>
#include <cstring>

#include "data/QenDsView.h"
#include "instrument/QenGuiInst.h"
#include "segments/QenSegmentDs.h"
#include "segments/QenSegmentPool.h"
#include "segments/SegmentBuffer.h"
#include "segments/SegmentTextFile.h"
#include "segments/SegmentVcdWriter.h"
#include "segments/ui/GridDisp.h"
#include "support/FWBlocker.h"
#include "support/NumberText.h"
#include "toolkit/qt/WidgetClassTable.h"

namespace {

// The buffer holds this many screens of lines around the ones shown.
constexpr long kScreensHeld = 4;

QString TextOf(const ConditionList& list) { return QString::fromStdString(list.ToText()).trimmed(); }

}  // namespace

// Another editor or client changed the segment: its dimensions may have changed too. When
// another client changed it under digits typed here, nothing was read: the buffer still holds
// them, and the window asks the user what to do.
class SegmentGridManager::View : public QenDsView {
 public:
  explicit View(SegmentGridManager& grid) : mGrid(grid) {}
  int NfyViewDataUpdated(QenDs* source, ConditionList& list) override {
    if (static_cast<QenSegmentDs*>(source)->GetChangeKind() == QenSegmentDs::kChangedElsewhere) {
      emit mGrid.ChangedElsewhere();
      emit mGrid.StateChanged();
      return 0;
    }
    const int status = mGrid.ReadDimensions(list);
    mGrid.Refresh();
    emit mGrid.StateChanged();
    return status;
  }

 private:
  SegmentGridManager& mGrid;
};

SegmentGridManager::SegmentGridManager(QWidget* parent) : GridManager(parent), mView(std::make_unique<View>(*this)) {
  setObjectName(QString::fromLatin1(Class()));
}

// A grid that goes must let go of the segment whatever happens: what could not be written is
// said, and the view leaves the source, which would otherwise tell a grid that is gone.
SegmentGridManager::~SegmentGridManager() {
  ConditionList list;
  if (Release(list) == 0) return;
  QenGuiInst::ShowErrorDlg(list, 1);
  ConditionList ignored;
  mDs->Close(ignored);
  mDs->DestroyBuffer(mBuffer, ignored);
  QenSegmentPool::UnregisterView(mDs, mView.get(), ignored);
}

void SegmentGridManager::CppRegister() {
  WidgetClassTable::AddFactory(Class(), [](QWidget* parent) -> QWidget* { return new SegmentGridManager(parent); });
}

int SegmentGridManager::Release(ConditionList& list) {
  if (mDs == nullptr) return 0;
  // What was typed goes to the server before the segment is let go; a refusal keeps it here.
  if (int status = mDs->Write(list)) return status;
  int status = mDs->Close(list);
  mDs->DestroyBuffer(mBuffer, list);
  QenSegmentPool::UnregisterView(mDs, mView.get(), list);
  mDs = nullptr;
  mBuffer = nullptr;
  mLength = mWidth = mDigits = 0;
  mFirst = mDigitOffset = mCursorVector = mCursorDigit = 0;
  mFoundVector = mFoundTrace = -1;
  mSelecting = false;
  Refresh();
  emit StateChanged();
  return status;
}

int SegmentGridManager::HookOn(long, long, const Dstring& segment, ConditionList& list) {
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
    mDs = nullptr;
    mBuffer = nullptr;
    return status;
  }
  // Reading the dimensions also moves the buffer over the lines shown.
  status = ReadDimensions(list);
  // The cursor starts on the first vector's most significant digit, where typing reads left to right.
  mCursorVector = 0;
  mCursorDigit = std::max(0L, mDigits - 1);
  Refresh();
  emit StateChanged();
  return status;
}

int SegmentGridManager::ReadDimensions(ConditionList& list) {
  if (mDs == nullptr) return 0;
  if (int status = mDs->GetLength(mLength, list, true)) return status;
  if (int status = mDs->GetWidth(mWidth, list, true)) return status;
  mDigits = mWidth > 0 ? QenSegmentDs::MaxDigitOf(mFormat, mWidth) + 1 : 0;
  mCursorVector = std::clamp(mCursorVector, 0L, std::max(0L, mLength - 1));
  mCursorDigit = std::clamp(mCursorDigit, 0L, std::max(0L, mDigits - 1));
  mAnchorVector = std::clamp(mAnchorVector, 0L, std::max(0L, mLength - 1));
  mAnchorDigit = std::clamp(mAnchorDigit, 0L, std::max(0L, mDigits - 1));
  mFirst = std::clamp(mFirst, 0L, std::max(0L, mLength - 1));
  mDigitOffset = std::clamp(mDigitOffset, 0L, std::max(0L, mDigits - 1));
  return CoverShown(list);
}

int SegmentGridManager::CoverShown(ConditionList& list) {
  if (mDs == nullptr || mBuffer == nullptr || mLength == 0 || mWidth == 0) return 0;
  const long page = std::max(1L, VisibleLines() + 1);
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

long SegmentGridManager::HeldVectors() const { return mDs == nullptr ? 0 : mDs->GetBufferLength(mBuffer); }

QString SegmentGridManager::LockedText() {
  return QStringLiteral("Another client holds the instrument: nothing was changed, and your edits are kept.");
}

int SegmentGridManager::TracesPerDigit() const { return InfoOf(mFormat).tracesPerDigit; }

StateRange SegmentGridManager::SelectedRange() const {
  const long lowDigit = mSelecting ? std::min(mAnchorDigit, mCursorDigit) : mCursorDigit;
  const long highDigit = mSelecting ? std::max(mAnchorDigit, mCursorDigit) : mCursorDigit;
  const long firstVector = mSelecting ? std::min(mAnchorVector, mCursorVector) : mCursorVector;
  const long lastVector = mSelecting ? std::max(mAnchorVector, mCursorVector) : mCursorVector;
  const long k = TracesPerDigit();
  return StateRange(lowDigit * k, firstVector, std::min(highDigit * k + k - 1, mWidth - 1), lastVector);
}

QString SegmentGridManager::CursorText() const {
  if (!IsEditable()) return mDs == nullptr ? QString() : QStringLiteral("The segment is empty.");
  const StateRange r = SelectedRange();
  const auto grouped = [](long n) { return QString::fromStdString(NumberText::Grouped(n)); };
  QString text = QStringLiteral("Vector %1, trace %2")
                     .arg(grouped(mCursorVector), grouped(mCursorDigit * TracesPerDigit()));
  if (mSelecting) {
    text += QStringLiteral(" · selected: vectors %1–%2, traces %3–%4")
                .arg(grouped(r.GetFirstVector()), grouped(r.GetLastVector()), grouped(r.GetFirstTrace()),
                     grouped(r.GetLastTrace()));
  }
  return text;
}

void SegmentGridManager::GetNumDigits(long, long& count) { count = mDigits; }
void SegmentGridManager::GetNumVectors(long, long& count) { count = mLength; }
long SegmentGridManager::GetNumDispVectors(long) { return std::min(mLength - mFirst, VisibleLines()); }

long SegmentGridManager::GetNumDispDigits(long) {
  for (const GridDisp* disp : Disps()) {
    if (disp->GetKind() == GridDisp::Kind::kDigit) return std::min<long>(disp->CellsShown(), mDigits - mDigitOffset);
  }
  return 0;
}

int SegmentGridManager::GetDataFormat(long) { return static_cast<int>(mFormat); }

int SegmentGridManager::SetDataFormat(long, DataFormat format, ConditionList& list) {
  if (InfoOf(format).tracesPerDigit == 0) {
    list.Add(1, "The data format is not one of binary, octal and hexadecimal.");
    return 1;
  }
  // The cursor and the selection stay on the same traces.
  const long cursorTrace = mCursorDigit * TracesPerDigit();
  const long anchorTrace = mAnchorDigit * TracesPerDigit();
  mFormat = format;
  mCursorDigit = cursorTrace / TracesPerDigit();
  mAnchorDigit = anchorTrace / TracesPerDigit();
  mDigitOffset = 0;
  const int status = ReadDimensions(list);
  Refresh();
  emit StateChanged();
  return status;
}

int SegmentGridManager::SetAddrFormat(AddrFormat format, ConditionList&) {
  mAddrFormat = format;
  Refresh();
  return 0;
}

int SegmentGridManager::GetSegmentProperties(long, long, SegmentProperties& properties, ConditionList& list) {
  return mDs == nullptr ? 0 : mDs->GetProperties(properties, list);
}

int SegmentGridManager::GetSegmentName(long, long, Dstring& name, ConditionList&) {
  name = mDs == nullptr ? Dstring() : mDs->GetName();
  return 0;
}

int SegmentGridManager::SaveSegment(long, long, ConditionList& list) {
  const int status = mDs == nullptr ? 0 : mDs->Save(list);
  emit StateChanged();
  return status;
}

int SegmentGridManager::SaveSegmentAs(long row, long column, const Dstring& name, ConditionList& list) {
  if (mDs == nullptr) return 0;
  if (int status = mDs->SaveAs(name, list)) return status;
  // The editor goes on with the copy, as a word processor's Save As does.
  return HookOn(row, column, name, list);
}

bool SegmentGridManager::IsDirty() { return mDs != nullptr && (mDs->IsDirty() || mDs->IsBufferDirty(mBuffer)); }

int SegmentGridManager::ExportText(const Dstring& path, ConditionList& list) {
  if (!IsEditable()) return 0;
  if (int status = mDs->Write(list)) return status;
  return SegmentTextFile::Export(*mDs, mFormat, path, list);
}

int SegmentGridManager::ExportVcd(const Dstring& path, ConditionList& list) {
  if (!IsEditable()) return 0;
  if (int status = mDs->Write(list)) return status;
  return SegmentVcdWriter::WriteFile(*mDs, path, list);
}

int SegmentGridManager::ImportText(const Dstring& path, ConditionList& list) {
  if (mDs == nullptr) return 0;
  if (int status = mDs->Write(list)) return status;
  int status = SegmentTextFile::Import(*mDs, mFormat, path, list);
  // The grid's own window was not part of the import: it reads what the server now holds.
  if (int read = ReadDimensions(list); status == 0) status = read;
  if (int read = mDs->Read(mBuffer, list); status == 0) status = read;
  Refresh();
  emit StateChanged();
  return status;
}

int SegmentGridManager::SetVectorOffset(long, long first, ConditionList& list) {
  mFirst = std::clamp(first, 0L, std::max(0L, mLength - 1));
  const int status = CoverShown(list);
  Refresh();
  return status;
}

int SegmentGridManager::SetDigitOffset(long, long first, ConditionList&) {
  mDigitOffset = std::clamp(first, 0L, std::max(0L, mDigits - 1));
  Refresh();
  return 0;
}

int SegmentGridManager::ValidateSbDigit(ConditionList& list) { return SetDigitOffset(0, mDigitOffset, list); }
int SegmentGridManager::ValidateSbAddr(ConditionList& list) { return SetVectorOffset(0, mFirst, list); }

int SegmentGridManager::ResetSelection(ConditionList&) {
  mSelecting = false;
  Refresh();
  emit StateChanged();
  return 0;
}

int SegmentGridManager::SetSelection(long, long firstVector, long lastVector, long firstDigit, long lastDigit, long,
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
  const int status = CoverShown(list);
  Refresh();
  emit StateChanged();
  return status;
}

int SegmentGridManager::SetVectorSelection(long row, long first, long last, ConditionList& list) {
  return SetSelection(row, first, last, 0, std::max(0L, mDigits - 1), 0, list);
}

int SegmentGridManager::SetDigitSelection(long row, long first, long last, ConditionList& list) {
  return SetSelection(row, 0, std::max(0L, mLength - 1), first, last, 0, list);
}

int SegmentGridManager::GoToVectorTrace(long vector, long trace, ConditionList& list) {
  if (!IsEditable() || vector < 0 || vector >= mLength || trace < 0 || trace >= mWidth) {
    list.Add(1, Dstring::Format("Vector %ld, trace %ld is not in the segment (%ld vectors of %ld traces).", vector, trace,
                                mLength, mWidth));
    return 1;
  }
  mSelecting = false;
  mCursorVector = vector;
  mCursorDigit = trace / TracesPerDigit();
  ShowLine(vector);
  const long shown = std::max(1L, GetNumDispDigits(0));
  const long column = ColumnOf(mCursorDigit);
  if (column < mDigitOffset || column >= mDigitOffset + shown) mDigitOffset = std::max(0L, column - shown / 2);
  const int status = CoverShown(list);
  Refresh();
  emit StateChanged();
  return status;
}

bool SegmentGridManager::CanShowGoto() { return IsEditable(); }
bool SegmentGridManager::CanMoveToError(ERR_DIR) { return IsEditable(); }

int SegmentGridManager::MoveToError(ERR_DIR direction, ConditionList& list) {
  if (!IsEditable()) return 0;
  long vector = -1;
  long trace = -1;
  const long fromTrace = mCursorDigit * TracesPerDigit();
  int status = 0;
  switch (direction) {
    case ERR_DIR::kFirst: status = mDs->GetFirstError(vector, trace, list); break;
    case ERR_DIR::kNext: status = mDs->GetNextError(vector, trace, mCursorVector, fromTrace, list); break;
    case ERR_DIR::kPrevious: status = mDs->GetPrevError(vector, trace, mCursorVector, fromTrace, list); break;
  }
  if (status != 0) return status;
  if (vector < 0) {
    emit Message(QStringLiteral("No error vector %1.").arg(direction == ERR_DIR::kPrevious ? QStringLiteral("before the cursor")
                                                                                           : QStringLiteral("after the cursor")));
    return 0;
  }
  return GoToVectorTrace(vector, std::max(0L, trace), list);
}

int SegmentGridManager::GetIsErrorInVector(long vector, bool& error, ConditionList& list) {
  error = false;
  if (!IsEditable()) return 0;
  long found = -1;
  long trace = -1;
  if (int status = mDs->GetNextError(found, trace, vector, -1, list)) return status;
  error = found == vector;
  return 0;
}

// A pattern the format cannot read is refused in the line below the grid, before anything is
// sent. What is found is selected: the digits the pattern covers on its vector (or the vectors
// it covers on its trace); the line says when the search went round the end.
int SegmentGridManager::FindPattern(FindDirection direction, VectorTrace what, ConditionList& list) {
  if (!IsFindPossible()) return 0;
  if (!IsPatternOf(mFindText, mFormat)) {
    ConditionList refused;
    long vector = -1;
    long trace = -1;
    const int status = mDs->FindPattern(vector, trace, 0, 0, mFindText, mFormat, direction, what, refused);
    // Said in words alone: it is the user's typing, not the instrument's error.
    QStringList words;
    for (const Condition& c : refused) words << QString::fromStdString(c.GetMessage());
    emit Message(words.join(QLatin1Char(' ')));
    return status;
  }
  const long k = TracesPerDigit();
  // After a find the cursor's digit may start below the match: the next one starts at the match.
  const bool atFound = mFoundTrace >= 0 && mFoundVector == mCursorVector && mFoundTrace / k == mCursorDigit;
  const long fromVector = mCursorVector;
  const long fromTrace = atFound ? mFoundTrace : mCursorDigit * k;
  long vector = -1;
  long trace = -1;
  if (int status =
          mDs->FindPattern(vector, trace, fromVector, fromTrace, mFindText, mFormat, direction, what, list)) {
    return status;
  }
  if (vector < 0) {
    emit Message(
        QStringLiteral("\"%1\" was not found in the segment.").arg(QString::fromStdString(mFindText)));
    return 0;
  }
  trace = std::max(0L, trace);
  // The server searches in the order of the lines (or of the traces) and goes on round the end.
  const bool alongVectors = what == VectorTrace::kVector;
  const auto order = [&](long v, long t) { return alongVectors ? v * mWidth + t : t * mLength + v; };
  const bool wrapped =
      (direction == FindDirection::kNext && order(vector, trace) <= order(fromVector, fromTrace)) ||
      (direction == FindDirection::kPrevious && order(vector, trace) >= order(fromVector, fromTrace));
  if (int status = GoToVectorTrace(vector, trace, list)) return status;
  const long span = static_cast<long>(mFindText.size()) * k;
  const long lastTrace = std::min(mWidth - 1, alongVectors ? trace + span - 1 : trace);
  const long lastVector = std::min(mLength - 1, alongVectors ? vector : vector + span - 1);
  if (int status = SetSelection(0, vector, lastVector, trace / k, lastTrace / k, 0, list)) return status;
  // The cursor stays on the vector found, where the next search starts.
  mCursorVector = vector;
  mAnchorVector = lastVector;
  mFoundVector = vector;
  mFoundTrace = trace;
  Refresh();
  emit StateChanged();
  if (wrapped) {
    emit Message(
        direction == FindDirection::kPrevious
            ? QStringLiteral("The search passed the start of the segment and went on from its end.")
            : QStringLiteral("The search passed the end of the segment and went on from its start."));
  }
  return 0;
}

int SegmentGridManager::ModifyFill(ConditionList& list) {
  return IsEditable() ? mDs->ModifyFill(SelectedRange(), mFillState, list) : 0;
}

int SegmentGridManager::ModifyInvert(ConditionList& list) { return IsEditable() ? mDs->ModifyInvert(SelectedRange(), list) : 0; }

int SegmentGridManager::ModifyMirror(MirrorMode mode, ConditionList& list) {
  return IsMirrorPossible() ? mDs->ModifyMirror(SelectedRange(), mode, list) : 0;
}

int SegmentGridManager::ModifyCopy(ConditionList& list) {
  if (!IsEditable()) return 0;
  if (int status = mDs->ModifyCopy(SelectedRange(), list)) return status;
  Dstring text;
  if (int status = SegmentTextFile::RangeText(*mDs, mFormat, SelectedRange(), text, list)) return status;
  QGuiApplication::clipboard()->setText(QString::fromStdString(text));
  return 0;
}

int SegmentGridManager::PasteText(ConditionList& list) {
  if (!IsEditable()) return 0;
  if (int status = mDs->Write(list)) return status;
  const long top = std::min(mCursorDigit * TracesPerDigit() + TracesPerDigit() - 1, mWidth - 1);
  int status = SegmentTextFile::Paste(*mDs, mFormat, QGuiApplication::clipboard()->text().toStdString(), mCursorVector, top, list);
  // The paste went through a buffer of its own: the grid's is read again.
  if (int read = mDs->Read(mBuffer, list); status == 0) status = read;
  Refresh();
  emit StateChanged();
  return status;
}

bool SegmentGridManager::IsPastePossible() {
  if (!IsEditable()) return false;
  ConditionList ignored;
  bool possible = false;
  return mDs->IsPastePossible(mCursorDigit * TracesPerDigit(), mCursorVector, possible, ignored) == 0 && possible;
}

int SegmentGridManager::ModifyPaste(ConditionList& list) {
  return IsEditable() ? mDs->ModifyPaste(mCursorDigit * TracesPerDigit(), mCursorVector, list) : 0;
}

int SegmentGridManager::ModifyInsert(VectorTrace what, InsertMode mode, long count, ConditionList& list) {
  if (mDs == nullptr) return 0;
  const long position = what == VectorTrace::kVector ? mCursorVector : mCursorDigit * TracesPerDigit();
  return mDs->ModifyInsert(position, what, mode, count, list);
}

// The selected vectors go, whole; the vectors after them close up.
int SegmentGridManager::ModifyDelete(ConditionList& list) {
  if (!IsDeletePossible()) return 0;
  const StateRange r = SelectedRange();
  const long count = r.GetLastVector() - r.GetFirstVector() + 1;
  mSelecting = false;
  mCursorVector = r.GetFirstVector();
  return mDs->ModifyDelete(r.GetFirstVector(), VectorTrace::kVector, count, DeleteMode::kNormal, list);
}

int SegmentGridManager::DeleteTraces(ConditionList& list) {
  if (!IsEditable()) return 0;
  const StateRange r = SelectedRange();
  if (r.GetLastTrace() - r.GetFirstTrace() + 1 >= mWidth) {
    list.Add(1, "A segment keeps at least one trace: select fewer digits to delete.");
    return 1;
  }
  mSelecting = false;
  return mDs->ModifyDelete(r.GetFirstTrace(), VectorTrace::kTrace, r.GetLastTrace() - r.GetFirstTrace() + 1, DeleteMode::kNormal,
                           list);
}

int SegmentGridManager::ModifySerialize(Direction direction, ConditionList& list) {
  if (!IsSerializePossible()) return 0;
  mSelecting = false;
  return mDs->ModifySerialize(direction, list);
}

int SegmentGridManager::ModifyDeserialize(long width, long offset, ConditionList& list) {
  if (!IsDeserializePossible()) return 0;
  if (width < 1 || offset < 0 || offset >= mLength || width > mLength - offset) {
    list.Add(1, Dstring::Format("%ld traces from state %ld do not fit in the %ld states of the serial trace.", width, offset, mLength));
    return 1;
  }
  mSelecting = false;
  return mDs->ModifyDeserialize(width, offset, list);
}

int SegmentGridManager::ModifyCoding(ConditionList& list) {
  if (!IsCodingPossible() || mTargetCoding.empty()) return 0;
  Dstring coding;
  if (int status = mDs->GetCoding(coding, list)) return status;
  return coding == mTargetCoding ? 0 : mDs->ConvertCoding(coding, mTargetCoding, list);
}

void SegmentGridManager::DispScrollTo(long firstLine) {
  mFirst = firstLine;
  ConditionList list;
  if (CoverShown(list) != 0) emit Message(TextOf(list));
}

QString SegmentGridManager::DispHeader(const GridDisp& disp, int cell) const {
  if (disp.GetKind() != GridDisp::Kind::kDigit) return disp.GetKind() == GridDisp::Kind::kAddr ? QStringLiteral("Vector") : QString();
  const long digit = DigitAt(mDigitOffset + cell);
  // Once trace numbers take two figures, every other digit is labelled, so that they do not collide.
  const bool wide = (mDigits - 1) * TracesPerDigit() >= 10;
  if (digit < 0 || (wide && digit % 2 != 0)) return {};
  return QString::number(digit * TracesPerDigit());
}

GridCell SegmentGridManager::DispCell(const GridDisp& disp, long line, int cell) const {
  GridCell out;
  if (disp.GetKind() == GridDisp::Kind::kAddr) {
    out.text = mAddrFormat == AddrFormat::kHex ? QString::number(line, 16).toUpper() : QString::number(line);
    out.selected = line == mCursorVector;
    return out;
  }
  if (disp.GetKind() != GridDisp::Kind::kDigit || mDs == nullptr) return out;
  const long digit = DigitAt(mDigitOffset + cell);
  if (digit < 0) return out;
  const StateRange r = SelectedRange();
  const long k = TracesPerDigit();
  out.cursor = line == mCursorVector && digit == mCursorDigit;
  out.selected = mSelecting && line >= r.GetFirstVector() && line <= r.GetLastVector() && digit * k >= r.GetFirstTrace() &&
                 digit * k <= r.GetLastTrace();
  const long start = mDs->GetBufferStart(mBuffer);
  if (line < start || line >= start + mDs->GetBufferLength(mBuffer)) return out;
  char ch = ' ';
  ConditionList ignored;
  if (mDs->DigitOf(mBuffer, line, digit * k, mFormat, ch, ignored) != 0) return out;
  out.text = QString(QChar::fromLatin1(ch));
  out.marked = ch == '!';
  return out;
}

void SegmentGridManager::DispPaint(const GridDisp& disp, QPainter& painter, const QRect& area) const {
  GridManager::DispPaint(disp, painter, area);
  if (disp.GetKind() != GridDisp::Kind::kDigit || IsEditable()) return;
  const QString hint = mDs == nullptr ? QStringLiteral("Choose a segment from the list, or make one with New…")
                                      : QStringLiteral("The segment has no vectors: Edit > Insert Vectors… adds some.");
  painter.setPen(disp.palette().color(QPalette::Disabled, QPalette::Text));
  painter.drawText(disp.rect().adjusted(12, GetOffY() + 12, -12, -12), Qt::AlignLeft | Qt::AlignTop | Qt::TextWordWrap, hint);
}

int SegmentGridManager::DispGap(const GridDisp& disp, int cell) const {
  if (disp.GetKind() != GridDisp::Kind::kDigit) return 0;
  const long digit = DigitAt(mDigitOffset + cell);
  return digit > 0 && digit % kDigitsPerGroup == 0 ? GetDX() / 2 : 0;
}

void SegmentGridManager::DispPress(const GridDisp& disp, long line, int cell, Qt::KeyboardModifiers modifiers) {
  const bool extend = (modifiers & Qt::ShiftModifier) != 0;
  if (disp.GetKind() == GridDisp::Kind::kDigit) {
    MoveCursor(line, DigitAt(mDigitOffset + cell), extend);
  } else {
    // A click on the address selects the whole vector.
    ConditionList list;
    if (SetVectorSelection(0, extend ? std::min(mAnchorVector, line) : line, extend ? std::max(mAnchorVector, line) : line, list) != 0) {
      emit Message(TextOf(list));
    }
  }
}

void SegmentGridManager::DispMove(const GridDisp& disp, long line, int cell) {
  if (disp.GetKind() == GridDisp::Kind::kDigit) MoveCursor(line, DigitAt(mDigitOffset + cell), true);
}

void SegmentGridManager::MoveCursor(long vector, long digit, bool extend) {
  if (!IsEditable()) return;
  if (extend && !mSelecting) {
    mAnchorVector = mCursorVector;
    mAnchorDigit = mCursorDigit;
  }
  mSelecting = extend;
  mCursorVector = std::clamp(vector, 0L, mLength - 1);
  mCursorDigit = std::clamp(digit, 0L, mDigits - 1);
  ShowLine(mCursorVector);
  const long shown = std::max(1L, GetNumDispDigits(0));
  const long column = ColumnOf(mCursorDigit);
  if (column < mDigitOffset) mDigitOffset = column;
  if (column >= mDigitOffset + shown) mDigitOffset = column - shown + 1;
  Refresh();
  emit StateChanged();
}

void SegmentGridManager::TypeDigit(char digit) {
  if (!IsEditable()) return;
  ConditionList list;
  ShowLine(mCursorVector);
  int status = CoverShown(list);
  if (status == 0) status = mDs->SetDigit(mBuffer, mCursorVector, mCursorDigit * TracesPerDigit(), mFormat, digit, list);
  if (status != 0) {
    emit Message(status == FWBlocker::kLocked ? LockedText() : TextOf(list));
    return;
  }
  // On to the next digit to the right, and at the end of a vector to the next vector.
  if (mCursorDigit > 0) {
    MoveCursor(mCursorVector, mCursorDigit - 1, false);
  } else if (mCursorVector + 1 < mLength) {
    MoveCursor(mCursorVector + 1, mDigits - 1, false);
  } else {
    Refresh();
    emit StateChanged();
  }
}

void SegmentGridManager::keyPressEvent(QKeyEvent* event) {
  const bool extend = (event->modifiers() & Qt::ShiftModifier) != 0;
  const bool far = (event->modifiers() & Qt::ControlModifier) != 0;
  const long page = std::max(1L, VisibleLines() - 1);
  switch (event->key()) {
    case Qt::Key_Up: MoveCursor(mCursorVector - 1, mCursorDigit, extend); break;
    case Qt::Key_Down: MoveCursor(mCursorVector + 1, mCursorDigit, extend); break;
    case Qt::Key_Left: MoveCursor(mCursorVector, mCursorDigit + 1, extend); break;
    case Qt::Key_Right: MoveCursor(mCursorVector, mCursorDigit - 1, extend); break;
    case Qt::Key_PageUp: MoveCursor(mCursorVector - page, mCursorDigit, extend); break;
    case Qt::Key_PageDown: MoveCursor(mCursorVector + page, mCursorDigit, extend); break;
    case Qt::Key_Home: MoveCursor(far ? 0 : mCursorVector, mDigits - 1, extend); break;
    case Qt::Key_End: MoveCursor(far ? mLength - 1 : mCursorVector, 0, extend); break;
    case Qt::Key_Escape: {
      ConditionList list;
      ResetSelection(list);
      break;
    }
    default: {
      const QString text = event->text();
      // Keys with Ctrl, Alt or Meta are commands (menus, shortcuts), never typed.
      const bool command = (event->modifiers() & (Qt::ControlModifier | Qt::AltModifier | Qt::MetaModifier)) != 0;
      if (text.size() == 1 && text[0].isPrint() && !command) {
        // Digits in either case; any other letter as typed, a state such as "X" or "Z".
        const char lower = text[0].toLower().toLatin1();
        TypeDigit(lower != '\0' && std::strchr(InfoOf(mFormat).digits, lower) != nullptr ? lower : text[0].toLatin1());
        break;
      }
      GridManager::keyPressEvent(event);
      return;
    }
  }
  event->accept();
}

void SegmentGridManager::resizeEvent(QResizeEvent* event) {
  GridManager::resizeEvent(event);
  ConditionList list;
  if (CoverShown(list) != 0) emit Message(TextOf(list));
}
