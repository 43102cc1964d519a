#include "windows/common/SequenceFileMenu.h"

#include <QMainWindow>
#include <QMenu>
#include <QPushButton>
#include <QStatusBar>

#include "params/ui/BoundControl.h"
#include "sequences/SequenceTransfer.h"
#include "toolkit/WaitCursor.h"
#include "windows/common/FileChoice.h"

namespace {

const QString kFilter = QStringLiteral("Sequence text (*.qseq);;All files (*)");

void Say(QWidget* window, const QString& text) {
  if (auto* main = qobject_cast<QMainWindow*>(window->window())) main->statusBar()->showMessage(text, 8000);
}

}  // namespace

void SequenceFileMenu::Attach(QPushButton* button, QWidget* window) {
  auto* menu = new QMenu(button);
  menu->addAction(QStringLiteral("&Export Sequence..."), window, [window] { Export(window); });
  menu->addAction(QStringLiteral("&Import Sequence..."), window, [window] { Import(window); });
  button->setMenu(menu);
}

int SequenceFileMenu::Export(QWidget* window) {
  const QString path = FileChoice::Ask(window, FileChoice::Mode::kSave, QStringLiteral("Export Sequence"),
                                       QStringLiteral("sequence.qseq"), kFilter);
  if (path.isEmpty()) return 0;
  ConditionList list;
  int status = 0;
  {
    WaitCursor wait;
    status = SequenceTransfer::Export(path.toStdString(), list);
  }
  BoundControl::Report(list);
  if (status == 0) Say(window, QStringLiteral("The sequence was exported to %1.").arg(path));
  return status;
}

int SequenceFileMenu::Import(QWidget* window) {
  const QString path = FileChoice::Ask(window, FileChoice::Mode::kOpen, QStringLiteral("Import Sequence"), {}, kFilter);
  if (path.isEmpty()) return 0;
  ConditionList list;
  int status = 0;
  {
    WaitCursor wait;
    status = SequenceTransfer::Import(path.toStdString(), list);
  }
  BoundControl::Report(list);
  if (status == 0) Say(window, QStringLiteral("The sequence of %1 was imported.").arg(path));
  return status;
}
