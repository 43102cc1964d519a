#include "windows/common/FileChoice.h"

#include <QFileDialog>

namespace {

FileChoice::Hook& TheHook() {
  static FileChoice::Hook hook;
  return hook;
}

}  // namespace

QString FileChoice::Ask(QWidget* parent, Mode mode, const QString& title, const QString& name, const QString& filter) {
  if (TheHook()) return TheHook()(mode, title);
  return mode == Mode::kOpen ? QFileDialog::getOpenFileName(parent, title, {}, filter)
                             : QFileDialog::getSaveFileName(parent, title, name, filter);
}

void FileChoice::SetHook(Hook hook) { TheHook() = std::move(hook); }
