#include "segments/ui/GridManager.h"

#include <algorithm>
#include <limits>

#include <QChildEvent>
#include <QPainter>
#include <QScrollBar>
#include <QStyle>
#include <QWheelEvent>

#include "segments/ui/AddrDisp.h"
#include "segments/ui/DigitDisp.h"
#include "segments/ui/NameDisp.h"
#include "toolkit/qt/ResourceLibrary.h"
#include "toolkit/qt/WidgetClassTable.h"

namespace {

std::int16_t Field(int value) {
  return static_cast<std::int16_t>(std::clamp<int>(value, std::numeric_limits<std::int16_t>::min(),
                                                   std::numeric_limits<std::int16_t>::max()));
}

const char* const kDispClasses[] = {"AddrDisp", "DigitDisp", "NameDisp"};

}  // namespace

GridManager::GridManager(QWidget* parent)
    : QWidget(parent),
      mScroll(new QScrollBar(Qt::Vertical, this)),
      mAcross(new QScrollBar(Qt::Horizontal, this)) {
  setFocusPolicy(Qt::StrongFocus);
  setAutoFillBackground(true);
  mAcross->hide();
  connect(mScroll, &QScrollBar::valueChanged, this, [this](int value) {
    if (value != DispFirstLine()) {
      DispScrollTo(value);
      for (GridDisp* disp : Disps()) disp->update();
    }
  });
  connect(mAcross, &QScrollBar::valueChanged, this, &GridManager::SetScrollX);
}

GridManager::GridManager(const ConstructionRecord& record) : GridManager(record.parent) {
  setObjectName(QString::fromStdString(record.className));
}

GridManager::GridManager(const Dstring& resource, const Dstring& library, ConditionList& list, QWidget* parent)
    : GridManager(parent) {
  if (ResourceLibrary::Check(library, list) != 0) return;
  QWidget* form = ResourceLibrary::Load(resource, this, list);
  if (form == nullptr) return;
  for (const Dstring& name : GetOiFields()) {
    const QVariant value = form->property(name.c_str());
    if (value.isValid()) setProperty(name.c_str(), value);
  }
  for (GridDisp* disp : form->findChildren<GridDisp*>()) disp->setParent(this);
  delete form;
  Refresh();
}

GridManager::~GridManager() = default;

void GridManager::CppRegister() {
  WidgetClassTable::AddFactory(Class(), [](QWidget* parent) { return OiNew({Class(), parent}); });
  WidgetClassTable::AddFactory("AddrDisp", [](QWidget* parent) -> QWidget* { return new AddrDisp(parent); });
  WidgetClassTable::AddFactory("DigitDisp", [](QWidget* parent) -> QWidget* { return new DigitDisp(parent); });
  WidgetClassTable::AddFactory("NameDisp", [](QWidget* parent) -> QWidget* { return new NameDisp(parent); });
}

int GridManager::Register(ConditionList& list) {
  CppRegister();
  int status = WidgetClassTable::Register(Class(), list);
  for (const char* name : kDispClasses) {
    if (int rc = WidgetClassTable::Register(name, list); rc != 0 && status == 0) status = rc;
  }
  return status;
}

QWidget* GridManager::OiNew(const ConstructionRecord& record) { return new GridManager(record); }

void GridManager::OiDelete(QWidget* object) { delete object; }

const std::vector<Dstring>& GridManager::GetOiFields() {
  static const std::vector<Dstring> kFields = {"dx", "dy", "offx", "offy"};
  return kFields;
}

void GridManager::SetDX(int value) {
  mFields.dx = Field(value);
  Refresh();
}
void GridManager::SetDY(int value) {
  mFields.dy = Field(value);
  Refresh();
}
void GridManager::SetOffX(int value) {
  mFields.offx = Field(value);
  Refresh();
}
void GridManager::SetOffY(int value) {
  mFields.offy = Field(value);
  Refresh();
}

void GridManager::SetFields(const GridFields& fields) {
  mFields = fields;
  Refresh();
}

std::vector<GridDisp*> GridManager::Disps() const {
  std::vector<GridDisp*> disps;
  for (QObject* child : children()) {
    if (auto* disp = qobject_cast<GridDisp*>(child)) disps.push_back(disp);
  }
  return disps;
}

long GridManager::VisibleLines() const {
  if (mFields.dy <= 0) return 0;
  return std::max(0, (ColumnHeight() - mFields.offy) / mFields.dy);
}

int GridManager::ColumnHeight() const {
  return std::max(0, height() - (mAcross->isHidden() ? 0 : mAcross->sizeHint().height()));
}

void GridManager::SetScrollX(int x) {
  if (x == mScrollX) return;
  mScrollX = x;
  LayoutDisps();
}

