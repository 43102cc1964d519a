#include "sequences/ui/SchemeView.h"

#include <QContextMenuEvent>
#include <QGraphicsPathItem>
#include <QGraphicsRectItem>
#include <QGraphicsScene>
#include <QGraphicsSimpleTextItem>
#include <QImage>
#include <QMenu>
#include <QPainter>
#include <QSvgGenerator>
#include <QWheelEvent>
#include <algorithm>
#include <cmath>

#include "support/ConditionListLoader.h"

namespace {

constexpr double kModuleWidth = 250;
constexpr double kHeader = 42;
constexpr double kRow = 30;
constexpr double kModuleGap = 14;
constexpr double kColumnGap = 240;  // where the lines run
constexpr double kPad = 16;
constexpr double kGroupTitle = 28;
constexpr double kGroupGap = 24;
constexpr double kAnchor = 6;
constexpr int kMaxTicks = 16;
constexpr double kMinZoom = 0.1;
constexpr double kMaxZoom = 8;

// What an item is, for the items the view answers to.
enum Role { kRoleKind = 0, kRoleFirst = 1, kRoleSecond = 2 };
const QString kPort = QStringLiteral("port");
const QString kLine = QStringLiteral("line");

const QColor kGeneratorColour(0xd6, 0xe6, 0xf7);
const QColor kAnalyserColour(0xdc, 0xef, 0xdc);
const QColor kLineColour(0x1f, 0x5f, 0xa8);
const QColor kSelectedColour(0xe0, 0x70, 0x00);

// The last element of a path (":CGR1:MOD2" → "MOD2").
QString Tail(const Dstring& path) {
  const std::size_t at = path.rfind(':');
  return QString::fromStdString(path.substr(at == Dstring::npos ? 0 : at + 1));
}

QString Text(const QGraphicsItem* item, int role) {
  return item->data(role).toString();
}

// A connection: a curve from a generator port to an analyser port that is easy to hit and
// shows its selection in its own colour.
class LineItem : public QGraphicsPathItem {
 public:
  LineItem(const QPointF& from, const QPointF& to) {
    const double bend = std::max(40.0, std::fabs(to.x() - from.x()) / 2);
    QPainterPath path(from);
    path.cubicTo(from + QPointF(bend, 0), to - QPointF(bend, 0), to);
    setPath(path);
    setFlag(ItemIsSelectable);
    setZValue(2);
  }
  QPainterPath shape() const override {
    QPainterPathStroker stroker;
    stroker.setWidth(10);
    return stroker.createStroke(path());
  }
  void paint(QPainter* painter, const QStyleOptionGraphicsItem*, QWidget*) override {
    painter->setRenderHint(QPainter::Antialiasing);
    painter->setPen(QPen(isSelected() ? kSelectedColour : kLineColour, isSelected() ? 3.5 : 2));
    painter->drawPath(path());
  }
};

QGraphicsSimpleTextItem* Label(const QString& text, QGraphicsItem* parent, const QPointF& at,
                               bool bold = false) {
  auto* label = new QGraphicsSimpleTextItem(text, parent);
  QFont font = label->font();
  font.setBold(bold);
  label->setFont(font);
  label->setPos(at);
  return label;
}

double ModuleHeight(const CFrontendInfo::Module& m) {
  return kHeader + kRow * static_cast<double>(m.ports.size());
}

}  // namespace

SchemeView::SchemeView(QWidget* parent) : QGraphicsView(parent) {
  setObjectName(QStringLiteral("SchemeView"));
  setScene(new QGraphicsScene(this));
  setRenderHint(QPainter::Antialiasing);
  setDragMode(ScrollHandDrag);
  setTransformationAnchor(AnchorViewCenter);
  setBackgroundBrush(QColor(0xf4, 0xf4, 0xf4));
  setFocusPolicy(Qt::StrongFocus);
}

