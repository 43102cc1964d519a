#pragma once

#include <QApplication>

// The benchmarks' one QApplication, offscreen. It lives until the process ends: destroyed
// among the other statics at exit, it would outlive parts of Qt it still uses.
inline QApplication& BenchApp() {
  static int argc = 1;
  static char name[] = "qen_bench";
  static char* argv[] = {name, nullptr};
  qputenv("QT_QPA_PLATFORM", "offscreen");
  static QApplication* app = new QApplication(argc, argv);
  return *app;
}
