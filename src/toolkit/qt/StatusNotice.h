#pragma once

#include <QString>
#include <functional>

// A line for the status bar of the program's main window, from any widget of the library,
// which knows no main window: the window that owns the status bar installs the sink. Without
// one, a notice goes nowhere.
class StatusNotice {
 public:
  using Sink = std::function<void(const QString& text)>;

  // An empty sink removes the one installed.
  static void Install(Sink sink);
  static void Show(const QString& text);
};