void GridManager::ShowAcross(int left, int right) {
  const int shown = width() - mScroll->sizeHint().width();
  int move = right > shown ? right - shown : 0;
  // When both edges cannot show, the left one does.
  if (left - move < 0) move = left;
  mScrollX += move;
  LayoutDisps();
}

void GridManager::Refresh() {
  LayoutDisps();
  Repaint();
}

void GridManager::Repaint() {
  SyncScrollBar();
  for (GridDisp* disp : Disps()) disp->update();
}

bool GridManager::CursorKeyOf(int qtKey, GridKey& key) {
  static const std::pair<int, GridKey> kKeys[] = {
      {Qt::Key_Up, GridKey::kUp},         {Qt::Key_Down, GridKey::kDown},         {Qt::Key_Left, GridKey::kLeft},
      {Qt::Key_Right, GridKey::kRight},   {Qt::Key_PageUp, GridKey::kPageUp},     {Qt::Key_PageDown, GridKey::kPageDown},
      {Qt::Key_Home, GridKey::kHome},     {Qt::Key_End, GridKey::kEnd},
  };
  for (const auto& [qt, grid] : kKeys) {
    if (qt == qtKey) {
      key = grid;
      return true;
    }
  }
  return false;
}

void GridManager::ShowLine(long line) {
  const long first = DispFirstLine();
  const long shown = std::max(1L, VisibleLines());
  if (line < first) {
    DispScrollTo(line);
  } else if (line >= first + shown) {
    DispScrollTo(line - shown + 1);
  } else {
    return;
  }
  Refresh();
}

void GridManager::LayoutDisps() {
  const std::vector<GridDisp*> disps = Disps();
  const int barWidth = mScroll->sizeHint().width();
  const int right = width() - barWidth;
  int fixed = 0;
  int stretching = 0;
  for (const GridDisp* disp : disps) {
    if (disp->Cells() > 0) {
      fixed += disp->Cells() * mFields.dx;
    } else {
      ++stretching;
    }
  }
  const int share = stretching > 0 ? std::max(0, right - mFields.offx - fixed) / stretching : 0;
  auto widthOf = [&](const GridDisp* disp) {
    return disp->Cells() > 0 ? disp->Cells() * mFields.dx : std::max(share, disp->MinCells() * mFields.dx);
  };
  int content = mFields.offx;
  for (const GridDisp* disp : disps) content += widthOf(disp);
  const int beyond = std::max(0, content - right);
  mAcross->setVisible(beyond > 0);
  mScrollX = std::clamp(mScrollX, 0, beyond);
  {
    const QSignalBlocker quiet(mAcross);
    mAcross->setRange(0, beyond);
    mAcross->setPageStep(std::max(1, right));
    mAcross->setSingleStep(std::max(1, static_cast<int>(mFields.dx)));
    mAcross->setValue(mScrollX);
  }
  const int height = ColumnHeight();
  int x = mFields.offx - mScrollX;
  for (GridDisp* disp : disps) {
    const int w = widthOf(disp);
    disp->setGeometry(x, 0, w, height);
    x += w;
  }
  mScroll->setGeometry(right, mFields.offy, barWidth, std::max(0, height - mFields.offy));
  mAcross->setGeometry(0, height, right, this->height() - height);
  // The columns reach under the bars when they scroll: the bars stay on top.
  mScroll->raise();
  mAcross->raise();
}

void GridManager::SyncScrollBar() {
  const long shown = VisibleLines();
  const long last = std::max(0L, DispLineCount() - shown);
  const QSignalBlocker block(mScroll);
  mScroll->setRange(0, static_cast<int>(std::min<long>(last, std::numeric_limits<int>::max())));
  mScroll->setPageStep(static_cast<int>(std::max(1L, shown)));
  mScroll->setValue(static_cast<int>(std::min<long>(DispFirstLine(), std::numeric_limits<int>::max())));
}

void GridManager::resizeEvent(QResizeEvent* event) {
  QWidget::resizeEvent(event);
  Refresh();
}

void GridManager::wheelEvent(QWheelEvent* event) {
  // A sideways wheel, or Shift with the wheel, scrolls the columns across.
  const bool across = event->angleDelta().x() != 0 || (event->modifiers() & Qt::ShiftModifier) != 0;
  if (across && !mAcross->isHidden()) {
    const int delta = event->angleDelta().x() != 0 ? event->angleDelta().x() : event->angleDelta().y();
    SetScrollX(std::clamp(mScrollX - 3 * mFields.dx * delta / 120, 0, mAcross->maximum()));
    event->accept();
    return;
  }
  const int steps = event->angleDelta().y() / 120;
  if (steps == 0) return;
  const long last = std::max(0L, DispLineCount() - VisibleLines());
  DispScrollTo(std::clamp(DispFirstLine() - 3L * steps, 0L, last));
  Refresh();
  event->accept();
}

