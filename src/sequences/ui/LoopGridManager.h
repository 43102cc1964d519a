#pragma once

#include <QKeySequence>
#include <QList>
#include <QStringList>
#include <functional>
#include <memory>

#include "segments/ui/GridManager.h"
#include "sequences/LoopGridModel.h"

class CSequence;
class QLineEdit;
class QMimeData;
class SequenceFollower;
class SequenceUndo;

// The loop grid on screen, over a LoopGridModel: a line per block with its number ("blocks", AddrDisp), the
// loops that repeat it ("loops", a lane per loop level, the top level on the left, each loop a
// bracket beside its blocks with its count), its label and length ("labels", "lengths"), its
// marks ("marks": M measurement start, S sync block, T trigger, R reactions) and the segment
// each port plays (a NameDisp per data port, added in the configuration's order).
//
// The cursor is a block and a field (a loop lane, the label, the length or a port); Shift with
// the arrows or a drag selects a run of blocks, which a new loop covers. Every edit is one edit
// of the sequence model, written to the instrument and read back; a refusal is reported and
// the grid shows what the instrument holds. The grid follows the model's reports, so another
// client's change shows within the poll. Its own edits can be taken back (SequenceUndo).
class LoopGridManager : public GridManager {
  Q_OBJECT

 public:
  // The width of a loop lane, in cells.
  static constexpr int kLaneCells = 5;
  // The least width of a port's column, in cells.
  static constexpr int kPortCells = 10;

  explicit LoopGridManager(QWidget* parent = nullptr);
  ~LoopGridManager() override;

  // Offers "LoopGridManager" to the resource loader.
  static void CppRegister();
  static const char* Class() { return "LoopGridManager"; }

  // Shows this sequence (not owned; it must outlive the grid or be set to null first).
  void SetSequence(CSequence* sequence);
  CSequence* GetSequence() const { return mModel.GetSequence(); }
  LoopGridModel& Model() { return mModel; }
  // How a port's column is headed (the windows know the rack's place names).
  // The heading of a port's column, given the width its text has.
  void SetPortHeader(std::function<QString(unsigned long port, int width)> header) { mPortHeader = std::move(header); }
  // The largest count a loop may have on the instrument; 0 when not known.
  void SetLargestCount(unsigned long largest) { mModel.SetLargestCount(largest); }
  // The names the cell editor of a port offers, besides the built-in kinds.
  // The instrument's segments: the port editor completes them, and once they are known a port
  // naming a segment that is not among them is drawn in the alert colour.
  void SetSegmentNames(const QStringList& names);

  // Fields of a line, left to right: the loop lanes (the top level first), label, length, ports.
  int NumFields() const { return mModel.NumFields(); }
  int LabelField() const { return mModel.LabelField(); }
  int LengthField() const { return mModel.LengthField(); }
  int LaneField(unsigned long level) const { return mModel.LaneField(level); }
  int PortField(unsigned long port) const { return mModel.PortField(port); }
  // The level of a lane field, the port of a port field; 0 for other fields.
  unsigned long LevelOf(int field) const { return mModel.LevelOf(field); }
  unsigned long PortOf(int field) const { return mModel.PortOf(field); }

  unsigned long CursorBlock() const { return mModel.CursorBlock(); }
  int CursorField() const { return mModel.CursorField(); }
  // The selected run of blocks (the cursor's block alone when nothing more is selected).
  unsigned long FirstSelected() const { return mModel.FirstSelected(); }
  unsigned long LastSelected() const { return mModel.LastSelected(); }
  // Whether the block is in a selected run of more than one block.
  bool IsSelected(unsigned long block) const { return mModel.IsSelected(block); }
  // Moves the cursor to a block (from 1) and field; `extend` keeps the selection's other end.
  void SetCursor(unsigned long block, int field, bool extend = false);
  // The text of a cell as shown.
  QString CellText(unsigned long block, int field) const;
  // The marks of a block, as the "marks" column shows them.
  static QString MarksOf(const CSequence& sequence, unsigned long block);

