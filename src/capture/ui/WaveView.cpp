#include "capture/ui/WaveView.h"

#include <QKeyEvent>
#include <QMouseEvent>
#include <QPainter>
#include <QPainterPath>
#include <QWheelEvent>
#include <algorithm>
#include <cmath>
#include <vector>

#include "capture/CaptureData.h"

namespace {

const QColor kTraceColour(0x1d, 0x6b, 0x3a);
const QColor kErrorColour(0xc6, 0x28, 0x28);
const QColor kBusColour(0x2b, 0x4c, 0x7e);
const QColor kCursorColours[2] = {QColor(0x1f, 0x5f, 0xbf), QColor(0xd9, 0x7a, 0x00)};
const QColor kNameBackground(0xf0, 0xf2, 0xf5);
const QColor kGridColour(0xe3, 0xe6, 0xea);
constexpr int kTraceMargin = 5;  // between a trace's high and low and its row's edges
constexpr int kSlant = 3;        // of a bus value's box ends
constexpr int kLabelSpacing = 90;

enum class Level { None, Low, High, Busy };

Level LevelOf(std::uint8_t flags) {
  const bool low = (flags & CaptureData::kLow) != 0;
  const bool high = (flags & CaptureData::kHigh) != 0;
  return low && high ? Level::Busy : high ? Level::High : low ? Level::Low : Level::None;
}

// The smallest of 1, 2, 5 × 10^k vectors that is at least `vectors`.
long NiceStep(double vectors) {
  long step = 1;
  for (;;) {
    for (long m : {1L, 2L, 5L}) {
      if (static_cast<double>(step * m) >= vectors) return step * m;
    }
    step *= 10;
  }
}

}  // namespace

WaveView::WaveView(QWidget* parent) : QWidget(parent) {
  setObjectName(QStringLiteral("WaveView"));
  setFocusPolicy(Qt::StrongFocus);
  setMinimumSize(kNameWidth + 200, kRulerHeight + kLaneHeight + 2 * kRowHeight);
  setAttribute(Qt::WA_OpaquePaintEvent);
}

void WaveView::SetData(const CaptureData* data, const QString& emptyText) {
  mData = data != nullptr && data->GetLength() > 0 ? data : nullptr;
  mEmptyText = emptyText;
  mCursor[0] = mCursor[1] = -1;
  Fit();
  emit CursorsChanged();
}

void WaveView::SetBus(long low, long high, int radix) {
  mBusLow = low;
  mBusHigh = high;
  mRadix = radix;
  update();
}

double WaveView::MaxVectorsPerPixel() const {
  const double length = mData != nullptr ? static_cast<double>(mData->GetLength()) : 1.0;
  return std::max(length / PlotWidth(), 1.0 / kMaxPixelsPerVector);
}

void WaveView::Fit() {
  mPerPixel = MaxVectorsPerPixel();
  mFirst = 0;
  mFitted = true;
  update();
  emit ViewChanged();
}

void WaveView::ZoomBy(double factor, double anchor) {
  const double perPixel = std::clamp(mPerPixel / factor, 1.0 / kMaxPixelsPerVector, MaxVectorsPerPixel());
  mFirst = anchor - (anchor - mFirst) * perPixel / mPerPixel;
  mPerPixel = perPixel;
  mFitted = mPerPixel >= MaxVectorsPerPixel();
  Clamp();
  update();
  emit ViewChanged();
}

void WaveView::SetFirst(double vector) {
  mFirst = vector;
  Clamp();
  update();
  emit ViewChanged();
}

void WaveView::Clamp() {
  const double length = mData != nullptr ? static_cast<double>(mData->GetLength()) : 0.0;
  mFirst = std::clamp(mFirst, 0.0, std::max(0.0, length - VisibleVectors()));
}

long WaveView::VectorAt(int x) const {
  return static_cast<long>(std::floor(mFirst + (x - kNameWidth) * mPerPixel));
}

int WaveView::XOf(double vector) const {
  return kNameWidth + static_cast<int>(std::lround((vector - mFirst) / mPerPixel));
}

void WaveView::SetCursor(int which, long vector) {
  if (mData == nullptr) return;
  mCursor[which] = vector < 0 ? -1 : std::min(vector, mData->GetLength() - 1);
  update();
  emit CursorsChanged();
}

