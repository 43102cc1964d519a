#pragma once

#include <QWidget>

class GridManager;

// A display column of a grid: a strip of cells of the grid's size, one line per grid line, under
// a header. It draws and takes clicks through its grid, which decides what a cell holds.
class GridDisp : public QWidget {
  Q_OBJECT
  // Width in cells; 0 shares the width the fixed columns leave.
  Q_PROPERTY(int cells READ Cells WRITE SetCells)
  // The least width, in cells, of a column that shares: below it the grid scrolls sideways
  // rather than squeeze the column away.
  Q_PROPERTY(int minCells READ MinCells WRITE SetMinCells)
  // An address or name column's text to the right (numbers) rather than the left.
  Q_PROPERTY(bool right READ IsRight WRITE SetRight)

 public:
  enum class Kind { kAddr, kDigit, kName };

  GridDisp(Kind kind, QWidget* parent);

  Kind GetKind() const { return mKind; }
  int Cells() const { return mCells; }
  void SetCells(int cells);
  int MinCells() const { return mMinCells; }
  void SetMinCells(int cells);
  bool IsRight() const { return mRight; }
  void SetRight(bool right) { mRight = right; }
  Qt::Alignment Alignment() const { return (mRight ? Qt::AlignRight : Qt::AlignLeft) | Qt::AlignVCenter; }
  // The grid this column belongs to: its nearest GridManager ancestor.
  GridManager* Grid() const;
  // The line and cell at a point of this column; false in the header or outside the lines.
  bool HitCell(const QPoint& point, long& line, int& cell) const;
  // The cells that fit across the column.
  int CellsShown() const;
  // The left edge of a cell, after the gaps the grid puts between groups of cells.
  int CellLeft(int cell) const;

 protected:
  void paintEvent(QPaintEvent* event) override;
  void mousePressEvent(QMouseEvent* event) override;
  void mouseMoveEvent(QMouseEvent* event) override;

 private:
  Kind mKind;
  int mCells = 0;
  int mMinCells = 1;
  bool mRight = false;
};