void GridManager::childEvent(QChildEvent* event) {
  QWidget::childEvent(event);
  // A column is known as one only once it is polished; one that leaves frees its width.
  if (event->type() == QEvent::ChildPolished || event->type() == QEvent::ChildRemoved) LayoutDisps();
}

void GridManager::paintEvent(QPaintEvent*) {
  QPainter painter(this);
  painter.fillRect(rect(), palette().window());
}

// A digit column draws a cell per digit; an address or name column one cell across the column
// per line, its text kept clear of the column's edges.
void GridManager::DispPaint(const GridDisp& disp, QPainter& painter, const QRect& area) const {
  const QPalette& pal = disp.palette();
  const int dy = mFields.dy;
  painter.fillRect(area, pal.base());
  if (mFields.dx <= 0 || dy <= 0) return;
  const bool digits = disp.GetKind() == GridDisp::Kind::kDigit;
  const int dx = digits ? mFields.dx : disp.width();
  const int pad = digits ? 0 : 6;
  const int cells = digits ? disp.CellsShown() : 1;
  std::vector<int> lefts(static_cast<std::size_t>(cells), 0);
  for (int c = 1; c < cells; ++c)
    lefts[static_cast<std::size_t>(c)] = lefts[static_cast<std::size_t>(c - 1)] + dx + DispGap(disp, c - 1);
  const int top = mFields.offy;
  if (area.top() < top) {
    painter.fillRect(QRect(0, 0, disp.width(), top), pal.window());
    painter.setPen(pal.windowText().color());
    const Qt::Alignment align = digits ? Qt::AlignCenter : disp.Alignment();
    for (int c = 0; c < cells; ++c) {
      // A name that does not fit ends in an ellipsis rather than being cut off, a header line
      // by line. A digit's heading (a trace number every few digits) is centred over its
      // digit and may reach over the neighbours, whose headings are empty.
      QStringList lines = DispHeader(disp, c).split(QLatin1Char('\n'));
      if (!digits) {
        for (QString& line : lines) line = painter.fontMetrics().elidedText(line, Qt::ElideRight, dx - 2 * pad);
      }
      painter.drawText(QRect(lefts[static_cast<std::size_t>(c)] + pad, 0, dx - 2 * pad, top), align,
                       lines.join(QLatin1Char('\n')));
    }
  }
  const long first = DispFirstLine();
  const long count = DispLineCount();
  const int from = std::max(0, (area.top() - top) / dy);
  const int to = std::max(0, (area.bottom() - top) / dy);
  const QColor text = pal.text().color();
  const QColor dimText = pal.color(QPalette::Disabled, QPalette::Text);
  const QColor alert(0xc0, 0x10, 0x10);
  for (int i = from; i <= to; ++i) {
    const long line = first + i;
    if (line >= count) break;
    const int y = top + i * dy;
    for (int c = 0; c < cells; ++c) {
      const GridCell cell = DispCell(disp, line, c);
      const QRect box(lefts[static_cast<std::size_t>(c)], y, dx, dy);
      if (cell.cursor) {
        painter.fillRect(box, pal.highlight());
      } else if (cell.selected) {
        // A selection runs on over the gap to a selected neighbour, so that it reads as one.
        const bool joined = c + 1 < cells && DispCell(disp, line, c + 1).selected;
        painter.fillRect(joined ? box.adjusted(0, 0, DispGap(disp, c), 0) : box,
                         pal.highlight().color().lighter(170));
      }
      if (cell.text.isEmpty()) continue;
      painter.setPen(cell.cursor ? pal.highlightedText().color() : cell.marked ? alert : cell.dim ? dimText : text);
      const QString text = digits ? cell.text : painter.fontMetrics().elidedText(cell.text, Qt::ElideRight, dx - 2 * pad);
      painter.drawText(box.adjusted(pad, 0, -pad, 0), digits ? Qt::AlignCenter : disp.Alignment(), text);
    }
  }
}

int GridManager::DispGap(const GridDisp&, int) const {
  return 0;
}

