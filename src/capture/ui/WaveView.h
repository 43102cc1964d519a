#pragma once

#include <QWidget>
#include <cstdint>
#include <vector>

class CaptureData;

// The waveform of a capture: a ruler of vector numbers, a lane that marks the error vectors,
// the bus (a group of traces as one value) and a bit trace per trace, with two cursors. Each
// pixel column asks the capture's summary what its vectors hold, so drawing costs the same
// for any length. Zoom with the wheel or +/-, pan by dragging, Shift+wheel or the arrow keys,
// fit with F; a click sets cursor A, a right click cursor B; N and P go to the next and the
// previous error.
class WaveView : public QWidget {
  Q_OBJECT

 public:
  static constexpr int kNameWidth = 120;
  static constexpr int kRulerHeight = 26;
  static constexpr int kLaneHeight = 14;
  static constexpr int kRowHeight = 24;
  // Zoomed in furthest, a vector is this many pixels wide.
  static constexpr double kMaxPixelsPerVector = 48.0;
  // From this many vectors a column, columns start on the summary's grain.
  static constexpr double kGrainFrom = 1024.0;

  explicit WaveView(QWidget* parent = nullptr);

  // Shows `data` (which outlives the view or is replaced first) fitted; null shows `emptyText`.
  void SetData(const CaptureData* data, const QString& emptyText = QString());
  // Traces low … high as the bus, its value in `radix` (2, 10 or 16); low > high: no bus.
  void SetBus(long low, long high, int radix);

  void Fit();
  // Zooms by `factor` (> 1 zooms in) keeping `anchor` (a vector) where it is.
  void ZoomBy(double factor, double anchor);
  void SetFirst(double vector);
  double GetFirst() const { return mFirst; }
  double GetVectorsPerPixel() const { return mPerPixel; }
  double VisibleVectors() const { return PlotWidth() * mPerPixel; }
  int PlotWidth() const { return std::max(1, width() - kNameWidth); }
  // The vector under column x of the widget, and the column a vector starts at.
  long VectorAt(int x) const;
  int XOf(double vector) const;

  // Cursor 0 (A) or 1 (B); -1 is no cursor.
  void SetCursor(int which, long vector);
  long GetCursor(int which) const { return mCursor[which]; }
  // Moves cursor A to the next (previous) error vector and brings it into view; false when
  // there is none.
  bool GoToError(bool forward);

  // A bus value as the window writes it: hex and binary padded to the bus's width.
  static QString ValueText(std::uint64_t value, int bits, int radix);

 signals:
  void ViewChanged();
  void CursorsChanged();

 protected:
  void paintEvent(QPaintEvent* event) override;
  void resizeEvent(QResizeEvent* event) override;
  void mousePressEvent(QMouseEvent* event) override;
  void mouseMoveEvent(QMouseEvent* event) override;
  void mouseReleaseEvent(QMouseEvent* event) override;
  void wheelEvent(QWheelEvent* event) override;
  void keyPressEvent(QKeyEvent* event) override;

 private:
  // The vectors [from, to) under plot column `column`.
  void ColumnRange(int column, long& from, long& to) const;
  double MaxVectorsPerPixel() const;
  void Clamp();
  void PaintRuler(QPainter& p) const;
  // Per plot column, whether its vectors hold an error.
  std::vector<char> ErrorColumns() const;
  void PaintErrorLane(QPainter& p, int top, const std::vector<char>& errors) const;
  void PaintBus(QPainter& p, int top) const;
  void PaintTrace(QPainter& p, long trace, int top, const std::vector<char>& errors) const;
  void PaintCursors(QPainter& p) const;

  const CaptureData* mData = nullptr;
  QString mEmptyText;
  double mFirst = 0;
  double mPerPixel = 1;
  long mCursor[2] = {-1, -1};
  long mBusLow = 0;
  long mBusHigh = -1;
  int mRadix = 16;
  int mPressX = -1;
  double mPressFirst = 0;
  bool mDragging = false;
  bool mFitted = true;  // follows the width: a resize fits again
};
