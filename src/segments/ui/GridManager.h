#pragma once

#include <cstdint>
#include <vector>

#include <QWidget>

#include "segments/DataFormat.h"
#include "segments/SegmentEnums.h"
#include "segments/SegmentProperties.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"
#include "toolkit/GridKey.h"

class QScrollBar;
class GridDisp;
class QPainter;

// The four layout fields a resource sets on a grid: cell size and the grid's offset inside the
// panel (the header strip above, the margin on the left). A value type, so grids can copy them.
struct GridFields {
  std::int16_t dx = 10;
  std::int16_t dy = 18;
  std::int16_t offx = 0;
  std::int16_t offy = 20;
};

// One cell as a display column draws it.
struct GridCell {
  QString text;
  bool selected = false;
  bool cursor = false;
  bool marked = false;  // an error, a changed state: drawn in the alert colour
  bool dim = false;     // outside the data (past the last vector, an empty cell)
};

// The common base of the grid editors: a panel of equal cells, laid out as display columns
// (AddrDisp, DigitDisp, NameDisp children, left to right) that scroll together by lines, with
// a vertical scroll bar on the right. Columns that do not fit across scroll sideways under a
// horizontal scroll bar; none is ever squeezed away. What a line and a cell mean, and all
// editing state, are the subclass's: the base asks through the display hooks and offers every
// editing command through the virtual operations below, each harmless and impossible by
// default, so a window can ask whichever grid has the focus.
class GridManager : public QWidget {
  Q_OBJECT
  Q_PROPERTY(int dx READ GetDX WRITE SetDX)
  Q_PROPERTY(int dy READ GetDY WRITE SetDY)
  Q_PROPERTY(int offx READ GetOffX WRITE SetOffX)
  Q_PROPERTY(int offy READ GetOffY WRITE SetOffY)

 public:
  // The loader's construction record: what OiNew is given for a class named in a resource.
  struct ConstructionRecord {
    Dstring className;
    QWidget* parent = nullptr;
  };

  explicit GridManager(QWidget* parent = nullptr);
  // Builds the grid's own content (its display columns and fields) from a resource of the named
  // library; a missing or broken resource leaves an empty grid and a condition naming it.
  GridManager(const Dstring& resource, const Dstring& library, ConditionList& list, QWidget* parent = nullptr);
  ~GridManager() override;

  // Offers "GridManager", "AddrDisp", "DigitDisp" and "NameDisp" to the resource loader.
  static void CppRegister();
  // Offers and registers them, for a program that does not register through the application.
  static int Register(ConditionList& list);
  static QWidget* OiNew(const ConstructionRecord& record);
  static void OiDelete(QWidget* object);
  static const char* Class() { return "GridManager"; }
  // The resource fields, in declaration order.
  static const std::vector<Dstring>& GetOiFields();

  int GetDX() const { return mFields.dx; }
  int GetDY() const { return mFields.dy; }
  int GetOffX() const { return mFields.offx; }
  int GetOffY() const { return mFields.offy; }
  void SetDX(int value);
  void SetDY(int value);
  void SetOffX(int value);
  void SetOffY(int value);
  const GridFields& GetFields() const { return mFields; }
  void SetFields(const GridFields& fields);

  // The display columns, left to right.
  std::vector<GridDisp*> Disps() const;
  // Lines that fit below the header (and above the horizontal scroll bar, when there is one).
  long VisibleLines() const;
  // How far the columns are scrolled sideways, in pixels.
  int GetScrollX() const { return mScrollX; }
  void SetScrollX(int x);
  // Scrolls sideways, with the least movement, so that [left, right) of the grid is shown.
  void ShowAcross(int left, int right);
  // Re-reads the line count and first line from the subclass and repaints every column.
  void Refresh();
  // The same when the columns keep their places: after a move of the cursor or of the lines shown.
  void Repaint();
  // The cursor key a Qt key stands for; false for any other key.
  static bool CursorKeyOf(int qtKey, GridKey& key);

  // Operations no grid implements: every grid answers with these defaults.
  unsigned NfyGetMenuItemState(std::uint16_t item);
  int NfyItemHit(std::uint16_t item);
  bool AutoMoveCursor();
  int GetDYMultiplier(long row);
  void GetPortMux(long row, double& mux);
  int GetDispMode();
  int SetDispMode(DigitDispMode mode, ConditionList& list);
  int NfyWidthChanged(long row, long column, ConditionList& list);
  int NfyLengthChanged(long row, long column, ConditionList& list);
  int NfySetSegmentName(long row, long column, const Dstring& name, ConditionList& list);
  bool IsOk(long row, long column);
  int SetLabelsEnabled(bool enabled);
  bool AreLabelsEnabled();
  void GetPrevVectorOffset(long row, long& value);
  void GetPrevDigitOffset(long row, long& value);
  int SetSegmentSelection(long row, long column, ConditionList& list);