void SchemeView::SetScheme(const std::vector<CFrontendInfo::Group>& groups,
                           const std::vector<CPortConnections::Connection>& connections) {
  CPortConnections::Connection selected;
  const bool hadSelection = SelectedConnection(selected);
  mDragFrom = nullptr;
  mHover = nullptr;
  mRubber = nullptr;
  scene()->clear();
  mAnchors.clear();
  double top = 0;
  for (const CFrontendInfo::Group& g : groups) top += AddGroup(g, top) + kGroupGap;
  for (const CPortConnections::Connection& c : connections) AddLine(c);
  if (groups.empty()) scene()->addSimpleText(QStringLiteral("The instrument reports no modules."));
  scene()->setSceneRect(scene()->itemsBoundingRect().adjusted(-kPad, -kPad, kPad, kPad));
  if (hadSelection) SelectConnection(selected);
  if (mFitting) Fit();
}

double SchemeView::AddGroup(const CFrontendInfo::Group& group, double top) {
  double heights[2] = {0, 0};
  for (const CFrontendInfo::Module& m : group.modules)
    heights[m.generator ? 0 : 1] += ModuleHeight(m) + kModuleGap;
  const double height = kGroupTitle + std::max({heights[0], heights[1], kRow}) + kPad;
  auto* frame = scene()->addRect(0, 0, 2 * kPad + 2 * kModuleWidth + kColumnGap, height,
                                 QPen(QColor(0x80, 0x80, 0x80), 1.5), QColor(0xfc, 0xfc, 0xfc));
  frame->setPos(0, top);
  Label(QStringLiteral("Clock group %1").arg(group.number), frame, {kPad, 6}, true);
  double y[2] = {kGroupTitle, kGroupTitle};
  for (const CFrontendInfo::Module& m : group.modules) {
    const int column = m.generator ? 0 : 1;
    AddModule(m, frame, {kPad + column * (kModuleWidth + kColumnGap), y[column]});
    y[column] += ModuleHeight(m) + kModuleGap;
  }
  return height;
}

void SchemeView::AddModule(const CFrontendInfo::Module& module, QGraphicsItem* frame, const QPointF& at) {
  auto* box = new QGraphicsRectItem(0, 0, kModuleWidth, ModuleHeight(module), frame);
  box->setPen(QPen(QColor(0x60, 0x60, 0x60)));
  box->setBrush(Qt::white);
  box->setPos(at);
  auto* header = new QGraphicsRectItem(0, 0, kModuleWidth, kHeader, box);
  header->setPen(Qt::NoPen);
  header->setBrush(module.generator ? kGeneratorColour : kAnalyserColour);
  Label(QStringLiteral("%1   %2").arg(Tail(module.path), QString::fromStdString(module.model)), box, {8, 4},
        true);
  Label(QStringLiteral("Slot %1 · %2")
            .arg(module.slot)
            .arg(module.generator ? QStringLiteral("generator") : QStringLiteral("analyser")),
        box, {8, 22});
  double top = kHeader;
  for (const CFrontendInfo::Port& p : module.ports) {
    AddPort(p, module.generator, box, top);
    top += kRow;
  }
}

