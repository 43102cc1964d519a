#include "sequences/ui/LoopGridManager.h"

#include <QAction>
#include <QCompleter>
#include <QDataStream>
#include <QKeyEvent>
#include <QLineEdit>
#include <QMimeData>
#include <QPainter>
#include <algorithm>

#include "segments/QenSegmentPool.h"
#include "segments/ui/GridDisp.h"
#include "segments/ui/NameDisp.h"
#include "sequences/CLoop.h"
#include "sequences/CSequence.h"
#include "sequences/CSequenceBlock.h"
#include "sequences/SequenceUndo.h"
#include "sequences/ui/SequenceFollower.h"
#include "support/NumberText.h"
#include "toolkit/qt/WidgetClassTable.h"

namespace {

const QLatin1String kBlocks("blocks");
const QLatin1String kLoops("loops");
const QLatin1String kLabels("labels");
const QLatin1String kLengths("lengths");
const QLatin1String kMarks("marks");
const QLatin1String kPortPrefix("port");

QString CountText(unsigned long iterations) {
  return iterations == 0
             ? QStringLiteral("\u221E")
             : QStringLiteral("\u00D7%1").arg(QString::fromStdString(NumberText::Grouped(iterations)));
}

}  // namespace

LoopGridManager::LoopGridManager(QWidget* parent)
    : GridManager(parent),
      mFollower(std::make_unique<SequenceFollower>(this, [this] { Sync(); })),
      mEditor(new QLineEdit(this)) {
  setObjectName(QString::fromLatin1(Class()));
  setAcceptDrops(true);
  mEditor->hide();
  mEditor->installEventFilter(this);
  AddActions();
}

LoopGridManager::~LoopGridManager() { mFollower->Follow(nullptr); }

void LoopGridManager::CppRegister() {
  WidgetClassTable::AddFactory(Class(),
                               [](QWidget* parent) -> QWidget* { return new LoopGridManager(parent); });
}

void LoopGridManager::SetSequence(CSequence* sequence) {
  mModel.SetSequence(nullptr);
  mFollower->Follow(sequence);
  mModel.SetSequence(sequence);
  Sync();
}

// --- Cursor ------------------------------------------------------------------------------------

void LoopGridManager::SetCursor(unsigned long block, int field, bool extend) {
  if (mModel.Lines() == 0) return;
  mModel.SetCursor(block, field, extend);
  Follow();
}

void LoopGridManager::Follow() {
  ShowLine(mModel.CursorRow());
  Refresh();
  const QRect cell = CellRect(mModel.CursorRow(), mModel.CursorField());
  if (cell.isValid()) ShowAcross(cell.left(), cell.right() + 1);
  emit StateChanged();
}

QString LoopGridManager::CellText(unsigned long block, int field) const {
  return QString::fromStdString(mModel.CellText(block, field));
}

QString LoopGridManager::MarksOf(const CSequence& sequence, unsigned long block) {
  return QString::fromStdString(LoopGridModel::MarksOf(sequence, block));
}

// --- Following the model -----------------------------------------------------------------------

void LoopGridManager::Sync() {
  mFollower->Refreshed();
  mModel.Sync();
  SyncColumns();
  mFirst = std::clamp(mFirst, 0L, std::max(0L, mModel.Lines() - VisibleLines()));
  Refresh();
  emit StateChanged();
}

// A column per data port, added or taken away when the number of ports changes; the loop lanes
// as wide as the levels need.
void LoopGridManager::SyncColumns() {
  const unsigned long ports = mModel.Ports();
  const unsigned long levels = mModel.Levels();
  if (auto* loops = findChild<GridDisp*>(kLoops, Qt::FindDirectChildrenOnly)) {
    if (loops->Cells() != static_cast<int>(levels) * kLaneCells)
      loops->SetCells(static_cast<int>(levels) * kLaneCells);
  }
  if (ports == mPortColumns) return;
  for (GridDisp* disp : Disps()) {
    if (disp->objectName().startsWith(kPortPrefix)) delete disp;
  }
  for (unsigned long p = 1; p <= ports; ++p) {
    auto* disp = new NameDisp(this);
    disp->setObjectName(kPortPrefix + QString::number(p));
    // Narrower than a short segment name, a port column would show nothing: the grid scrolls.
    disp->SetMinCells(kPortCells);
    disp->show();
  }
  mPortColumns = ports;
  LayoutDisps();
}