  // Operations a grid overrides; harmless and impossible by default.
  virtual void GetNumDigits(long row, long& count);
  virtual void GetNumVectors(long row, long& count);
  virtual long GetNumDispDigits(long row);
  virtual long GetNumDispVectors(long row);
  virtual int GetAddrFormat();
  virtual int GetDataFormat(long row);
  virtual int SetDataFormat(long row, DataFormat format, ConditionList& list);
  virtual int SetAddrFormat(AddrFormat format, ConditionList& list);
  virtual int GetSegmentProperties(long row, long column, SegmentProperties& properties, ConditionList& list);
  virtual int HookOn(long row, long column, const Dstring& segment, ConditionList& list);
  virtual int GetSegmentName(long row, long column, Dstring& name, ConditionList& list);
  virtual int SaveSegment(long row, long column, ConditionList& list);
  virtual int SaveSegmentAs(long row, long column, const Dstring& name, ConditionList& list);
  virtual int SetVectorOffset(long row, long first, ConditionList& list);
  virtual int SetDigitOffset(long row, long first, ConditionList& list);
  virtual void GetVectorOffset(long row, long& value);
  virtual void GetDigitOffset(long row, long& value);
  virtual int ResetSelection(ConditionList& list);
  // Row, first vector, last vector, first digit, last digit, column: the segment grid's meaning.
  virtual int SetSelection(long a, long b, long c, long d, long e, long f, ConditionList& list);
  virtual int SetVectorSelection(long row, long first, long last, ConditionList& list);
  virtual int SetDigitSelection(long row, long first, long last, ConditionList& list);
  virtual int FindPattern(FindDirection direction, VectorTrace what, ConditionList& list);
  virtual int ModifyFill(ConditionList& list);
  virtual int ModifyInvert(ConditionList& list);
  virtual int ModifyMirror(MirrorMode mode, ConditionList& list);
  virtual int ModifyCopy(ConditionList& list);
  virtual int ModifyPaste(ConditionList& list);
  virtual int ModifyInsert(VectorTrace what, InsertMode mode, long count, ConditionList& list);
  virtual int ModifyDelete(ConditionList& list);
  virtual int ModifySerialize(Direction direction, ConditionList& list);
  virtual int ModifyDeserialize(long a, long b, ConditionList& list);
  virtual bool IsFillPossible();
  virtual bool IsInvertPossible();
  virtual bool IsSerializePossible();
  virtual bool IsDeserializePossible();
  virtual bool IsCodingPossible();
  virtual bool IsMirrorPossible();
  virtual bool IsCopyPossible();
  virtual bool IsPastePossible();
  virtual bool IsInsertPossible();
  virtual bool IsDeletePossible();
  virtual bool IsFindPossible();
  virtual bool IsDirty();
  virtual int GetIsErrorInVector(long row);
  virtual int ModifyCoding(ConditionList& list);

  // The display hooks: lines in all, the first shown, moving it; header and cell text of a
  // column; a click in a column. A subclass that paints a column itself overrides DispPaint.
  virtual long DispLineCount() const;
  virtual long DispFirstLine() const;
  virtual void DispScrollTo(long firstLine);
  virtual QString DispHeader(const GridDisp& disp, int cell) const;
  virtual GridCell DispCell(const GridDisp& disp, long line, int cell) const;
  virtual void DispPaint(const GridDisp& disp, QPainter& painter, const QRect& area) const;
  // Pixels of space after a cell of a digit column, which set its cells apart in groups.
  virtual int DispGap(const GridDisp& disp, int cell) const;
  virtual void DispPress(const GridDisp& disp, long line, int cell, Qt::KeyboardModifiers modifiers);
  virtual void DispMove(const GridDisp& disp, long line, int cell);

 signals:
  // Something a window shows about the grid changed (selection, cursor, dirty mark).
  void StateChanged();

 protected:
  GridManager(const ConstructionRecord& record);

  void resizeEvent(QResizeEvent* event) override;
  void wheelEvent(QWheelEvent* event) override;
  void childEvent(QChildEvent* event) override;
  void paintEvent(QPaintEvent* event) override;

  // Scrolls so that `line` is shown, with the least movement.
  void ShowLine(long line);
  // Puts the columns side by side: fixed ones at their cell width, the rest sharing what is left.
  void LayoutDisps();

 private:
  void SyncScrollBar();
  // The height of the columns: the grid's, less the horizontal scroll bar when it shows.
  int ColumnHeight() const;

  GridFields mFields;
  QScrollBar* mScroll = nullptr;
  QScrollBar* mAcross = nullptr;
  int mScrollX = 0;
};
