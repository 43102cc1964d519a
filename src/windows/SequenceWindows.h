#pragma once

#include "support/Dstring.h"

class MainWin;
class QWidget;

// The windows the sequence windows open for a record, in the main window (its WindowOpener
// part): the sequence editor (one), a block's event window (one per block) and the segment
// editor of a block's port (one per segment and port); a second request raises the one open.
// Each returns the window, or null when it cannot be built (shown) or there is nothing to open.
class SequenceWindows {
 public:
  static QWidget* OpenSequence(MainWin& main);
  static QWidget* OpenEvents(MainWin& main, unsigned long block);
  static QWidget* OpenSegment(MainWin& main, unsigned long block, unsigned long port);
  // The segment editor of the Windows menu, showing the segment `name`.
  static QWidget* ShowSegment(MainWin& main, const Dstring& name);
};
