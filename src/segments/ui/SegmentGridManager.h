#pragma once

#include <memory>

#include "segments/StateRange.h"
#include "segments/ui/GridManager.h"

class QenSegmentDs;
class SegmentBuffer;

// The segment grid: a line per vector of one segment, its address (AddrDisp) and its traces as
// digits of the data format (DigitDisp), the most significant digit on the left, so a line reads
// as a number. It holds one buffer of the segment, a few screens of vectors around the lines
// shown, and moves it only when the lines shown leave it: scrolling reads one page at a time,
// and a jump anywhere in a long segment costs one round trip whatever its length.
//
// Typing a digit of the format sets the digit under the cursor (the buffer becomes dirty and is
// written back before any command, move or save); a character the format does not know is
// refused with a message. Shift with the arrow keys or a drag selects a rectangle of vectors and
// digits, which fill, invert, mirror, copy, delete and find work on.
class SegmentGridManager : public GridManager {
  Q_OBJECT

 public:
  explicit SegmentGridManager(QWidget* parent = nullptr);
  ~SegmentGridManager() override;

  // Offers "SegmentGridManager" to the resource loader.
  static void CppRegister();
  static const char* Class() { return "SegmentGridManager"; }

  QenSegmentDs* GetSegmentDs() const { return mDs; }
  // Lets go of the segment: closes it (pending edits are written first) and frees the source.
  int Release(ConditionList& list);
  long CursorVector() const { return mCursorVector; }
  long CursorDigit() const { return mCursorDigit; }
  long CursorTrace() const { return mCursorDigit * TracesPerDigit(); }
  // A segment with states is open.
  bool IsEditable() const { return mDs != nullptr && mLength > 0 && mWidth > 0; }
  bool HasSelection() const { return mSelecting; }
  // How many vectors the grid holds of the segment: a few screens, whatever its length.
  long HeldVectors() const;
  // The selection (or the cursor's digit) as traces and vectors.
  StateRange SelectedRange() const;
  // What fill writes: a state number of the coding (0 the first state, 1 the second).
  void SetFillState(long state) { mFillState = state; }
  // The coding ModifyCoding converts the segment to ("01X").
  void SetTargetCoding(const Dstring& coding) { mTargetCoding = coding; }
  // Deletes the traces of the selected digits (or of the cursor's digit); the traces above close up.
  int DeleteTraces(ConditionList& list);
  // What find looks for: a number in the data format, 'x' digits matching anything.
  void SetFindText(const Dstring& text) { mFindText = text; }
  // What the user reads when an edit meets another client's lock.
  static QString LockedText();
  // Text of the buffer's digits under the cursor for the status line.
  QString CursorText() const;

  // The segment as text in the grid's data format, or as a Value Change Dump; what was typed
  // goes to the server first. An import that does not fit is refused whole.
  int ExportText(const Dstring& path, ConditionList& list);
  int ImportText(const Dstring& path, ConditionList& list);
  int ExportVcd(const Dstring& path, ConditionList& list);
  // The system clipboard's text pasted at the cursor, in the text form of the export; Copy puts
  // the selection there too, so patterns travel to and from other programs.
  int PasteText(ConditionList& list);

  // The segment grid's own operations after the base's.
  virtual int ValidateSbDigit(ConditionList& list);
  virtual int ValidateSbAddr(ConditionList& list);
  virtual int MoveToError(ERR_DIR direction, ConditionList& list);
  virtual bool CanMoveToError(ERR_DIR direction);
  virtual int GoToVectorTrace(long vector, long trace, ConditionList& list);
  virtual int GetIsErrorInVector(long vector, bool& error, ConditionList& list);
  virtual bool CanShowGoto();
  using GridManager::GetIsErrorInVector;