  // The commands, each on the cursor's block or the selection; a refusal is reported and its
  // status returned.
  int InsertBlock(bool before);
  int DeleteBlock();
  int MoveBlock(long distance);
  int CutBlock();
  int CopyBlock();
  int PasteBlock();
  // A loop over the selected blocks: on the cursor's lane, or on the lowest level that fits.
  int AddLoop();
  // The loop of the cursor's lane, or the innermost loop of the cursor's block.
  int RemoveLoop();
  // A cell's typed text: a label, a length, a loop count, or a segment (a name of the pool or a
  // kind: PAUSE, PAUSE0 ...).
  int SetCellText(unsigned long block, int field, const QString& text);
  int Undo();
  int Redo();
  // The keys that redo in the sequence editors, whatever the platform binds: Ctrl+Y and
  // Ctrl+Shift+Z.
  static QList<QKeySequence> RedoKeys();
  SequenceUndo* Steps() const { return mModel.Steps(); }

  // The cell editor over the cursor's cell, holding `text` (the cell's text when null).
  void BeginEdit(const QString& text = QString());
  QLineEdit* Editor() const { return mEditor; }
  bool IsEditing() const { return mEditField >= 0; }

  // Takes the model again: columns, lines, cursor; the lines shown are repainted.
  void Sync();

  bool IsCopyPossible() override { return GetSequence() != nullptr; }
  bool IsPastePossible() override { return mModel.IsPastePossible(); }
  bool IsInsertPossible() override { return GetSequence() != nullptr; }
  bool IsDeletePossible() override { return GetSequence() != nullptr; }
  // Copy, paste, insert (`count` blocks before or after the cursor's) and delete work on whole
  // blocks; an insert of several blocks is one step back.
  int ModifyCopy(ConditionList& list) override;
  int ModifyPaste(ConditionList& list) override;
  int ModifyInsert(VectorTrace what, InsertMode mode, long count, ConditionList& list) override;
  int ModifyDelete(ConditionList& list) override;
  int GetSegmentName(long row, long column, Dstring& name, ConditionList& list) override;

  long DispLineCount() const override;
  long DispFirstLine() const override { return mFirst; }
  void DispScrollTo(long firstLine) override { mFirst = std::max(0L, firstLine); }
  QString DispHeader(const GridDisp& disp, int cell) const override;
  GridCell DispCell(const GridDisp& disp, long line, int cell) const override;
  void DispPaint(const GridDisp& disp, QPainter& painter, const QRect& area) const override;
  void DispPress(const GridDisp& disp, long line, int cell, Qt::KeyboardModifiers modifiers) override;
  void DispMove(const GridDisp& disp, long line, int cell) override;

 signals:
  // The segment editor asked for the cursor's cell, the event window for its block.
  void OpenSegmentRequested(unsigned long block, unsigned long port);
  void OpenEventsRequested(unsigned long block);

 protected:
  void keyPressEvent(QKeyEvent* event) override;
  void dragEnterEvent(QDragEnterEvent* event) override;
  void dragMoveEvent(QDragMoveEvent* event) override;
  void dropEvent(QDropEvent* event) override;
  bool eventFilter(QObject* watched, QEvent* event) override;

 private:
  // A command of the model; the grid then shows what the instrument holds. Run reports its
  // conditions, Apply leaves them in the list.
  int Apply(const std::function<int(ConditionList&)>& edit, ConditionList& list);
  int Run(const std::function<int(ConditionList&)>& edit);
  // Shows the model's cursor: its line, and its cell across.
  void Follow();
  void SyncColumns();
  void AddActions();
  void CommitEdit();
  void CancelEdit();
  // The field a display column and its cell stand for; -1 for none.
  int FieldAt(const GridDisp& disp, int cell) const;
  // The cell of a point of the grid: false outside the lines.
  bool CellAt(const QPoint& point, long& line, int& field) const;
  QRect CellRect(long line, int field) const;
  void PaintLoops(const GridDisp& disp, QPainter& painter, const QRect& area) const;
  static QString DroppedName(const QMimeData* mime);

  LoopGridModel mModel;
  std::unique_ptr<SequenceFollower> mFollower;
  std::function<QString(unsigned long, int)> mPortHeader;
  QStringList mSegmentNames;
  bool mSegmentsKnown = false;
  QLineEdit* mEditor = nullptr;
  long mFirst = 0;
  int mEditField = -1;
  long mEditRow = 0;
  // The port columns made.
  unsigned long mPortColumns = 0;
};
