#pragma once

#include <QObject>

class QWidget;

// F1 anywhere opens the guide's page of what has the focus: the nearest widget up from the
// focus that names a page (a dialog through SetPage, a window through its resource), else the
// index. Installed once on the application.
class HelpKey : public QObject {
  Q_OBJECT

 public:
  static void Install();
  // The guide page `widget` and everything inside it open with F1.
  static void SetPage(QWidget* widget, const char* page);
  // The page F1 would open for the focus inside `widget`.
  static QString PageFor(const QWidget* widget);

 protected:
  bool eventFilter(QObject* watched, QEvent* event) override;
};
