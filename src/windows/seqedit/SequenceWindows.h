#pragma once

class QWidget;

// The windows a sequence editor opens for a record, through the main window that holds `from`:
// the sequence editor (one), a block's event window (one per block) and the segment editor of
// a block's port (one per segment and port); a second request raises the one open. Each
// returns the window, or null when there is no main window or it cannot be built (shown).
class SequenceWindows {
 public:
  static QWidget* OpenSequence(QWidget* from);
  static QWidget* OpenEvents(QWidget* from, unsigned long block);
  static QWidget* OpenSegment(QWidget* from, unsigned long block, unsigned long port);
};
