#include "toolkit/qt/HelpWindow.h"

#include <algorithm>

#include <QAction>
#include <QApplication>
#include <QColor>
#include <QFile>
#include <QImage>
#include <QTextBlock>
#include <QTextCursor>
#include <QHBoxLayout>
#include <QLabel>
#include <QLineEdit>
#include <QListWidget>
#include <QPointer>
#include <QRegularExpression>
#include <QSplitter>
#include <QTextBrowser>
#include <QTextDocument>
#include <QToolButton>
#include <QVBoxLayout>

// The guide lives in a static library, so its resource is registered by hand.
static void InitGuideResource() { Q_INIT_RESOURCE(guide); }

namespace {

const QString kPageDir = QStringLiteral(":/help/guide/");
const QString kIndex = QStringLiteral("index.md");

QString PageText(const QString& page) {
  QFile file(kPageDir + page);
  if (!file.open(QIODevice::ReadOnly)) return {};
  return QString::fromUtf8(file.readAll());
}

// A page's title is its first heading.
QString TitleOf(const QString& page) {
  static const QRegularExpression heading(QStringLiteral("^#\\s+(.+)$"), QRegularExpression::MultilineOption);
  const QRegularExpressionMatch match = heading.match(PageText(page));
  return match.hasMatch() ? match.captured(1).trimmed() : page;
}

// What the reader sees of a page, so that a word in a link's address is not a hit.
QString ReadableText(const QString& page) {
  QTextDocument document;
  document.setMarkdown(PageText(page));
  return document.toPlainText();
}

QStringList WordsOf(const QString& text) { return text.split(QRegularExpression(QStringLiteral("\\s+")), Qt::SkipEmptyParts); }

QListWidgetItem* PageItem(const QString& page) {
  auto* item = new QListWidgetItem(TitleOf(page));
  item->setData(Qt::UserRole, page);
  return item;
}

QString PageOf(const QUrl& url) { return url.path().section(QLatin1Char('/'), -1); }

}  // namespace

HelpWindow::HelpWindow(QWidget* parent)
    : QWidget(parent, Qt::Window),
      mBrowser(new QTextBrowser),
      mContents(new QListWidget),
      mHits(new QListWidget),
      mSearch(new QLineEdit),
      mBack(new QToolButton),
      mForward(new QToolButton) {
  InitGuideResource();
  setObjectName(QStringLiteral("HelpWindow"));
  setWindowTitle(QStringLiteral("qengui Help"));

  mBack->setObjectName(QStringLiteral("PButBack"));
  mBack->setArrowType(Qt::LeftArrow);
  mBack->setToolTip(QStringLiteral("Back (Alt+Left)"));
  mBack->setShortcut(QKeySequence::Back);
  mBack->setEnabled(false);
  mForward->setObjectName(QStringLiteral("PButForward"));
  mForward->setArrowType(Qt::RightArrow);
  mForward->setToolTip(QStringLiteral("Forward (Alt+Right)"));
  mForward->setShortcut(QKeySequence::Forward);
  mForward->setEnabled(false);
  mSearch->setObjectName(QStringLiteral("EditSearch"));
  mSearch->setPlaceholderText(QStringLiteral("Search the guide (Ctrl+F), Enter to find"));
  mSearch->setClearButtonEnabled(true);
  auto* find = new QAction(this);
  find->setShortcut(QKeySequence::Find);
  connect(find, &QAction::triggered, mSearch, [this] {
    mSearch->setFocus();
    mSearch->selectAll();
  });
  addAction(find);

  mContents->setObjectName(QStringLiteral("ListContents"));
  for (const QString& page : Pages()) mContents->addItem(PageItem(page));
  mHits->setObjectName(QStringLiteral("ListHits"));
  mHits->hide();
  mBrowser->setObjectName(QStringLiteral("Browser"));
  mBrowser->setOpenExternalLinks(true);

  auto* side = new QWidget;
  auto* sideLayout = new QVBoxLayout(side);
  sideLayout->setContentsMargins(0, 0, 0, 0);
  auto* navigation = new QHBoxLayout;
  navigation->addWidget(mBack);
  navigation->addWidget(mForward);
  navigation->addWidget(mSearch);
  sideLayout->addLayout(navigation);
  sideLayout->addWidget(mHits);
  sideLayout->addWidget(new QLabel(QStringLiteral("Contents")));
  sideLayout->addWidget(mContents, 1);
  auto* splitter = new QSplitter;
  splitter->addWidget(side);
  splitter->addWidget(mBrowser);
  splitter->setStretchFactor(1, 1);
  splitter->setSizes({240, 760});
  auto* layout = new QVBoxLayout(this);
  layout->addWidget(splitter);
  resize(1000, 700);

  connect(mBack, &QToolButton::clicked, mBrowser, &QTextBrowser::backward);
  connect(mForward, &QToolButton::clicked, mBrowser, &QTextBrowser::forward);
  connect(mBrowser, &QTextBrowser::backwardAvailable, mBack, &QToolButton::setEnabled);
  connect(mBrowser, &QTextBrowser::forwardAvailable, mForward, &QToolButton::setEnabled);
  connect(mBrowser, &QTextBrowser::sourceChanged, this, &HelpWindow::NfySourceChanged);
  connect(mContents, &QListWidget::itemActivated, this, &HelpWindow::HitContents);
  connect(mContents, &QListWidget::itemClicked, this, &HelpWindow::HitContents);
  connect(mHits, &QListWidget::itemActivated, this, &HelpWindow::HitHit);
  connect(mHits, &QListWidget::itemClicked, this, &HelpWindow::HitHit);
  connect(mSearch, &QLineEdit::returnPressed, this, [this] { Search(mSearch->text()); });
  connect(mSearch, &QLineEdit::textChanged, this, [this](const QString& text) {
    if (text.trimmed().isEmpty()) Search(text);
  });
  ShowPage(IndexUrl());
}

