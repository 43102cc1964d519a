#pragma once

#include <QApplication>

// The benchmarks' one QApplication, offscreen.
inline QApplication& BenchApp() {
  static int argc = 1;
  static char name[] = "qen_bench";
  static char* argv[] = {name, nullptr};
  qputenv("QT_QPA_PLATFORM", "offscreen");
  static QApplication app(argc, argv);
  return app;
}