long LoopGridManager::DispLineCount() const { return mModel.Lines(); }

// --- Drawing -----------------------------------------------------------------------------------

int LoopGridManager::FieldAt(const GridDisp& disp, int cell) const {
  const QString name = disp.objectName();
  if (name == kLoops) return mModel.Levels() == 0 ? -1 : std::min(cell / kLaneCells, static_cast<int>(mModel.Levels()) - 1);
  if (name == kLabels) return LabelField();
  if (name == kLengths) return LengthField();
  if (name.startsWith(kPortPrefix)) return PortField(name.mid(kPortPrefix.size()).toULong());
  return -1;
}

QString LoopGridManager::DispHeader(const GridDisp& disp, int) const {
  const QString name = disp.objectName();
  if (name == kBlocks) return QStringLiteral("Block");
  if (name == kLabels) return QStringLiteral("Label");
  if (name == kLengths) return QStringLiteral("Length");
  if (name == kMarks) return QStringLiteral("Marks");
  // The header is drawn with a margin of six points each side.
  if (name.startsWith(kPortPrefix) && mPortHeader)
    return mPortHeader(name.mid(kPortPrefix.size()).toULong(), disp.width() - 12);
  return name.startsWith(kPortPrefix) ? QStringLiteral("Port %1").arg(name.mid(kPortPrefix.size()))
                                      : QString();
}

void LoopGridManager::SetSegmentNames(const QStringList& names) {
  mSegmentNames = names;
  mSegmentsKnown = true;
  Refresh();
}

GridCell LoopGridManager::DispCell(const GridDisp& disp, long line, int cell) const {
  GridCell out;
  const auto block = static_cast<unsigned long>(line) + 1;
  const int field = FieldAt(disp, cell);
  if (disp.objectName() == kBlocks) {
    out.text = QString::number(block);
  } else if (disp.objectName() == kMarks) {
    out.text = MarksOf(*GetSequence(), block);
  } else if (field >= 0) {
    out.text = CellText(block, field);
    const unsigned long port = PortOf(field);
    const bool named = port != 0 && GetSequence()->GetType(block, port) == CSequence::SEG_NAMED;
    out.dim = port != 0 && !named;
    out.marked = named && mSegmentsKnown && !mSegmentNames.contains(out.text) &&
                 !QenSegmentPool::IsOpenHere(out.text.toStdString());
    out.cursor = line == mModel.CursorRow() && field == mModel.CursorField() && !IsEditing();
  }
  // A run of blocks shows as selected; a single block by its number.
  out.selected = IsSelected(block) || (line == mModel.CursorRow() && disp.objectName() == kBlocks);
  return out;
}

void LoopGridManager::DispPaint(const GridDisp& disp, QPainter& painter, const QRect& area) const {
  if (disp.objectName() == kLoops) return PaintLoops(disp, painter, area);
  GridManager::DispPaint(disp, painter, area);
}

