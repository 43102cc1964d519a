#pragma once

#include <QGraphicsView>
#include <map>
#include <vector>

#include "sequences/CFrontendInfo.h"
#include "sequences/CPortConnections.h"
#include "support/ConditionList.h"

class QGraphicsEllipseItem;
class QGraphicsLineItem;

// The system scheme: the rack drawn from its front-end information, clock groups as frames
// with their generator modules on the left and their analyser modules on the right, each
// module with its model, slot and ports (terminals as ticks), and the connections as lines
// from generator ports to analyser ports.
//
// The view only draws and asks: dragging from a port to another asks for a connection, Delete
// (or the context menu) on a selected line asks for its removal; the owner sends them and
// draws what the server then holds. Ctrl+wheel, Ctrl+plus and Ctrl+minus zoom, Ctrl+0 fits;
// dragging empty space or the scroll bars pan. Until the user zooms, the scheme is fitted to the
// view whenever its size changes. Read-only, it asks for nothing.
class SchemeView : public QGraphicsView {
  Q_OBJECT

 public:
  explicit SchemeView(QWidget* parent = nullptr);

  // Draws the scheme anew, keeping the zoom and the selected connection where it remains.
  void SetScheme(const std::vector<CFrontendInfo::Group>& groups,
                 const std::vector<CPortConnections::Connection>& connections);
  void SetReadOnly(bool readOnly);
  bool IsReadOnly() const { return mReadOnly; }

  // Where a port's lines meet it, in scene coordinates; false when the scheme has no such port.
  bool PortAnchor(const Dstring& path, QPointF& at) const;
  // The connection whose line is selected; false when none is.
  bool SelectedConnection(CPortConnections::Connection& out) const;
  bool SelectConnection(const CPortConnections::Connection& connection);
  int NumLines() const;

  void ZoomBy(double factor);
  void Fit();
  double Zoom() const { return transform().m11(); }

  // Writes the whole scheme, unselected, as a PNG at twice its size, or as SVG;
  // "GUI_SCHEME_EXPORT_FAILED" when the file cannot be written.
  int ExportPng(const Dstring& path, ConditionList& list);
  int ExportSvg(const Dstring& path, ConditionList& list);

 signals:
  void ConnectRequested(const QString& generator, const QString& analyser);
  void RemoveRequested(const QString& generator, const QString& analyser);

 protected:
  void wheelEvent(QWheelEvent* event) override;
  void mousePressEvent(QMouseEvent* event) override;
  void mouseMoveEvent(QMouseEvent* event) override;
  void mouseReleaseEvent(QMouseEvent* event) override;
  void keyPressEvent(QKeyEvent* event) override;
  void contextMenuEvent(QContextMenuEvent* event) override;
  void resizeEvent(QResizeEvent* event) override;

 private:
  // Each adds its part of the scheme; AddGroup returns the group's height.
  double AddGroup(const CFrontendInfo::Group& group, double top);
  void AddModule(const CFrontendInfo::Module& module, QGraphicsItem* frame, const QPointF& at);
  void AddPort(const CFrontendInfo::Port& port, bool generator, QGraphicsItem* box, double top);
  void AddLine(const CPortConnections::Connection& connection);
  // The port (its row) under a view position, null when none.
  QGraphicsItem* PortAt(const QPoint& pos) const;
  QGraphicsItem* LineAt(const QPoint& pos) const;
  void AskRemove(const QGraphicsItem* line);
  // Runs `paint` with the selection hidden, so that a picture shows the scheme as it is.
  template <class Paint>
  void Unselected(Paint paint);

  std::map<Dstring, QGraphicsEllipseItem*> mAnchors;  // each port's circle, by path
  bool mReadOnly = false;
  bool mFitting = true;  // follows the window's size until the user zooms
  // Marks the port a drag would connect to (null: none).
  void Hover(QGraphicsItem* port);

  QGraphicsItem* mDragFrom = nullptr;
  QGraphicsItem* mHover = nullptr;
  QGraphicsLineItem* mRubber = nullptr;
};
