#include "windows/common/WindowOpener.h"

#include <QWidget>

WindowOpener* WindowOpener::Of(const QWidget* window) {
  return window == nullptr ? nullptr : dynamic_cast<WindowOpener*>(window->window());
}