bool WaveView::GoToError(bool forward) {
  if (mData == nullptr) return false;
  long from = mCursor[0];
  if (from < 0) from = forward ? static_cast<long>(mFirst) - 1 : static_cast<long>(mFirst + VisibleVectors());
  const long error = forward ? mData->NextError(from) : mData->PreviousError(from);
  if (error < 0) return false;
  SetCursor(0, error);
  if (error < mFirst || error >= mFirst + VisibleVectors()) SetFirst(static_cast<double>(error) - VisibleVectors() / 2);
  return true;
}

QString WaveView::ValueText(std::uint64_t value, int bits, int radix) {
  if (radix == 10) return QString::number(value);
  const int digits = radix == 16 ? (bits + 3) / 4 : bits;
  return QString::number(value, radix).toUpper().rightJustified(digits, QLatin1Char('0'));
}

void WaveView::ColumnRange(int column, long& from, long& to) const {
  const long length = mData->GetLength();
  from = std::min(length, static_cast<long>(std::floor(mFirst + column * mPerPixel)));
  to = std::min(length, std::max(from + 1, static_cast<long>(std::floor(mFirst + (column + 1) * mPerPixel))));
  // Zoomed out, columns start on a grain of the capture's summary a few times finer than a
  // column, so each asks a few summary entries; the columns still cover every vector once.
  if (mPerPixel >= kGrainFrom) {
    long grain = 64;
    while (grain * 16 <= mPerPixel) grain *= 4;
    from -= from % grain;
    if (to < length) to -= to % grain;
  }
}

void WaveView::paintEvent(QPaintEvent*) {
  QPainter p(this);
  p.fillRect(rect(), palette().color(QPalette::Base));
  p.fillRect(0, 0, kNameWidth, height(), kNameBackground);
  if (mData == nullptr) {
    p.setPen(palette().color(QPalette::PlaceholderText));
    p.drawText(rect().adjusted(kNameWidth, 0, 0, 0), Qt::AlignCenter | Qt::TextWordWrap, mEmptyText);
    return;
  }
  PaintRuler(p);
  int top = kRulerHeight;
  const std::vector<char> errors = ErrorColumns();
  PaintErrorLane(p, top, errors);
  top += kLaneHeight;
  const bool bus = mBusLow <= mBusHigh && mBusHigh < mData->GetWidth() && mBusHigh - mBusLow < 64;
  if (bus) {
    PaintBus(p, top);
    top += kRowHeight;
  }
  for (long t = 0; t < mData->GetWidth() && top < height(); ++t, top += kRowHeight) PaintTrace(p, t, top, errors);
  PaintCursors(p);
}

void WaveView::PaintRuler(QPainter& p) const {
  p.setPen(palette().color(QPalette::Text));
  p.drawText(QRect(6, 0, kNameWidth - 12, kRulerHeight), Qt::AlignVCenter | Qt::AlignLeft, QStringLiteral("Vector"));
  const long step = NiceStep(kLabelSpacing * mPerPixel);
  const long last = static_cast<long>(mFirst + VisibleVectors());
  for (long v = static_cast<long>(std::ceil(mFirst / static_cast<double>(step))) * step; v <= last; v += step) {
    const int x = XOf(static_cast<double>(v));
    const QString label = QString::number(v);
    p.setPen(kGridColour);
    p.drawLine(x, kRulerHeight - 6, x, height());
    if (x + 3 + fontMetrics().horizontalAdvance(label) > width()) continue;
    p.setPen(palette().color(QPalette::Text));
    p.drawText(QRect(x + 3, 0, kLabelSpacing, kRulerHeight - 4), Qt::AlignBottom | Qt::AlignLeft, label);
  }
  p.setPen(kGridColour);
  p.drawLine(0, kRulerHeight - 1, width(), kRulerHeight - 1);
}

std::vector<char> WaveView::ErrorColumns() const {
  std::vector<char> errors(static_cast<std::size_t>(PlotWidth()), 0);
  for (int c = 0; c < PlotWidth(); ++c) {
    long from = 0, to = 0;
    ColumnRange(c, from, to);
    errors[static_cast<std::size_t>(c)] = from < to && mData->HasError(from, to);
  }
  return errors;
}

void WaveView::PaintErrorLane(QPainter& p, int top, const std::vector<char>& errors) const {
  p.setPen(kErrorColour);
  p.drawText(QRect(6, top, kNameWidth - 12, kLaneHeight), Qt::AlignVCenter | Qt::AlignLeft, QStringLiteral("errors"));
  std::vector<QLine> marks;
  for (int c = 0; c < PlotWidth(); ++c) {
    if (errors[static_cast<std::size_t>(c)] != 0) marks.emplace_back(kNameWidth + c, top + 1, kNameWidth + c, top + kLaneHeight - 2);
  }
  p.drawLines(marks.data(), static_cast<int>(marks.size()));
}