void SchemeView::AddPort(const CFrontendInfo::Port& port, bool generator, QGraphicsItem* box, double top) {
  const bool data = port.portClass == "PDAT";
  const QString path = QString::fromStdString(port.path);
  auto* row = new QGraphicsRectItem(0, 0, kModuleWidth, kRow, box);
  row->setPen(QPen(QColor(0xe0, 0xe0, 0xe0)));
  row->setPos(0, top);
  row->setData(kRoleKind, kPort);
  row->setData(kRoleFirst, path);
  row->setData(kRoleSecond, !data       ? QStringLiteral("CLOCK")
                            : generator ? QStringLiteral("GEN")
                                        : QStringLiteral("ANA"));
  row->setToolTip(!data       ? QStringLiteral("%1: a clock output; it is not connected here").arg(path)
                  : generator ? QStringLiteral("%1: drag to an analyser port to connect").arg(path)
                              : QStringLiteral("%1: drag to a generator port to connect").arg(path));
  Label(data ? QStringLiteral("%1  data · %2 terminal%3")
                   .arg(Tail(port.path))
                   .arg(port.terminals)
                   .arg(port.terminals == 1 ? "" : "s")
             : QStringLiteral("%1  clock").arg(Tail(port.path)),
        row, {generator ? 10.0 : 18.0, 7});
  const int ticks = data ? static_cast<int>(std::min<long>(port.terminals, kMaxTicks)) : 0;
  const double tickRight = generator ? kModuleWidth - 16 : kModuleWidth - 8;
  for (int t = 0; t < ticks; ++t) {
    auto* tick = new QGraphicsRectItem(0, 0, 3, 10, row);
    tick->setPen(Qt::NoPen);
    tick->setBrush(QColor(0x70, 0x70, 0x70));
    tick->setPos(tickRight - (ticks - t) * 5.0, 10);
  }
  const double x = generator ? kModuleWidth : 0;
  auto* circle = new QGraphicsEllipseItem(x - kAnchor, kRow / 2 - kAnchor, 2 * kAnchor, 2 * kAnchor, row);
  circle->setPen(QPen(data ? kLineColour : QColor(0x90, 0x90, 0x90), 1.5));
  circle->setBrush(Qt::white);
  mAnchors[port.path] = circle;
}

void SchemeView::AddLine(const CPortConnections::Connection& connection) {
  QPointF from, to;
  if (!PortAnchor(connection.generator, from) || !PortAnchor(connection.analyser, to)) return;
  // A connected port's circle is filled; the line runs from the rim of one to the other's.
  mAnchors[connection.generator]->setBrush(kLineColour);
  mAnchors[connection.analyser]->setBrush(kLineColour);
  auto* line = new LineItem(from + QPointF(kAnchor, 0), to - QPointF(kAnchor, 0));
  const QString generator = QString::fromStdString(connection.generator);
  const QString analyser = QString::fromStdString(connection.analyser);
  line->setData(kRoleKind, kLine);
  line->setData(kRoleFirst, generator);
  line->setData(kRoleSecond, analyser);
  line->setToolTip(QStringLiteral("%1 → %2").arg(generator, analyser));
  scene()->addItem(line);
}

void SchemeView::SetReadOnly(bool readOnly) {
  mReadOnly = readOnly;
  if (mRubber != nullptr) {
    delete mRubber;
    mRubber = nullptr;
  }
  Hover(nullptr);
  mDragFrom = nullptr;
}

bool SchemeView::PortAnchor(const Dstring& path, QPointF& at) const {
  auto found = mAnchors.find(path);
  if (found == mAnchors.end()) return false;
  at = found->second->mapToScene(found->second->rect().center());
  return true;
}

bool SchemeView::SelectedConnection(CPortConnections::Connection& out) const {
  for (const QGraphicsItem* item : scene()->selectedItems()) {
    if (Text(item, kRoleKind) != kLine) continue;
    out = {Text(item, kRoleFirst).toStdString(), Text(item, kRoleSecond).toStdString()};
    return true;
  }
  return false;
}

bool SchemeView::SelectConnection(const CPortConnections::Connection& connection) {
  scene()->clearSelection();
  for (QGraphicsItem* item : scene()->items()) {
    if (Text(item, kRoleKind) == kLine && Text(item, kRoleFirst).toStdString() == connection.generator &&
        Text(item, kRoleSecond).toStdString() == connection.analyser) {
      item->setSelected(true);
      return true;
    }
  }
  return false;
}

int SchemeView::NumLines() const {
  const QList<QGraphicsItem*> all = scene()->items();
  return static_cast<int>(std::count_if(
      all.begin(), all.end(), [](const QGraphicsItem* item) { return Text(item, kRoleKind) == kLine; }));
}

void SchemeView::ZoomBy(double factor) {
  const double zoom = std::clamp(Zoom() * factor, kMinZoom, kMaxZoom);
  scale(zoom / Zoom(), zoom / Zoom());
  mFitting = false;
}

