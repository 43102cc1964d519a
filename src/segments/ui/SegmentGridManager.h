#pragma once

#include "segments/SegmentGridModel.h"
#include "segments/ui/GridManager.h"

// The segment grid on screen: the Qt face of a SegmentGridModel, which holds the segment, the
// cursor, the selection and the buffer window and carries out every command. Its columns are
// the address (AddrDisp) and the digits of the data format (DigitDisp), the most significant on
// the left, so a line reads as a number. Keys and clicks go to the model; a refusal is shown
// with a message, and the system clipboard carries what Copy takes.
class SegmentGridManager : public GridManager, private SegmentGridModel::Observer {
  Q_OBJECT

 public:
  explicit SegmentGridManager(QWidget* parent = nullptr);
  ~SegmentGridManager() override;

  // Offers "SegmentGridManager" to the resource loader.
  static void CppRegister();
  static const char* Class() { return "SegmentGridManager"; }

  SegmentGridModel& Model() { return mModel; }
  const SegmentGridModel& Model() const { return mModel; }
  QenSegmentDs* GetSegmentDs() const { return mModel.GetSegmentDs(); }
  // Lets go of the segment: closes it (pending edits are written first) and frees the source.
  int Release(ConditionList& list);
  long CursorVector() const { return mModel.CursorVector(); }
  long CursorDigit() const { return mModel.CursorDigit(); }
  long CursorTrace() const { return mModel.CursorTrace(); }
  bool IsEditable() const { return mModel.IsEditable(); }
  bool HasSelection() const { return mModel.HasSelection(); }
  long HeldVectors() const { return mModel.HeldVectors(); }
  StateRange SelectedRange() const { return mModel.SelectedRange(); }
  void SetFillState(long state) { mModel.SetFillState(state); }
  void SetTargetCoding(const Dstring& coding) { mModel.SetTargetCoding(coding); }
  int DeleteTraces(ConditionList& list);
  void SetFindText(const Dstring& text) { mModel.SetFindText(text); }
  // What the user reads when an edit meets another client's lock.
  static QString LockedText();
  // Text of the cursor and selection for the status line.
  QString CursorText() const { return QString::fromStdString(mModel.CursorText()); }

  int ExportText(const Dstring& path, ConditionList& list) { return mModel.ExportText(path, list); }
  int ImportText(const Dstring& path, ConditionList& list);
  int ExportVcd(const Dstring& path, ConditionList& list) { return mModel.ExportVcd(path, list); }
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
  int GetAddrFormat() override { return static_cast<int>(mModel.GetAddrFormat()); }
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
  void GetVectorOffset(long, long& value) override { value = mModel.FirstLine(); }
  void GetDigitOffset(long, long& value) override { value = mModel.DigitOffset(); }
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
  bool IsSerializePossible() override { return mModel.IsSerializePossible(); }
  bool IsDeserializePossible() override { return mModel.IsDeserializePossible(); }
  bool IsCodingPossible() override { return mModel.IsCodingPossible(); }
  bool IsFillPossible() override { return mModel.IsFillPossible(); }
  bool IsInvertPossible() override { return mModel.IsInvertPossible(); }
  bool IsMirrorPossible() override { return mModel.IsMirrorPossible(); }
  bool IsCopyPossible() override { return mModel.IsCopyPossible(); }
  bool IsPastePossible() override { return mModel.IsPastePossible(); }
  bool IsInsertPossible() override { return mModel.IsInsertPossible(); }
  bool IsDeletePossible() override { return mModel.IsDeletePossible(); }
  bool IsFindPossible() override { return mModel.IsFindPossible(); }
  bool IsDirty() override { return mModel.IsDirty(); }

  long DispLineCount() const override { return mModel.Length(); }
  long DispFirstLine() const override { return mModel.FirstLine(); }
  void DispScrollTo(long firstLine) override;
  QString DispHeader(const GridDisp& disp, int cell) const override;
  GridCell DispCell(const GridDisp& disp, long line, int cell) const override;
  void DispPress(const GridDisp& disp, long line, int cell, Qt::KeyboardModifiers modifiers) override;
  void DispMove(const GridDisp& disp, long line, int cell) override;
  // Without a segment, or with an empty one, the digit column says what to do.
  void DispPaint(const GridDisp& disp, QPainter& painter, const QRect& area) const override;
  // The digits stand in groups of four, counted from trace 0, half a cell apart.
  int DispGap(const GridDisp& disp, int cell) const override;

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
  long LinesShown() const override { return VisibleLines(); }
  long DigitCellsShown() const override;
  void NfySegmentChanged(bool elsewhere) override;
  void NfyMessage(const Dstring& text) override;
  // Repaints and tells the window; passes the status through.
  int Shown(int status);
  // A status of a command the user gave by key or click, said where they type.
  void Said(int status, const ConditionList& list);

  SegmentGridModel mModel;
};