void WaveView::PaintTrace(QPainter& p, long trace, int top, const std::vector<char>& errorColumns) const {
  p.setPen(palette().color(QPalette::Text));
  p.drawText(QRect(6, top, kNameWidth - 12, kRowHeight), Qt::AlignVCenter | Qt::AlignLeft, QStringLiteral("d%1").arg(trace));
  const int high = top + kTraceMargin;
  const int low = top + kRowHeight - kTraceMargin;
  std::vector<QLine> lines;
  std::vector<QRect> busy;
  std::vector<QRect> errors;
  Level before = Level::None;
  for (int c = 0; c < PlotWidth(); ++c) {
    long from = 0, to = 0;
    ColumnRange(c, from, to);
    if (from >= to) break;
    const std::uint8_t flags = mData->Flags(trace, from, to, errorColumns[static_cast<std::size_t>(c)] != 0);
    const Level level = LevelOf(flags);
    const int x = kNameWidth + c;
    if ((flags & CaptureData::kError) != 0) errors.emplace_back(x - 1, top + 2, 3, kRowHeight - 4);
    if (level == Level::Busy) {
      busy.emplace_back(x, high, 1, low - high + 1);
    } else {
      const int y = level == Level::High ? high : low;
      if ((before == Level::High || before == Level::Low) && before != level) lines.emplace_back(x, high, x, low);
      lines.emplace_back(x, y, x + 1, y);
    }
    before = level;
  }
  p.setPen(Qt::NoPen);
  p.setBrush(kTraceColour);
  p.drawRects(busy.data(), static_cast<int>(busy.size()));
  p.setBrush(Qt::NoBrush);
  p.setPen(QPen(kTraceColour, 1.5));
  p.drawLines(lines.data(), static_cast<int>(lines.size()));
  // Errors over the trace, so that they show on a busy one too.
  p.setPen(Qt::NoPen);
  p.setBrush(kErrorColour);
  p.drawRects(errors.data(), static_cast<int>(errors.size()));
  p.setBrush(Qt::NoBrush);
}

void WaveView::PaintBus(QPainter& p, int top) const {
  p.setPen(kBusColour);
  p.drawText(QRect(6, top, kNameWidth - 12, kRowHeight), Qt::AlignVCenter | Qt::AlignLeft,
             QStringLiteral("bus[%1:%2]").arg(mBusHigh).arg(mBusLow));
  const int y0 = top + kTraceMargin;
  const int y1 = top + kRowHeight - kTraceMargin;
  const int mid = (y0 + y1) / 2;
  const int bits = static_cast<int>(mBusHigh - mBusLow + 1);
  // Runs of columns showing one value (or changing within the column: busy).
  struct Run {
    int x0;
    int x1;
    bool busy;
    std::uint64_t value;
  };
  std::vector<Run> runs;
  for (int c = 0; c < PlotWidth(); ++c) {
    long from = 0, to = 0;
    ColumnRange(c, from, to);
    if (from >= to) break;
    bool busy = false;
    for (long t = mBusLow; t <= mBusHigh && !busy; ++t) busy = LevelOf(mData->Flags(t, from, to, false)) == Level::Busy;
    const std::uint64_t value = busy ? 0 : mData->Value(mBusLow, mBusHigh, from);
    const int x = kNameWidth + c;
    if (!runs.empty() && runs.back().busy == busy && runs.back().value == value) {
      runs.back().x1 = x + 1;
    } else {
      runs.push_back({x, x + 1, busy, value});
    }
  }
  const QFontMetrics metrics(font());
  for (const Run& r : runs) {
    if (r.busy) {
      p.fillRect(QRect(r.x0, y0, r.x1 - r.x0, y1 - y0 + 1), QColor(0x9a, 0xa7, 0xb8));
      continue;
    }
    const int slant = std::min(kSlant, (r.x1 - r.x0) / 2);
    QPainterPath box;
    box.moveTo(r.x0, mid);
    box.lineTo(r.x0 + slant, y0);
    box.lineTo(r.x1 - slant, y0);
    box.lineTo(r.x1, mid);
    box.lineTo(r.x1 - slant, y1);
    box.lineTo(r.x0 + slant, y1);
    box.closeSubpath();
    p.setPen(kBusColour);
    p.drawPath(box);
    const QString text = ValueText(r.value, bits, mRadix);
    if (metrics.horizontalAdvance(text) + 2 * kSlant + 4 <= r.x1 - r.x0) {
      p.setPen(palette().color(QPalette::Text));
      p.drawText(QRect(r.x0, y0, r.x1 - r.x0, y1 - y0), Qt::AlignCenter, text);
    }
  }
}