// A lane per level, the top level on the left. A loop is a bracket beside its blocks, with its
// count at its first block; a loop that starts above the lines shown repeats its count, dimmed,
// at the first line shown.
void LoopGridManager::PaintLoops(const GridDisp& disp, QPainter& painter, const QRect& area) const {
  const QPalette& pal = disp.palette();
  painter.fillRect(area, pal.base());
  const int top = GetOffY();
  const int dy = GetDY();
  if (mModel.Levels() == 0 || dy <= 0) return;
  const int lane = disp.width() / static_cast<int>(mModel.Levels());
  painter.fillRect(QRect(0, 0, disp.width(), top), pal.window());
  painter.setPen(pal.windowText().color());
  for (unsigned long level = mModel.Levels(); level >= 1; --level) {
    const int x = LaneField(level) * lane;
    painter.drawText(QRect(x, 0, lane, top), Qt::AlignCenter,
                     level == mModel.Levels() ? QStringLiteral("Loop %1\n(top)").arg(level)
                                      : QStringLiteral("Loop %1").arg(level));
  }
  const long count = DispLineCount();
  const QColor dimText = pal.color(QPalette::Disabled, QPalette::Text);
  for (long i = std::max(0, (area.top() - top) / dy); mFirst + i < count; ++i) {
    const int y = top + static_cast<int>(i) * dy;
    if (y > area.bottom()) break;
    const long line = mFirst + i;
    const auto block = static_cast<unsigned long>(line) + 1;
    const bool selected = IsSelected(block);
    for (unsigned long level = 1; level <= mModel.Levels(); ++level) {
      const int field = LaneField(level);
      const QRect box(field * lane, y, lane, dy);
      const bool cursor = line == mModel.CursorRow() && field == mModel.CursorField();
      if (cursor) {
        painter.fillRect(box, pal.highlight());
      } else if (selected) {
        painter.fillRect(box, pal.highlight().color().lighter(170));
      }
      const CSequence::LOOP_STATUS status = GetSequence()->GetLoopStatus(block, level);
      if (status == CSequence::LOOP_NONE) continue;
      const bool starts = status == CSequence::LOOP_START || status == CSequence::LOOP_SINGLE;
      const bool ends = status == CSequence::LOOP_END || status == CSequence::LOOP_SINGLE;
      const int x = box.left() + 5;
      const int y0 = starts ? box.top() + 3 : box.top();
      const int y1 = ends ? box.bottom() - 3 : box.bottom() + 1;
      painter.setPen(QPen(cursor ? pal.highlightedText().color() : pal.text().color(), 2));
      painter.drawLine(x, y0, x, y1);
      if (starts) painter.drawLine(x, y0, x + 5, y0);
      if (ends) painter.drawLine(x, y1, x + 5, y1);
      if (starts || i == 0) {
        painter.setPen(cursor ? pal.highlightedText().color() : starts ? pal.text().color() : dimText);
        const QString text = painter.fontMetrics().elidedText(
            CountText(GetSequence()->GetNumIterations(block, level)), Qt::ElideRight, box.width() - 14);
        painter.drawText(box.adjusted(10, 0, -2, 0), Qt::AlignLeft | Qt::AlignVCenter, text);
      }
    }
  }
}

// --- Pointer -----------------------------------------------------------------------------------

void LoopGridManager::DispPress(const GridDisp& disp, long line, int cell, Qt::KeyboardModifiers modifiers) {
  if (IsEditing()) CommitEdit();
  const int field = FieldAt(disp, cell);
  SetCursor(static_cast<unsigned long>(line) + 1, field >= 0 ? field : mModel.CursorField(), modifiers & Qt::ShiftModifier);
}

void LoopGridManager::DispMove(const GridDisp& disp, long line, int cell) {
  const int field = FieldAt(disp, cell);
  SetCursor(static_cast<unsigned long>(line) + 1, field >= 0 ? field : mModel.CursorField(), true);
}

bool LoopGridManager::CellAt(const QPoint& point, long& line, int& field) const {
  for (GridDisp* disp : Disps()) {
    if (!disp->geometry().contains(point)) continue;
    int cell = 0;
    if (!disp->HitCell(disp->mapFrom(this, point), line, cell)) return false;
    field = FieldAt(*disp, cell);
    return field >= 0;
  }
  return false;
}

QRect LoopGridManager::CellRect(long line, int field) const {
  const int y = GetOffY() + static_cast<int>(line - mFirst) * GetDY();
  for (GridDisp* disp : Disps()) {
    const QString name = disp->objectName();
    if (name == kLoops && LevelOf(field) != 0) {
      const int lane = disp->width() / static_cast<int>(mModel.Levels());
      return QRect(disp->x() + field * lane, y, lane, GetDY());
    }
    if (name != kLoops && FieldAt(*disp, 0) == field) return QRect(disp->x(), y, disp->width(), GetDY());
  }
  return {};
}

QString LoopGridManager::DroppedName(const QMimeData* mime) {
  // A list's items travel as the model's item data; their display text is the name.
  const QString listFormat = QStringLiteral("application/x-qabstractitemmodeldatalist");
  if (mime->hasFormat(listFormat)) {
    QByteArray bytes = mime->data(listFormat);
    QDataStream stream(&bytes, QIODevice::ReadOnly);
    int row = 0;
    int column = 0;
    QMap<int, QVariant> roles;
    stream >> row >> column >> roles;
    return roles.value(Qt::DisplayRole).toString();
  }
  return mime->hasText() ? mime->text().trimmed() : QString();
}

