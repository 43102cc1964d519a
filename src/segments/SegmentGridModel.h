#pragma once

#include <memory>

#include "segments/DataFormat.h"
#include "segments/SegmentEnums.h"
#include "segments/SegmentProperties.h"
#include "segments/StateRange.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"
#include "toolkit/GridKey.h"

class QenSegmentDs;
class SegmentBuffer;

// What the segment grid edits, without a widget: one open segment, a line per vector and its
// traces as digits of the data format (digit 0 holds trace 0; the view puts the most
// significant digit on the left, so column 0 is the highest digit). It holds one buffer of the
// segment, a few screens of vectors around the lines shown, and moves it only when the lines
// shown leave it: a jump anywhere in a long segment costs one round trip whatever its length.
//
// The cursor is a vector and a digit; a selection is the rectangle between the anchor and the
// cursor. Every edit command works on the selection (or the cursor's digit) and is offered
// only when its Is…Possible says so. Typing sets the digit under the cursor in the buffer,
// which is written back before any command, move or save.
class SegmentGridModel {
 public:
  // What the model asks of whoever shows it, and what it tells them.
  class Observer {
   public:
    virtual ~Observer() = default;
    // Lines and digit cells the view has room for.
    virtual long LinesShown() const = 0;
    virtual long DigitCellsShown() const = 0;
    // The segment changed under the grid (another editor, another client); `elsewhere` when
    // another client changed it under digits typed here and nothing was read.
    virtual void NfySegmentChanged(bool elsewhere) = 0;
    // A word for the user where they type: nothing found, no error vector, a refused pattern.
    virtual void NfyMessage(const Dstring& text) = 0;
  };

  // Shift extends the selection; Ctrl takes Home and End to the first and last vector.
  using Key = GridKey;

  // One digit cell as the view draws it.
  struct Cell {
    char text = 0;  // 0 when the vector is not held (or there is no such digit)
    bool cursor = false;
    bool selected = false;
  };

  static constexpr long kDigitsPerGroup = 4;

  SegmentGridModel();
  ~SegmentGridModel();
  SegmentGridModel(const SegmentGridModel&) = delete;
  SegmentGridModel& operator=(const SegmentGridModel&) = delete;

  // Not owned; null shows nothing and has room for one line.
  void SetObserver(Observer* observer) { mObserver = observer; }

  // Opens the segment named, letting go of the one held first.
  int HookOn(const Dstring& segment, ConditionList& list);
  // Lets go of the segment: pending edits are written first, a refusal keeps everything.
  int Release(ConditionList& list);
  // What Release does, whatever fails on the way: for a grid that goes.
  void Abandon();

  QenSegmentDs* GetSegmentDs() const { return mDs; }
  SegmentBuffer* GetBuffer() const { return mBuffer; }
  // A segment with states is open.
  bool IsEditable() const { return mDs != nullptr && mLength > 0 && mWidth > 0; }
  long Length() const { return mLength; }
  long Width() const { return mWidth; }
  long Digits() const { return mDigits; }
  long TracesPerDigit() const { return InfoOf(mFormat).tracesPerDigit; }
  long CursorVector() const { return mCursorVector; }
  long CursorDigit() const { return mCursorDigit; }
  long CursorTrace() const { return mCursorDigit * TracesPerDigit(); }
  bool HasSelection() const { return mSelecting; }
  // The selection (or the cursor's digit) as traces and vectors.
  StateRange SelectedRange() const;
  // Vectors the buffer holds, and from where.
  long HeldVectors() const;
  long HeldStart() const;
  // The cursor (and selection) in words for the status line; empty without a segment.
  Dstring CursorText() const;

  DataFormat GetDataFormat() const { return mFormat; }
  int SetDataFormat(DataFormat format, ConditionList& list);
  AddrFormat GetAddrFormat() const { return mAddrFormat; }
  void SetAddrFormat(AddrFormat format) { mAddrFormat = format; }
  // What fill writes: a state number of the coding (0 the first state, 1 the second).
  void SetFillState(long state) { mFillState = state; }
  // The coding ModifyCoding converts the segment to ("01X").
  void SetTargetCoding(const Dstring& coding) { mTargetCoding = coding; }
  // What find looks for: a number in the data format, 'x' digits matching anything.
  void SetFindText(const Dstring& text) { mFindText = text; }

  Dstring GetSegmentName() const;
  int GetSegmentProperties(SegmentProperties& properties, ConditionList& list);
  int SaveSegment(ConditionList& list);
  // The grid goes on with the copy.
  int SaveSegmentAs(const Dstring& name, ConditionList& list);
  bool IsDirty() const;

