#include "segments/ui/GridDisp.h"

#include <QMouseEvent>
#include <QPainter>

#include "segments/ui/GridManager.h"

GridDisp::GridDisp(Kind kind, QWidget* parent) : QWidget(parent), mKind(kind) {
  setAttribute(Qt::WA_OpaquePaintEvent);
  // Keys go to the grid, which owns the cursor.
  setFocusPolicy(Qt::NoFocus);
}

void GridDisp::SetCells(int cells) {
  mCells = cells < 0 ? 0 : cells;
  if (GridManager* grid = Grid()) grid->Refresh();
}

void GridDisp::SetMinCells(int cells) {
  mMinCells = cells < 0 ? 0 : cells;
  if (GridManager* grid = Grid()) grid->Refresh();
}

GridManager* GridDisp::Grid() const {
  for (QObject* up = parent(); up != nullptr; up = up->parent()) {
    if (auto* grid = qobject_cast<GridManager*>(up)) return grid;
  }
  return nullptr;
}

int GridDisp::CellsShown() const {
  const GridManager* grid = Grid();
  if (grid == nullptr || grid->GetDX() <= 0) return 0;
  int cells = 0;
  for (int left = 0; left < width(); left += grid->GetDX() + grid->DispGap(*this, cells - 1)) ++cells;
  return cells;
}

int GridDisp::CellLeft(int cell) const {
  const GridManager* grid = Grid();
  if (grid == nullptr) return 0;
  int left = 0;
  for (int c = 0; c < cell; ++c) left += grid->GetDX() + grid->DispGap(*this, c);
  return left;
}

bool GridDisp::HitCell(const QPoint& point, long& line, int& cell) const {
  const GridManager* grid = Grid();
  if (grid == nullptr || grid->GetDX() <= 0 || grid->GetDY() <= 0) return false;
  if (point.y() < grid->GetOffY() || point.x() < 0 || point.x() >= width()) return false;
  line = grid->DispFirstLine() + (point.y() - grid->GetOffY()) / grid->GetDY();
  // A point in a gap belongs to the cell on its left.
  cell = 0;
  for (int left = grid->GetDX() + grid->DispGap(*this, 0); left <= point.x();
       left += grid->GetDX() + grid->DispGap(*this, cell))
    ++cell;
  return line < grid->DispLineCount();
}

void GridDisp::paintEvent(QPaintEvent* event) {
  QPainter painter(this);
  if (const GridManager* grid = Grid()) {
    grid->DispPaint(*this, painter, event->rect());
  } else {
    painter.fillRect(event->rect(), palette().base());
  }
}

void GridDisp::mousePressEvent(QMouseEvent* event) {
  GridManager* grid = Grid();
  if (grid == nullptr) return;
  grid->setFocus(Qt::MouseFocusReason);
  long line = 0;
  int cell = 0;
  if (event->button() == Qt::LeftButton && HitCell(event->position().toPoint(), line, cell)) {
    grid->DispPress(*this, line, cell, event->modifiers());
  }
}

void GridDisp::mouseMoveEvent(QMouseEvent* event) {
  GridManager* grid = Grid();
  long line = 0;
  int cell = 0;
  if (grid != nullptr && (event->buttons() & Qt::LeftButton) && HitCell(event->position().toPoint(), line, cell)) {
    grid->DispMove(*this, line, cell);
  }
}
