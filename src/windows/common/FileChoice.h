#pragma once

#include <QString>
#include <functional>

class QWidget;

// The local file a command reads or writes: asked with the file dialog, or, once a test has set
// a hook, answered by the hook, and no dialog opens.
class FileChoice {
 public:
  enum class Mode { kOpen, kSave };
  // The path chosen for the dialog's title; empty for a cancel.
  using Hook = std::function<QString(Mode mode, const QString& title)>;

  // `name` is the file the save dialog offers; `filter` the dialog's filter. Empty when the user
  // cancelled.
  static QString Ask(QWidget* parent, Mode mode, const QString& title, const QString& name, const QString& filter);
  // An empty hook brings the dialog back.
  static void SetHook(Hook hook);
};