void WaveView::PaintCursors(QPainter& p) const {
  for (int which = 0; which < 2; ++which) {
    const long v = mCursor[which];
    if (v < 0 || v < mFirst - 1 || v > mFirst + VisibleVectors()) continue;
    const int x = XOf(static_cast<double>(v)) + std::max(0, static_cast<int>(0.5 / mPerPixel));
    p.setPen(QPen(kCursorColours[which], 1, Qt::DashLine));
    p.drawLine(x, kRulerHeight, x, height());
    p.fillRect(QRect(x - 7, 2, 14, 14), kCursorColours[which]);
    p.setPen(Qt::white);
    p.drawText(QRect(x - 7, 2, 14, 14), Qt::AlignCenter, which == 0 ? QStringLiteral("A") : QStringLiteral("B"));
  }
}

void WaveView::resizeEvent(QResizeEvent*) {
  if (mFitted) {
    Fit();
  } else {
    mPerPixel = std::min(mPerPixel, MaxVectorsPerPixel());
    Clamp();
    emit ViewChanged();
  }
}

void WaveView::mousePressEvent(QMouseEvent* event) {
  const int x = static_cast<int>(event->position().x());
  if (event->button() == Qt::RightButton && x >= kNameWidth) {
    SetCursor(1, VectorAt(x));
  } else if (event->button() == Qt::LeftButton) {
    mPressX = x;
    mPressFirst = mFirst;
    mDragging = false;
  }
}

void WaveView::mouseMoveEvent(QMouseEvent* event) {
  if (mPressX < 0 || (event->buttons() & Qt::LeftButton) == 0) return;
  const int dx = static_cast<int>(event->position().x()) - mPressX;
  if (std::abs(dx) > 3) mDragging = true;
  if (mDragging) {
    mFitted = false;
    SetFirst(mPressFirst - dx * mPerPixel);
  }
}

void WaveView::mouseReleaseEvent(QMouseEvent* event) {
  const int x = static_cast<int>(event->position().x());
  if (event->button() == Qt::LeftButton && !mDragging && mPressX >= kNameWidth) SetCursor(0, VectorAt(x));
  mPressX = -1;
  mDragging = false;
}

void WaveView::wheelEvent(QWheelEvent* event) {
  const double steps = event->angleDelta().y() / 120.0;
  const double sideways = event->angleDelta().x() / 120.0;
  if ((event->modifiers() & Qt::ShiftModifier) != 0 || sideways != 0) {
    mFitted = false;
    SetFirst(mFirst - (steps + sideways) * VisibleVectors() / 8);
  } else {
    ZoomBy(std::pow(1.25, steps), mFirst + (event->position().x() - kNameWidth) * mPerPixel);
  }
  event->accept();
}

void WaveView::keyPressEvent(QKeyEvent* event) {
  const double centre = mFirst + VisibleVectors() / 2;
  auto pan = [this](double vectors) {
    mFitted = false;
    SetFirst(mFirst + vectors);
  };
  switch (event->key()) {
    case Qt::Key_Left: pan(-VisibleVectors() / 8); break;
    case Qt::Key_Right: pan(VisibleVectors() / 8); break;
    case Qt::Key_PageUp: pan(-VisibleVectors()); break;
    case Qt::Key_PageDown: pan(VisibleVectors()); break;
    case Qt::Key_Home: pan(-mFirst); break;
    case Qt::Key_End: pan(mData != nullptr ? static_cast<double>(mData->GetLength()) : 0.0); break;
    case Qt::Key_Plus:
    case Qt::Key_Equal: ZoomBy(2.0, centre); break;
    case Qt::Key_Minus: ZoomBy(0.5, centre); break;
    case Qt::Key_F: Fit(); break;
    case Qt::Key_N: GoToError(true); break;
    case Qt::Key_P: GoToError(false); break;
    default: QWidget::keyPressEvent(event); return;
  }
  event->accept();
}