  void GetNumDigits(long row, long& count) override;
  void GetNumVectors(long row, long& count) override;
  long GetNumDispDigits(long row) override;
  long GetNumDispVectors(long row) override;
  int GetAddrFormat() override { return static_cast<int>(mAddrFormat); }
  int GetDataFormat(long row) override;
  int SetDataFormat(long row, DataFormat format, ConditionList& list) override;
  int SetAddrFormat(AddrFormat format, ConditionList& list) override;
  int GetSegmentProperties(long row, long column, SegmentProperties& properties, ConditionList& list) override;
  int HookOn(long row, long column, const Dstring& segment, ConditionList& list) override;
  int GetSegmentName(long row, long column, Dstring& name, ConditionList& list) override;
  int SaveSegment(long row, long column, ConditionList& list) override;
  int SaveSegmentAs(long row, long column, const Dstring& name, ConditionList& list) override;
  int SetVectorOffset(long row, long first, ConditionList& list) override;
  int SetDigitOffset(long row, long first, ConditionList& list) override;
  void GetVectorOffset(long, long& value) override { value = mFirst; }
  void GetDigitOffset(long, long& value) override { value = mDigitOffset; }
  int ResetSelection(ConditionList& list) override;
  // Row (ignored: one segment), first and last vector, first and last digit, column (ignored).
  int SetSelection(long a, long b, long c, long d, long e, long f, ConditionList& list) override;
  int SetVectorSelection(long row, long first, long last, ConditionList& list) override;
  int SetDigitSelection(long row, long first, long last, ConditionList& list) override;
  int FindPattern(FindDirection direction, VectorTrace what, ConditionList& list) override;
  int ModifyFill(ConditionList& list) override;
  int ModifyInvert(ConditionList& list) override;
  int ModifyMirror(MirrorMode mode, ConditionList& list) override;
  int ModifyCopy(ConditionList& list) override;
  int ModifyPaste(ConditionList& list) override;
  int ModifyInsert(VectorTrace what, InsertMode mode, long count, ConditionList& list) override;
  int ModifyDelete(ConditionList& list) override;
  int ModifySerialize(Direction direction, ConditionList& list) override;
  // Width and offset: the serial trace becomes `width` traces from its state `offset`.
  int ModifyDeserialize(long width, long offset, ConditionList& list) override;
  int ModifyCoding(ConditionList& list) override;
  bool IsSerializePossible() override { return IsEditable() && mWidth > 1; }
  bool IsDeserializePossible() override { return IsEditable() && mWidth == 1 && mLength > 1; }
  bool IsCodingPossible() override { return IsEditable(); }
  bool IsFillPossible() override { return IsEditable(); }
  bool IsInvertPossible() override { return IsEditable(); }
  bool IsMirrorPossible() override { return IsEditable() && mSelecting; }
  bool IsCopyPossible() override { return IsEditable(); }
  bool IsPastePossible() override;
  bool IsInsertPossible() override { return mDs != nullptr; }
  bool IsDeletePossible() override { return IsEditable() && mSelecting; }
  bool IsFindPossible() override { return IsEditable() && !mFindText.empty(); }
  bool IsDirty() override;

  long DispLineCount() const override { return mLength; }
  long DispFirstLine() const override { return mFirst; }
  void DispScrollTo(long firstLine) override;
  QString DispHeader(const GridDisp& disp, int cell) const override;
  GridCell DispCell(const GridDisp& disp, long line, int cell) const override;
  void DispPress(const GridDisp& disp, long line, int cell, Qt::KeyboardModifiers modifiers) override;
  void DispMove(const GridDisp& disp, long line, int cell) override;
  // Without a segment, or with an empty one, the digit column says what to do.
  void DispPaint(const GridDisp& disp, QPainter& painter, const QRect& area) const override;
  // The digits stand in groups of four, counted from trace 0, half a cell apart.
  int DispGap(const GridDisp& disp, int cell) const override;
  static constexpr long kDigitsPerGroup = 4;

 signals:
  // A refusal the user should read where they type (a digit the format does not know).
  void Message(const QString& text);
  // Another client changed the segment under digits typed here and not yet written: nothing is
  // written until the user chooses (QenSegmentDs::KeepMine, TakeTheirs).
  void ChangedElsewhere();

 protected:
  void keyPressEvent(QKeyEvent* event) override;
  void resizeEvent(QResizeEvent* event) override;

 private:
  class View;

  int TracesPerDigit() const;
  // The digit shown in display column `column` (0 the leftmost, the most significant).
  long DigitAt(long column) const { return mDigits - 1 - column; }
  long ColumnOf(long digit) const { return mDigits - 1 - digit; }
  // Reads the dimensions again and keeps cursor, selection and offsets inside them.
  int ReadDimensions(ConditionList& list);
  // Moves the buffer, when needed, so that it holds the lines shown.
  int CoverShown(ConditionList& list);
  void MoveCursor(long vector, long digit, bool extend);
  void TypeDigit(char digit);

  QenSegmentDs* mDs = nullptr;
  SegmentBuffer* mBuffer = nullptr;
  std::unique_ptr<View> mView;
  long mLength = 0;
  long mWidth = 0;
  long mDigits = 0;
  long mFirst = 0;
  long mDigitOffset = 0;
  long mCursorVector = 0;
  long mCursorDigit = 0;
  long mAnchorVector = 0;
  long mAnchorDigit = 0;
  bool mSelecting = false;
  DataFormat mFormat = DataFormat::kHex;
  AddrFormat mAddrFormat = AddrFormat::kDecimal;
  long mFillState = 1;
  Dstring mFindText;
  // Where the last find stopped; -1 before one.
  long mFoundVector = -1;
  long mFoundTrace = -1;
  Dstring mTargetCoding;
};