void LoopGridManager::dragEnterEvent(QDragEnterEvent* event) {
  if (GetSequence() != nullptr && !DroppedName(event->mimeData()).isEmpty()) event->acceptProposedAction();
}

void LoopGridManager::dragMoveEvent(QDragMoveEvent* event) {
  long line = 0;
  int field = 0;
  if (CellAt(event->position().toPoint(), line, field) && PortOf(field) != 0) {
    event->acceptProposedAction();
  } else {
    event->ignore();
  }
}

void LoopGridManager::dropEvent(QDropEvent* event) {
  long line = 0;
  int field = 0;
  const QString name = DroppedName(event->mimeData());
  if (name.isEmpty() || !CellAt(event->position().toPoint(), line, field) || PortOf(field) == 0) return;
  event->acceptProposedAction();
  SetCursor(static_cast<unsigned long>(line) + 1, field);
  SetCellText(static_cast<unsigned long>(line) + 1, field, name);
}

// --- Keys --------------------------------------------------------------------------------------

// The commands are the grid's actions, so they have their keys while the grid has the focus and
// make its context menu.
QList<QKeySequence> LoopGridManager::RedoKeys() {
  return {QKeySequence(Qt::CTRL | Qt::Key_Y), QKeySequence(Qt::CTRL | Qt::SHIFT | Qt::Key_Z)};
}

void LoopGridManager::AddActions() {
  struct Entry {
    const char* name;
    const char* text;
    QList<QKeySequence> keys;
    std::function<void()> run;
  };
  const Entry entries[] = {
      {"EditCell", "&Edit Cell", {QKeySequence(Qt::Key_F2)}, [this] { BeginEdit(); }},
      {"InsertAfter", "&Insert Block After", {QKeySequence(Qt::Key_Insert)}, [this] { InsertBlock(false); }},
      {"InsertBefore",
       "Insert Block &Before",
       {QKeySequence(Qt::CTRL | Qt::SHIFT | Qt::Key_Insert)},
       [this] { InsertBlock(true); }},
      {"Delete",
       "&Delete Block (Loop on a Lane)",
       {QKeySequence(QKeySequence::Delete)},
       [this] { LevelOf(mModel.CursorField()) != 0 ? RemoveLoop() : DeleteBlock(); }},
      {"MoveUp", "Move Block &Up", {QKeySequence(Qt::CTRL | Qt::Key_Up)}, [this] { MoveBlock(-1); }},
      {"MoveDown", "Move Block Do&wn", {QKeySequence(Qt::CTRL | Qt::Key_Down)}, [this] { MoveBlock(1); }},
      {"Cut", "Cu&t Block", QKeySequence::keyBindings(QKeySequence::Cut), [this] { CutBlock(); }},
      {"Copy", "&Copy Block", QKeySequence::keyBindings(QKeySequence::Copy), [this] { CopyBlock(); }},
      {"Paste", "&Paste Block After", QKeySequence::keyBindings(QKeySequence::Paste),
       [this] { PasteBlock(); }},
      {"AddLoop", "&Loop Selected Blocks", {QKeySequence(Qt::CTRL | Qt::Key_L)}, [this] { AddLoop(); }},
      {"RemoveLoop",
       "&Remove Loop",
       {QKeySequence(Qt::CTRL | Qt::SHIFT | Qt::Key_L)},
       [this] { RemoveLoop(); }},
      {"Undo", "&Undo", QKeySequence::keyBindings(QKeySequence::Undo), [this] { Undo(); }},
      {"Redo", "Re&do", RedoKeys(), [this] { Redo(); }},
      {"OpenSegment",
       "&Open Segment",
       {QKeySequence(Qt::CTRL | Qt::Key_E)},
       [this] {
         if (PortOf(mModel.CursorField()) != 0 &&
             GetSequence()->GetType(CursorBlock(), PortOf(mModel.CursorField())) == CSequence::SEG_NAMED) {
           emit OpenSegmentRequested(CursorBlock(), PortOf(mModel.CursorField()));
         }
       }},
      {"OpenEvents",
       "Block E&vents...",
       {QKeySequence(Qt::CTRL | Qt::Key_R)},
       [this] { emit OpenEventsRequested(CursorBlock()); }},
  };
  for (const Entry& e : entries) {
    auto* action = new QAction(QString::fromUtf8(e.text), this);
    action->setObjectName(QLatin1String(e.name));
    action->setShortcuts(e.keys);
    action->setShortcutContext(Qt::WidgetShortcut);
    addAction(action);
    connect(action, &QAction::triggered, this, [this, run = e.run] {
      if (GetSequence() != nullptr && DispLineCount() > 0) run();
    });
  }
  setContextMenuPolicy(Qt::ActionsContextMenu);
}

