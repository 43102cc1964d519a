#pragma once

#include <functional>
#include <memory>
#include <vector>

#include "data/QenDs.h"
#include "segments/DataFormat.h"
#include "segments/SegmentEnums.h"
#include "segments/SegmentProperties.h"
#include "segments/StateRange.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"
#include "support/DstringList.h"

class SegmentBuffer;
class SegmentCopy;

// One open segment, shared by every editor that shows it: the server's handle of the open
// segment, the buffers (slices) the editors hold, and the commands on the segment. Created and
// freed only through QenSegmentPool; the constructor enters the pool, the destructor leaves it.
//
// A change runs in one order: mark the segment modified, write every dirty buffer back (so
// that the server works on what the user sees), send the command, read the buffers again, set
// the change kind and tell the views. Every operation returns 0 or the code it added to the
// list; a failed write leaves the buffer dirty, so the next write sends the same data.
class QenSegmentDs : public QenDs {
 public:
  // What the last notification is about (GetChangeKind).
  enum ChangeKind : int {
    kNoChange = 0,
    kWidthChanged = 1,
    kLengthChanged = 2,
    kStatesChanged = 3,
    kCodingChanged = 4,
    kTypeChanged = 5,
    kSerialized = 6,
    kUpdatedAll = 7,
    // Another client changed the segment under states typed here and not yet written: nothing
    // was written or read; the user chooses (KeepMine, TakeTheirs).
    kChangedElsewhere = 8,
  };

  // A held vector whose states differ between the last read, this side and the server now,
  // each as a line of the text form.
  struct Difference {
    long vector = 0;
    Dstring before;
    Dstring mine;
    Dstring theirs;
  };

  // What this side holds of a segment with unsaved work, as the text form (hexadecimal for the
  // coding "01"): the whole segment, or only the vectors first .. first + count - 1.
  struct HeldText {
    Dstring coding;
    long width = 0;
    long length = 0;
    long first = 0;
    long count = 0;
    bool whole = false;
    Dstring text;
  };

  explicit QenSegmentDs(const Dstring& name);
  ~QenSegmentDs() override;

  const Dstring& GetName() const { return mName; }
  // The server's handle of the open segment; 0 while it is not open.
  unsigned GetNumber() const { return mNumber; }
  int GetOpenCount() const { return mOpenCount; }
  int GetChangeKind() const { return mChangeKind; }
  // The range of the last range command; the whole segment (as the first buffer knows it)
  // after other changes.
  const StateRange& GetLastModifiedRange() const { return mLastModifiedRange; }
  // Whether the contents differ from the saved file.
  bool IsDirty() const { return mModified; }
  void SetDirty(bool modified) { mModified = modified; }
  // Two words the views keep their own bookkeeping in.
  long GetViewWord(int which) const { return mViewWords[which & 1]; }
  void SetViewWord(int which, long value) { mViewWords[which & 1] = value; }

  // Nested opens share one server handle: only the first sends the open query, only the
  // last Close sends the close command.
  int Open(ConditionList& list);
  int Close(ConditionList& list);
  int Save(ConditionList& list);
  int SaveAs(const Dstring& name, ConditionList& list);

  // Without `force`, and when a buffer exists, the values the first buffer last read.
  int GetLength(long& length, ConditionList& list, bool force = false);
  int GetWidth(long& width, ConditionList& list, bool force = false);
  int GetCoding(Dstring& coding, ConditionList& list, bool force = false);
  int GetStateWidth(long& bits, ConditionList& list, bool force = false);
  // Not a resize: every vector (trace) is deleted and `length` (`width`) new ones inserted,
  // so the contents start afresh.
  int SetLength(long length, ConditionList& list);
  int SetWidth(long width, ConditionList& list);
  int SetCoding(const Dstring& coding, ConditionList& list);
  int ConvertCoding(const Dstring& from, const Dstring& to, ConditionList& list);

  int CreateBuffer(SegmentBuffer*& buffer, ConditionList& list);
  int DestroyBuffer(SegmentBuffer* buffer, ConditionList& list);
  std::size_t NumBuffers() const { return mBuffers.size(); }
  int Init(SegmentBuffer* buffer, ConditionList& list);
  int SetBufferLength(SegmentBuffer* buffer, long length, ConditionList& list);
  int SetBufferStart(SegmentBuffer* buffer, long start, ConditionList& list);
  int SetBufferStartAndLength(SegmentBuffer* buffer, long start, long length, ConditionList& list);
  long GetBufferLength(const SegmentBuffer* buffer) const;
  long GetBufferStart(const SegmentBuffer* buffer) const;
  bool IsBufferDirty(const SegmentBuffer* buffer) const;
  int ReadDimension(SegmentBuffer* buffer, ConditionList& list);
  int Read(SegmentBuffer* buffer, ConditionList& list);
  int Write(SegmentBuffer* buffer, ConditionList& list);
  // Every buffer in order; stops at the first failure.
  int Read(ConditionList& list);
  int Write(ConditionList& list);

