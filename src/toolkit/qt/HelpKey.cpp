#include "toolkit/qt/HelpKey.h"

#include <QApplication>
#include <QEvent>
#include <QKeyEvent>
#include <QWidget>

#include "toolkit/qt/HelpWindow.h"

namespace {

constexpr const char* kPageProperty = "qenHelpPage";
// The main window marks each of its windows with the resource it was made from.
constexpr const char* kResourceProperty = "qenResource";

}  // namespace

void HelpKey::Install() {
  static HelpKey* key = nullptr;
  if (key != nullptr) return;
  key = new HelpKey;
  key->setParent(qApp);
  qApp->installEventFilter(key);
}

void HelpKey::SetPage(QWidget* widget, const char* page) { widget->setProperty(kPageProperty, QString::fromLatin1(page)); }

QString HelpKey::PageFor(const QWidget* widget) {
  for (const QWidget* w = widget; w != nullptr; w = w->parentWidget()) {
    for (const char* name : {kPageProperty, kResourceProperty}) {
      const QString page = w->property(name).toString();
      if (!page.isEmpty()) return page;
    }
  }
  return QStringLiteral("index");
}

bool HelpKey::eventFilter(QObject* watched, QEvent* event) {
  if (event->type() != QEvent::KeyPress || static_cast<QKeyEvent*>(event)->key() != Qt::Key_F1) return false;
  // The key reaches the widget with the focus first; taken there, it goes no further.
  auto* target = qobject_cast<QWidget*>(watched);
  if (target == nullptr) return false;
  HelpWindow::Show(PageFor(target).toStdString(), target->window());
  return true;
}