void LoopGridManager::keyPressEvent(QKeyEvent* event) {
  if (GetSequence() == nullptr) return GridManager::keyPressEvent(event);
  const Qt::KeyboardModifiers modifiers = event->modifiers();
  if (GridKey key; CursorKeyOf(event->key(), key)) {
    if (mModel.Lines() > 0) {
      mModel.PressKey(key, modifiers & Qt::ShiftModifier, modifiers & Qt::ControlModifier, VisibleLines());
      Follow();
    }
    event->accept();
    return;
  }
  if (event->key() == Qt::Key_Return || event->key() == Qt::Key_Enter) {
    BeginEdit();
  } else if (!event->text().isEmpty() && event->text().at(0).isPrint() &&
             !(modifiers & (Qt::ControlModifier | Qt::AltModifier | Qt::MetaModifier))) {
    // Typing starts the cell's editor with what was typed, as a table does.
    BeginEdit(event->text());
  } else {
    GridManager::keyPressEvent(event);
    return;
  }
  event->accept();
}

// --- The cell editor ---------------------------------------------------------------------------

void LoopGridManager::BeginEdit(const QString& text) {
  if (GetSequence() == nullptr || DispLineCount() == 0) return;
  const unsigned long level = LevelOf(mModel.CursorField());
  if (level != 0 && GetSequence()->GetLoopStatus(CursorBlock(), level) == CSequence::LOOP_NONE) return;
  ShowLine(mModel.CursorRow());
  const QRect box = CellRect(mModel.CursorRow(), mModel.CursorField());
  if (box.isEmpty()) return;
  mEditField = mModel.CursorField();
  mEditRow = mModel.CursorRow();
  mEditor->setCompleter(nullptr);
  if (PortOf(mModel.CursorField()) != 0) {
    QStringList words = mSegmentNames;
    for (int type = CSequence::SEG_PAUSE; type <= CSequence::SEG_DONTCARE; ++type) {
      words << QLatin1String(CSequence::CSequenceBlock::KeywordOf(static_cast<CSequence::SeqSegType>(type)));
    }
    auto* completer = new QCompleter(words, mEditor);
    completer->setCaseSensitivity(Qt::CaseInsensitive);
    completer->setFilterMode(Qt::MatchContains);
    mEditor->setCompleter(completer);
  }
  mEditor->setGeometry(box.adjusted(0, -2, 0, 2));
  mEditor->setText(text.isNull() ? CellText(CursorBlock(), mModel.CursorField()) : text);
  mEditor->show();
  mEditor->setFocus();
  Refresh();
}

// Enter and Tab commit the cell's text, Escape drops it; neither reaches the grid, which would
// take Enter for another edit.
bool LoopGridManager::eventFilter(QObject* watched, QEvent* event) {
  if (watched != mEditor || event->type() != QEvent::KeyPress)
    return GridManager::eventFilter(watched, event);
  switch (static_cast<QKeyEvent*>(event)->key()) {
    case Qt::Key_Return:
    case Qt::Key_Enter:
    case Qt::Key_Tab:
      CommitEdit();
      return true;
    case Qt::Key_Escape:
      CancelEdit();
      return true;
    default:
      return false;
  }
}

void LoopGridManager::CommitEdit() {
  if (!IsEditing()) return;
  const int field = std::exchange(mEditField, -1);
  const QString text = mEditor->text().trimmed();
  mEditor->hide();
  setFocus();
  const auto block = static_cast<unsigned long>(mEditRow) + 1;
  if (text != CellText(block, field)) SetCellText(block, field, text);
  Refresh();
}

void LoopGridManager::CancelEdit() {
  mEditField = -1;
  mEditor->hide();
  setFocus();
  Refresh();
}