  // The first line shown and the first digit column shown.
  long FirstLine() const { return mFirst; }
  long DigitOffset() const { return mDigitOffset; }
  // Scrolls to `first` as a scroll bar does; the buffer follows.
  int ScrollTo(long first, ConditionList& list);
  int SetVectorOffset(long first, ConditionList& list);
  void SetDigitOffset(long first);
  // Moves the buffer, when needed, so that it holds the lines shown.
  int CoverShown(ConditionList& list);

  void MoveCursor(long vector, long digit, bool extend);
  void PressKey(Key key, bool extend, bool far);
  // A typed character: a digit of the format (either case), or a state such as "X". On to the
  // next digit to the right after it; a refusal leaves the cursor where it is.
  int Type(char typed, ConditionList& list);
  int ResetSelection();
  // First and last vector, first and last digit.
  int SetSelection(long firstVector, long lastVector, long firstDigit, long lastDigit, ConditionList& list);
  int SetVectorSelection(long first, long last, ConditionList& list);
  int SetDigitSelection(long first, long last, ConditionList& list);
  int GoToVectorTrace(long vector, long trace, ConditionList& list);

  int MoveToError(ERR_DIR direction, ConditionList& list);
  bool CanMoveToError() const { return IsEditable(); }
  bool CanShowGoto() const { return IsEditable(); }
  int GetIsErrorInVector(long vector, bool& error, ConditionList& list);

  int FindPattern(FindDirection direction, VectorTrace what, ConditionList& list);
  int ModifyFill(ConditionList& list);
  int ModifyInvert(ConditionList& list);
  int ModifyMirror(MirrorMode mode, ConditionList& list);
  // The selection to the segment's clipboard; `text` gets it in the text form, for other programs.
  int ModifyCopy(Dstring& text, ConditionList& list);
  int ModifyPaste(ConditionList& list);
  // Text in the form of the export, pasted at the cursor.
  int PasteText(const Dstring& text, ConditionList& list);
  int ModifyInsert(VectorTrace what, InsertMode mode, long count, ConditionList& list);
  // The selected vectors go, whole; the vectors after them close up.
  int ModifyDelete(ConditionList& list);
  // The traces of the selected digits (or of the cursor's digit) go; the traces above close up.
  int DeleteTraces(ConditionList& list);
  int ModifySerialize(Direction direction, ConditionList& list);
  // The serial trace becomes `width` traces from its state `offset`.
  int ModifyDeserialize(long width, long offset, ConditionList& list);
  int ModifyCoding(ConditionList& list);
  bool IsFillPossible() const { return IsEditable(); }
  bool IsInvertPossible() const { return IsEditable(); }
  bool IsMirrorPossible() const { return IsEditable() && mSelecting; }
  bool IsCopyPossible() const { return IsEditable(); }
  bool IsPastePossible() const;
  bool IsInsertPossible() const { return mDs != nullptr; }
  bool IsDeletePossible() const { return IsEditable() && mSelecting; }
  bool IsSerializePossible() const { return IsEditable() && mWidth > 1; }
  bool IsDeserializePossible() const { return IsEditable() && mWidth == 1 && mLength > 1; }
  bool IsCodingPossible() const { return IsEditable(); }
  bool IsFindPossible() const { return IsEditable() && !mFindText.empty(); }

  // The segment as text in the grid's data format, or as a Value Change Dump; what was typed
  // goes to the server first. An import that does not fit is refused whole.
  int ExportText(const Dstring& path, ConditionList& list);
  int ImportText(const Dstring& path, ConditionList& list);
  int ExportVcd(const Dstring& path, ConditionList& list);

  // What the view draws: the digit of a display column (-1 past the digits), a column's
  // heading (empty where it is left out), the address of a line, a cell, whether a column
  // ends a group of four digits.
  long DigitAtColumn(long column) const { return mDigits - 1 - column; }
  long ColumnOfDigit(long digit) const { return mDigits - 1 - digit; }
  Dstring ColumnHeader(long column) const;
  Dstring AddressText(long line) const;
  Cell CellAt(long line, long column) const;
  bool EndsGroup(long column) const;
  // A click on a digit cell (or a drag over it); a click on an address selects the vector.
  void PressCell(long line, long column, bool extend);
  int PressAddress(long line, bool extend, ConditionList& list);

 private:
  class View;

  // Reads the dimensions again and keeps cursor, selection and offsets inside them.
  int ReadDimensions(ConditionList& list);
  long Page() const;
  void ShowLine(long line);
  void ShowColumn(long column, bool centred);
  void Tell(const Dstring& text) const;
  void Forget();
  int Unselected(int status);

  Observer* mObserver = nullptr;
  std::unique_ptr<View> mView;
  QenSegmentDs* mDs = nullptr;
  SegmentBuffer* mBuffer = nullptr;
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
