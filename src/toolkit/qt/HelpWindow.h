#pragma once

#include <QStringList>
#include <QUrl>
#include <QWidget>

#include "support/Dstring.h"

class QLineEdit;
class QListWidget;
class QListWidgetItem;
class QTextBrowser;
class QToolButton;

// The user guide, compiled into the program: its pages in the order of the guide's index, a
// search over them, and the page itself with working links between pages and to pictures.
// A window's page is named after the window's resource ("paramedit.ParamEd.md").
class HelpWindow : public QWidget {
  Q_OBJECT

 public:
  explicit HelpWindow(QWidget* parent = nullptr);

  // Opens the help window (one for the program; asking again raises it) on the page of a
  // window resource or page file name, or on the index when the guide has no such page.
  static HelpWindow* Show(const Dstring& pageOrResource, QWidget* parent);

  // The resource URL of a page or window resource's page; empty when the guide has none.
  static QUrl PageUrl(const QString& pageOrResource);
  static QUrl IndexUrl();
  // The page file names: the index, then the pages it links to, in its order.
  static QStringList Pages();

  void ShowPage(const QUrl& url);
  // Lists the pages holding every word of the text, and opens and marks the first.
  void Search(const QString& text);

  QTextBrowser* Browser() const { return mBrowser; }
  QListWidget* Contents() const { return mContents; }
  QListWidget* Hits() const { return mHits; }
  QLineEdit* SearchField() const { return mSearch; }
  QToolButton* BackButton() const { return mBack; }
  QToolButton* ForwardButton() const { return mForward; }

 private:
  void HitContents(QListWidgetItem* item);
  void HitHit(QListWidgetItem* item);
  void NfySourceChanged(const QUrl& url);
  void FitPictures();
  void MarkWords();

  QTextBrowser* mBrowser = nullptr;
  QListWidget* mContents = nullptr;
  QListWidget* mHits = nullptr;
  QLineEdit* mSearch = nullptr;
  QToolButton* mBack = nullptr;
  QToolButton* mForward = nullptr;
  QStringList mWords;
};
