#pragma once

class QPushButton;
class QWidget;

// Export Sequence… and Import Sequence… of every sequence editor (the simple sequence editor,
// the loop grid, the sequence editor), one implementation on the menu of each editor's button
// "PButSequenceFile". The sequence goes with its events to a local file of text and back
// (SequenceTransfer); what failed is shown, what succeeded said in the status bar.
class SequenceFileMenu {
 public:
  // Gives `button` the menu; `window` is the editor, the parent of the dialogs.
  static void Attach(QPushButton* button, QWidget* window);
  static int Export(QWidget* window);
  static int Import(QWidget* window);
};
