// The baseline of the start-up benchmark: a plain Qt Widgets program that paints one empty
// main window into a PNG and exits, as `qengui --screenshot` does with everything else.
#include <QApplication>
#include <QMainWindow>
#include <QPixmap>

int main(int argc, char** argv) {
  QApplication app(argc, argv);
  QMainWindow window;
  window.resize(1280, 800);
  window.show();
  QCoreApplication::processEvents();
  return window.grab().save(QString::fromLocal8Bit(argv[argc - 1]), "PNG") ? 0 : 1;
}