HelpWindow* HelpWindow::Show(const Dstring& pageOrResource, QWidget* parent) {
  static QPointer<HelpWindow> window;
  if (window == nullptr) window = new HelpWindow(parent);
  // A modal dialog takes the input from every window but its own: the guide moves under it.
  QWidget* modal = QApplication::activeModalWidget();
  bool under = false;
  for (QWidget* w = window->parentWidget(); w != nullptr && !under; w = w->parentWidget()) under = w == modal;
  if (modal != nullptr && modal != window && !under) window->setParent(modal, Qt::Window);
  const QUrl page = PageUrl(QString::fromStdString(pageOrResource));
  window->ShowPage(page.isEmpty() ? IndexUrl() : page);
  window->show();
  window->raise();
  window->activateWindow();
  return window;
}

QUrl HelpWindow::PageUrl(const QString& pageOrResource) {
  InitGuideResource();
  QString page = pageOrResource.trimmed();
  if (!page.endsWith(QLatin1String(".md"))) page += QLatin1String(".md");
  if (page.contains(QLatin1Char('/')) || !QFile::exists(kPageDir + page)) return {};
  return QUrl(QStringLiteral("qrc") + kPageDir + page);
}

QUrl HelpWindow::IndexUrl() { return PageUrl(kIndex); }

// The order is that of the index's bulleted list; a page only linked from its text follows.
QStringList HelpWindow::Pages() {
  InitGuideResource();
  static const QRegularExpression item(QStringLiteral("^\\s*[-*]\\s+\\[[^\\]]*\\]\\(([A-Za-z0-9_.-]+\\.md)\\)"),
                                       QRegularExpression::MultilineOption);
  static const QRegularExpression link(QStringLiteral("\\]\\(([A-Za-z0-9_.-]+\\.md)\\)"));
  const QString index = PageText(kIndex);
  QStringList pages{kIndex};
  for (const QRegularExpression* pattern : {&item, &link}) {
    for (const QRegularExpressionMatch& match : pattern->globalMatch(index)) {
      const QString page = match.captured(1);
      if (!pages.contains(page) && QFile::exists(kPageDir + page)) pages << page;
    }
  }
  return pages;
}

