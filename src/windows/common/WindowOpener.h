#pragma once

#include "support/Dstring.h"

class QString;
class QWidget;

// What a window asks of the frame that holds it when it opens another window, so that no window
// knows another's class or the frame's. Each call raises the window when it is open, else builds
// and shows it; the result is the window, or null when it cannot be built (the reason has been
// shown) or there is nothing to open.
class WindowOpener {
 public:
  // The opener of the frame that holds `window`; null when no frame holds it.
  static WindowOpener* Of(const QWidget* window);

  virtual ~WindowOpener() = default;

  // The window of a resource of the window table ("LoopGridEdit.Win").
  virtual QWidget* OpenWindow(const QString& resource) = 0;
  // The sequence editor; there is one.
  virtual QWidget* OpenSequence() = 0;
  // The event window of a block, one per block.
  virtual QWidget* OpenEvents(unsigned long block) = 0;
  // The segment editor of the segment a block plays on a port, one per segment and port; null
  // when the entry names no segment or one the instrument does not have.
  virtual QWidget* OpenSegment(unsigned long block, unsigned long port) = 0;
  // The segment editor of the Windows menu, showing the segment `name`.
  virtual QWidget* ShowSegment(const Dstring& name) = 0;
};