unsigned GridManager::NfyGetMenuItemState(std::uint16_t) { return 0; }
int GridManager::NfyItemHit(std::uint16_t) { return 0; }
bool GridManager::AutoMoveCursor() { return true; }
int GridManager::GetDYMultiplier(long) { return 1; }
void GridManager::GetPortMux(long, double& mux) { mux = 1.0; }
void GridManager::GetNumDigits(long, long& count) { count = 0; }
void GridManager::GetNumVectors(long, long& count) { count = 0; }
long GridManager::GetNumDispDigits(long) { return 0; }
long GridManager::GetNumDispVectors(long) { return 0; }
int GridManager::GetAddrFormat() { return -1; }
int GridManager::GetDataFormat(long) { return -1; }
int GridManager::GetDispMode() { return -1; }
int GridManager::SetDataFormat(long, DataFormat, ConditionList&) { return 0; }
int GridManager::SetAddrFormat(AddrFormat, ConditionList&) { return 0; }
int GridManager::SetDispMode(DigitDispMode, ConditionList&) { return 0; }
int GridManager::GetSegmentProperties(long, long, SegmentProperties&, ConditionList&) { return 0; }
int GridManager::HookOn(long, long, const Dstring&, ConditionList&) { return 0; }
int GridManager::NfyWidthChanged(long, long, ConditionList&) { return 0; }
int GridManager::NfyLengthChanged(long, long, ConditionList&) { return 0; }
int GridManager::NfySetSegmentName(long, long, const Dstring&, ConditionList&) { return 0; }
int GridManager::GetSegmentName(long, long, Dstring& name, ConditionList&) {
  name = "";
  return 0;
}
int GridManager::SaveSegment(long, long, ConditionList&) { return 0; }
int GridManager::SaveSegmentAs(long, long, const Dstring&, ConditionList&) { return 0; }
bool GridManager::IsOk(long, long) { return true; }
int GridManager::SetLabelsEnabled(bool) { return 0; }
bool GridManager::AreLabelsEnabled() { return false; }
int GridManager::SetVectorOffset(long, long, ConditionList&) { return 0; }
int GridManager::SetDigitOffset(long, long, ConditionList&) { return 0; }
void GridManager::GetVectorOffset(long, long& value) { value = 0; }
void GridManager::GetDigitOffset(long, long& value) { value = 0; }
void GridManager::GetPrevVectorOffset(long, long& value) { value = 0; }
void GridManager::GetPrevDigitOffset(long, long& value) { value = 0; }
int GridManager::ResetSelection(ConditionList&) { return 0; }
int GridManager::SetSelection(long, long, long, long, long, long, ConditionList&) { return 0; }
int GridManager::SetVectorSelection(long, long, long, ConditionList&) { return 0; }
int GridManager::SetDigitSelection(long, long, long, ConditionList&) { return 0; }
int GridManager::SetSegmentSelection(long, long, ConditionList&) { return 0; }
int GridManager::FindPattern(FindDirection, VectorTrace, ConditionList&) { return 0; }
int GridManager::ModifyFill(ConditionList&) { return 0; }
int GridManager::ModifyInvert(ConditionList&) { return 0; }
int GridManager::ModifyMirror(MirrorMode, ConditionList&) { return 0; }
int GridManager::ModifyCopy(ConditionList&) { return 0; }
int GridManager::ModifyPaste(ConditionList&) { return 0; }
int GridManager::ModifyInsert(VectorTrace, InsertMode, long, ConditionList&) { return 0; }
int GridManager::ModifyDelete(ConditionList&) { return 0; }
int GridManager::ModifySerialize(Direction, ConditionList&) { return 0; }
int GridManager::ModifyDeserialize(long, long, ConditionList&) { return 0; }
bool GridManager::IsFillPossible() { return false; }
bool GridManager::IsInvertPossible() { return false; }
bool GridManager::IsSerializePossible() { return false; }
bool GridManager::IsDeserializePossible() { return false; }
bool GridManager::IsCodingPossible() { return false; }
bool GridManager::IsMirrorPossible() { return false; }
bool GridManager::IsCopyPossible() { return false; }
bool GridManager::IsPastePossible() { return false; }
bool GridManager::IsInsertPossible() { return false; }
bool GridManager::IsDeletePossible() { return false; }
bool GridManager::IsFindPossible() { return false; }
bool GridManager::IsDirty() { return false; }
int GridManager::GetIsErrorInVector(long) { return 0; }
int GridManager::ModifyCoding(ConditionList&) { return 0; }

long GridManager::DispLineCount() const { return 0; }
long GridManager::DispFirstLine() const { return 0; }
void GridManager::DispScrollTo(long) {}
QString GridManager::DispHeader(const GridDisp&, int) const { return {}; }
GridCell GridManager::DispCell(const GridDisp&, long, int) const { return {}; }
void GridManager::DispPress(const GridDisp&, long, int, Qt::KeyboardModifiers) {}
void GridManager::DispMove(const GridDisp&, long, int) {}