void SchemeView::Fit() {
  mFitting = true;
  fitInView(scene()->sceneRect(), Qt::KeepAspectRatio);
  // A small rack is shown at its natural size rather than blown up.
  if (Zoom() > 1) setTransform(QTransform());
}

void SchemeView::resizeEvent(QResizeEvent* event) {
  QGraphicsView::resizeEvent(event);
  if (mFitting) Fit();
}

QGraphicsItem* SchemeView::PortAt(const QPoint& pos) const {
  for (QGraphicsItem* item : items(pos)) {
    for (QGraphicsItem* up = item; up != nullptr; up = up->parentItem()) {
      if (Text(up, kRoleKind) == kPort) return up;
    }
  }
  return nullptr;
}

QGraphicsItem* SchemeView::LineAt(const QPoint& pos) const {
  for (QGraphicsItem* item : items(pos)) {
    if (Text(item, kRoleKind) == kLine) return item;
  }
  return nullptr;
}

void SchemeView::wheelEvent(QWheelEvent* event) {
  if (!(event->modifiers() & Qt::ControlModifier)) return QGraphicsView::wheelEvent(event);
  // The wheel zooms about the mouse; keys and buttons about the middle.
  setTransformationAnchor(AnchorUnderMouse);
  ZoomBy(std::pow(1.15, event->angleDelta().y() / 120.0));
  setTransformationAnchor(AnchorViewCenter);
  event->accept();
}

void SchemeView::mousePressEvent(QMouseEvent* event) {
  QGraphicsItem* port = event->button() == Qt::LeftButton && !mReadOnly ? PortAt(event->pos()) : nullptr;
  if (port == nullptr || Text(port, kRoleSecond) == QStringLiteral("CLOCK"))
    return QGraphicsView::mousePressEvent(event);
  mDragFrom = port;
  QPointF from;
  PortAnchor(Text(port, kRoleFirst).toStdString(), from);
  mRubber = scene()->addLine(QLineF(from, mapToScene(event->pos())), QPen(kSelectedColour, 2, Qt::DashLine));
  mRubber->setZValue(4);
  event->accept();
}

void SchemeView::mouseMoveEvent(QMouseEvent* event) {
  if (mRubber == nullptr) return QGraphicsView::mouseMoveEvent(event);
  mRubber->setLine(QLineF(mRubber->line().p1(), mapToScene(event->pos())));
  QGraphicsItem* port = PortAt(event->pos());
  Hover(port != mDragFrom && port != nullptr && Text(port, kRoleSecond) != QStringLiteral("CLOCK") ? port
                                                                                                   : nullptr);
  event->accept();
}

void SchemeView::Hover(QGraphicsItem* port) {
  if (port == mHover) return;
  if (auto* row = static_cast<QGraphicsRectItem*>(mHover)) row->setBrush(Qt::NoBrush);
  if (auto* row = static_cast<QGraphicsRectItem*>(port)) row->setBrush(QColor(0xfd, 0xe8, 0xd0));
  mHover = port;
}

void SchemeView::mouseReleaseEvent(QMouseEvent* event) {
  if (mRubber == nullptr) return QGraphicsView::mouseReleaseEvent(event);
  delete mRubber;
  mRubber = nullptr;
  Hover(nullptr);
  const QGraphicsItem* from = mDragFrom;
  mDragFrom = nullptr;
  const QGraphicsItem* to = PortAt(event->pos());
  event->accept();
  if (to == nullptr || to == from) return;
  // Dragged the other way round, it still means the generator drives the analyser.
  const bool reversed =
      Text(from, kRoleSecond) == QStringLiteral("ANA") && Text(to, kRoleSecond) == QStringLiteral("GEN");
  const QString a = Text(from, kRoleFirst);
  const QString b = Text(to, kRoleFirst);
  emit ConnectRequested(reversed ? b : a, reversed ? a : b);
}