void HelpWindow::ShowPage(const QUrl& url) {
  if (mBrowser->source() == url) {
    MarkWords();
    return;
  }
  mBrowser->setSource(url, QTextDocument::MarkdownResource);
}

void HelpWindow::Search(const QString& text) {
  mWords = WordsOf(text);
  mHits->clear();
  mHits->setVisible(!mWords.isEmpty());
  if (mWords.isEmpty()) {
    MarkWords();
    return;
  }
  for (const QString& page : Pages()) {
    const QString readable = ReadableText(page);
    const bool all = std::all_of(mWords.cbegin(), mWords.cend(),
                                 [&](const QString& word) { return readable.contains(word, Qt::CaseInsensitive); });
    if (all) mHits->addItem(PageItem(page));
  }
  if (mHits->count() == 0) {
    auto* none = new QListWidgetItem(QStringLiteral("No page holds all of these words."));
    none->setFlags(Qt::NoItemFlags);
    mHits->addItem(none);
    MarkWords();
    return;
  }
  mHits->setCurrentRow(0);
  HitHit(mHits->item(0));
}

void HelpWindow::HitContents(QListWidgetItem* item) {
  if (item != nullptr) ShowPage(PageUrl(item->data(Qt::UserRole).toString()));
}

void HelpWindow::HitHit(QListWidgetItem* item) {
  if (item != nullptr && item->data(Qt::UserRole).isValid()) ShowPage(PageUrl(item->data(Qt::UserRole).toString()));
}

void HelpWindow::NfySourceChanged(const QUrl& url) {
  const QString page = PageOf(url);
  for (int row = 0; row < mContents->count(); ++row) {
    if (mContents->item(row)->data(Qt::UserRole).toString() == page) {
      const QSignalBlocker quiet(mContents);
      mContents->setCurrentRow(row);
    }
  }
  FitPictures();
  MarkWords();
}

// A picture wider than the page is shown at the page's width, so a page never scrolls sideways.
void HelpWindow::FitPictures() {
  QTextDocument* document = mBrowser->document();
  const qreal room = mBrowser->viewport()->width() - 2 * document->documentMargin() - 8;
  QTextCursor cursor(document);
  for (QTextBlock block = document->begin(); block.isValid(); block = block.next()) {
    for (auto it = block.begin(); !it.atEnd(); ++it) {
      const QTextFragment fragment = it.fragment();
      if (!fragment.charFormat().isImageFormat()) continue;
      QTextImageFormat picture = fragment.charFormat().toImageFormat();
      const QUrl url = mBrowser->source().resolved(QUrl(picture.name()));
      const QSize size = QImage::fromData(mBrowser->loadResource(QTextDocument::ImageResource, url).toByteArray()).size();
      if (size.isEmpty() || size.width() <= room) continue;
      picture.setWidth(room);
      picture.setHeight(room * size.height() / size.width());
      cursor.setPosition(fragment.position());
      cursor.setPosition(fragment.position() + fragment.length(), QTextCursor::KeepAnchor);
      cursor.setCharFormat(picture);
    }
  }
}

// Every place of a searched word gets a background; the first is selected and brought into view.
void HelpWindow::MarkWords() {
  QList<QTextEdit::ExtraSelection> marks;
  QTextCursor first;
  for (const QString& word : mWords) {
    QTextCursor at = mBrowser->document()->find(word);
    while (!at.isNull()) {
      QTextEdit::ExtraSelection mark;
      mark.cursor = at;
      mark.format.setBackground(QColor(255, 230, 0));
      marks << mark;
      if (first.isNull() || at.selectionStart() < first.selectionStart()) first = at;
      at = mBrowser->document()->find(word, at);
    }
  }
  mBrowser->setExtraSelections(marks);
  if (first.isNull()) {
    QTextCursor at = mBrowser->textCursor();
    at.clearSelection();
    mBrowser->setTextCursor(at);
    return;
  }
  mBrowser->setTextCursor(first);
  mBrowser->ensureCursorVisible();
}