  int GetState(SegmentBuffer* buffer, long vector, long trace, char& state, ConditionList& list);
  int SetState(SegmentBuffer* buffer, long vector, long trace, char state, ConditionList& list);
  int ToggleState(SegmentBuffer* buffer, long vector, long trace, ConditionList& list);
  // The digit of `format` that holds `trace`, as its digit character; '?' when a trace of
  // it holds a state that is neither 0 nor 1, '!' instead when a trace of it also holds an
  // errored state ('k', 'r', either case).
  int GetDigit(SegmentBuffer* buffer, long vector, long trace, DataFormat format, char& digit,
               ConditionList& list);
  int SetDigit(SegmentBuffer* buffer, long vector, long trace, DataFormat format, char digit,
               ConditionList& list);
  // GetDigit of what the buffer holds without the operation guard: a view still shows the
  // data while another client holds the instrument.
  int DigitOf(const SegmentBuffer* buffer, long vector, long trace, DataFormat format, char& digit,
              ConditionList& list) const;
  int MaxDigit(DataFormat format, long& max, ConditionList& list);
  // A state as one bit of a digit: 0, 1, or -1 when it is neither.
  static int BitOf(char state);
  // The digit character of `count` states of one digit, `states[0]` the lowest trace's; '?'
  // and '!' as GetDigit says.
  static char DigitOfStates(const char* states, long count, DataFormat format);
  // A compare state that counts as an error ('k', 'r', either case).
  static bool IsErrored(char state);
  // The last digit index of `format` over `width` traces.
  static long MaxDigitOf(DataFormat format, long width);

  int ModifyFill(const StateRange& range, long state, ConditionList& list);
  int ModifyInvert(const StateRange& range, ConditionList& list);
  int ModifyMirror(const StateRange& range, MirrorMode mode, ConditionList& list);
  // Copies into the server's clipboard, which every client shares; changes nothing here.
  int ModifyCopy(const StateRange& range, ConditionList& list);
  int ModifyPaste(long trace, long vector, ConditionList& list);
  int ModifyInsert(long position, VectorTrace which, InsertMode mode, long count, ConditionList& list);
  int ModifyDelete(long position, VectorTrace which, long count, DeleteMode mode, ConditionList& list);
  int ModifySerialize(Direction direction, ConditionList& list);
  int ModifyDeserialize(long width, long offset, ConditionList& list);
  // Whether the clipboard holds something that fits at (trace, vector) in this coding.
  int IsPastePossible(long trace, long vector, bool& possible, ConditionList& list);
  int GetClipBoardWidth(long& width, ConditionList& list);
  int GetClipBoardLength(long& length, ConditionList& list);
  int GetClipBoardCoding(Dstring& coding, ConditionList& list);

  // The pattern is a number in `format` ("1011", "3f", "17"), 'x' digits matching anything.
  // A search that finds nothing gives -1 for both positions.
  int FindPattern(long& vector, long& trace, long startVector, long startTrace, const Dstring& pattern,
                  DataFormat format, FindDirection direction, VectorTrace which, ConditionList& list);
  int GetFirstError(long& vector, long& trace, ConditionList& list);
  int GetNextError(long& vector, long& trace, long startVector, long startTrace, ConditionList& list);
  int GetPrevError(long& vector, long& trace, long startVector, long startTrace, ConditionList& list);

  int SetType(SegmentType type, ConditionList& list);
  int GetType(SegmentType& type, ConditionList& list);
  int SetPRxSPolynom(const Dstring& polynomial, ConditionList& list);
  int GetPRxSPolynom(Dstring& polynomial, ConditionList& list);
  int SetPRxSLogic(PRxSLogic logic, ConditionList& list);
  int GetPRxSLogic(PRxSLogic& logic, ConditionList& list);
  int SetPRxSSubType(PRxSSubType subType, ConditionList& list);
  int GetPRxSSubType(PRxSSubType& subType, ConditionList& list);
  int SetPRxSErrors(long errors, ConditionList& list);
  int GetPRxSErrors(long& errors, ConditionList& list);
  int SetPRxSDensity(PRxSDensity density, ConditionList& list);
  int GetPRxSDensity(PRxSDensity& density, ConditionList& list);
  int SetPRxSExtensionNumber(long number, ConditionList& list);
  int GetPRxSExtensionNumber(long& number, ConditionList& list);
  int SetPRxSRotating(ConditionList& list);
  int SetSFI5Headers(const Dstring& expansionHeader, const Dstring& framingBytes, long base,
                     ConditionList& list);
  int GetSFI5Headers(Dstring& expansionHeader, Dstring& framingBytes, long& base, ConditionList& list);
  // Rewrites the digits of `text` from base `from` into base `to` (2 to 16 each), keeping the
  // count of bits: "f628" in 16 is "1111011000101000" in 2.
  static int ConvertBase(const Dstring& text, long from, long to, Dstring& out, ConditionList& list);