void SchemeView::keyPressEvent(QKeyEvent* event) {
  const bool ctrl = event->modifiers() & Qt::ControlModifier;
  if (ctrl && (event->key() == Qt::Key_Plus || event->key() == Qt::Key_Equal)) {
    ZoomBy(1.25);
  } else if (ctrl && event->key() == Qt::Key_Minus) {
    ZoomBy(1 / 1.25);
  } else if (ctrl && event->key() == Qt::Key_0) {
    Fit();
  } else if (event->key() == Qt::Key_Delete || event->key() == Qt::Key_Backspace) {
    const QList<QGraphicsItem*> selected = scene()->selectedItems();
    if (!selected.isEmpty()) AskRemove(selected.front());
  } else {
    return QGraphicsView::keyPressEvent(event);
  }
  event->accept();
}

void SchemeView::contextMenuEvent(QContextMenuEvent* event) {
  QGraphicsItem* line = LineAt(event->pos());
  QMenu menu(this);
  if (line != nullptr) {
    scene()->clearSelection();
    line->setSelected(true);
    // A poll may draw the scheme anew while the menu is open: the action keeps the names.
    const QString generator = Text(line, kRoleFirst);
    const QString analyser = Text(line, kRoleSecond);
    QAction* remove =
        menu.addAction(QStringLiteral("Remove Connection %1 → %2").arg(generator.mid(1), analyser.mid(1)));
    remove->setEnabled(!mReadOnly);
    connect(remove, &QAction::triggered, this, [this, generator, analyser] {
      if (!mReadOnly) emit RemoveRequested(generator, analyser);
    });
    menu.addSeparator();
  }
  menu.addAction(QStringLiteral("Zoom In\tCtrl++"), this, [this] { ZoomBy(1.25); });
  menu.addAction(QStringLiteral("Zoom Out\tCtrl+-"), this, [this] { ZoomBy(1 / 1.25); });
  menu.addAction(QStringLiteral("Fit\tCtrl+0"), this, &SchemeView::Fit);
  menu.exec(event->globalPos());
}

void SchemeView::AskRemove(const QGraphicsItem* line) {
  if (mReadOnly || Text(line, kRoleKind) != kLine) return;
  emit RemoveRequested(Text(line, kRoleFirst), Text(line, kRoleSecond));
}

template <class Paint>
void SchemeView::Unselected(Paint paint) {
  const QList<QGraphicsItem*> selected = scene()->selectedItems();
  scene()->clearSelection();
  paint();
  for (QGraphicsItem* item : selected) item->setSelected(true);
}

int SchemeView::ExportPng(const Dstring& path, ConditionList& list) {
  const QRectF rect = scene()->sceneRect();
  QImage image((rect.size() * 2).toSize(), QImage::Format_ARGB32);
  image.fill(Qt::white);
  Unselected([&] {
    QPainter painter(&image);
    painter.setRenderHint(QPainter::Antialiasing);
    scene()->render(&painter, QRectF(QPointF(0, 0), image.size()), rect);
  });
  if (image.save(QString::fromStdString(path), "PNG")) return 0;
  ConditionListLoader::ConditionToken(list, "GUI_SCHEME_EXPORT_FAILED", {path}, 1);
  return 1;
}

int SchemeView::ExportSvg(const Dstring& path, ConditionList& list) {
  const QRectF rect = scene()->sceneRect();
  QSvgGenerator svg;
  svg.setFileName(QString::fromStdString(path));
  svg.setSize(rect.size().toSize());
  svg.setViewBox(QRectF(QPointF(0, 0), rect.size()));
  // Texts in points come out the size they have on the screen.
  svg.setResolution(logicalDpiY());
  svg.setTitle(QStringLiteral("System scheme"));
  svg.setDescription(QStringLiteral("The modules, ports and connections of the rack."));
  bool ok = false;
  Unselected([&] {
    QPainter painter;
    if (!painter.begin(&svg)) return;
    painter.fillRect(QRectF(QPointF(0, 0), rect.size()), Qt::white);
    scene()->render(&painter, QRectF(QPointF(0, 0), rect.size()), rect);
    ok = painter.end();
  });
  if (ok) return 0;
  ConditionListLoader::ConditionToken(list, "GUI_SCHEME_EXPORT_FAILED", {path}, 1);
  return 1;
}