  int GetProperties(SegmentProperties& properties, ConditionList& list);
  int SetProperties(const SegmentProperties& properties, ConditionList& list);

  // Writes the dirty buffers, reads every buffer's dimensions and contents again and tells
  // the views (change kind kUpdatedAll).
  int UpdateAll(ConditionList& list);

  // --- Another client's change ---------------------------------------------------------------
  // Whether a buffer holds states not yet written.
  bool HasUnwrittenStates() const;
  // The poll's report that another client changed the segment. Without unwritten states, or
  // when the other client left the held vectors and the dimensions as they were, this is
  // UpdateAll. Otherwise nothing is written or read: the source is changed elsewhere until the
  // user chooses, every write of a dirty buffer is refused ("GUI_SEGMENTDS_CHANGED_ELSEWHERE")
  // and the views are told (kChangedElsewhere).
  int NfyChangedElsewhere(ConditionList& list);
  bool IsChangedElsewhere() const { return mChangedElsewhere; }
  // The states typed here put over the server's vectors as they are now, then written; refused
  // while the other client's width or coding differs from this side's, or the held vectors no
  // longer lie inside the segment.
  int KeepMine(ConditionList& list);
  // The states typed here dropped; everything read again.
  int TakeTheirs(ConditionList& list);
  int GetDifferences(DataFormat format, std::vector<Difference>& differences, ConditionList& list);

  // --- Unsaved work when the server is gone ---------------------------------------------------
  // Whether the server holds changes it has not saved, or a buffer holds states not yet written.
  bool HasUnsavedWork() const { return mModified || HasUnwrittenStates(); }
  // The unsaved work as text from what this side holds, asking the server nothing: the whole
  // segment when a copy is kept (every buffer put over it), else each buffer's vectors.
  void GetHeldTexts(std::vector<HeldText>& texts) const;
  // The most text a kept copy may take; a longer segment is held as its buffers only.
  static constexpr std::size_t kMaxCopyChars = 16u << 20;

 private:
  Dstring Cmd(const char* tail) const;
  int Send(const Dstring& cmd, ConditionList& list);
  int Query(const Dstring& cmd, Dstring& reply, ConditionList& list);
  int QueryNumber(const Dstring& cmd, long& value, ConditionList& list);
  int CheckOpen(ConditionList& list) const;
  SegmentBuffer* First() const { return mBuffers.empty() ? nullptr : mBuffers.front().get(); }
  int FindBuffer(const SegmentBuffer* buffer, ConditionList& list) const;
  // The change sequence around commands: write back, send each, read again, tell the views.
  // `dimensions` reads the dimensions of every buffer again too. `range` is what the commands
  // touched; null for the whole segment.
  int Modify(const DstringList& cmds, ChangeKind kind, bool dimensions, ConditionList& list,
             const StateRange* range = nullptr);
  int ModifyRange(const char* command, const StateRange& range, const Dstring& extra, ConditionList& list);
  int Reread(bool dimensions, ConditionList& list);
  int Notify(ChangeKind kind, ConditionList& list);
  int ResetDimension(const char* what, long count, ChangeKind kind, ConditionList& list);
  int SetParam(const char* name, const Dstring& value, ConditionList& list);
  int GetParam(const char* name, Dstring& reply, ConditionList& list);
  int PositionQuery(const Dstring& cmd, long& vector, long& trace, ConditionList& list);
  int SetGeneratorProperties(const SegmentProperties& properties, ConditionList& list);
  int GetGeneratorProperties(SegmentProperties& properties, ConditionList& list);
  int MoveBuffer(SegmentBuffer* buffer, const std::function<int()>& move, ConditionList& list);
  // Refuses the write of a dirty buffer while the segment is changed elsewhere.
  int CheckWrite(const SegmentBuffer* buffer, ConditionList& list) const;
  // Whether the server's dimensions and coding are those the buffers last read.
  int IsShapeUnchanged(bool& unchanged, ConditionList& list);
  // Whether the server still has the held vectors and the dimensions the buffers last read.
  int IsHeldUnchanged(bool& unchanged, ConditionList& list);
  // While copies are kept and the segment is modified and open: the whole segment read into
  // the copy (after a change the server made). A copy that cannot be read, or would be too
  // long, is dropped.
  void KeepCopy();
  // The edits of a dirty buffer into the copy; false when there is no copy of its shape.
  bool CopyEdits(const SegmentBuffer* buffer);
  // After a write of a dirty buffer whose edits the copy did not take: the copy is made afresh.
  void AfterWrite(bool wasDirty, bool copied);
  Dstring LineOf(const SegmentBuffer* buffer, long vector) const;

  Dstring mName;
  unsigned mNumber = 0;
  std::vector<std::unique_ptr<SegmentBuffer>> mBuffers;
  StateRange mLastModifiedRange;
  int mChangeKind = kNoChange;
  bool mModified = false;
  int mOpenCount = 0;
  long mViewWords[2] = {0, 0};
  bool mChangedElsewhere = false;
  std::unique_ptr<SegmentCopy> mCopy;
};
