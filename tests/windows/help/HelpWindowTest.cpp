#include <gtest/gtest.h>

#include <algorithm>

#include <QDir>
#include <QFile>
#include <QImage>
#include <QLineEdit>
#include <QListWidget>
#include <QTest>
#include <QTextBlock>
#include <QTextBrowser>
#include <QTextDocument>
#include <QTextList>
#include <QToolButton>

#include "common/gui/GuiSimFixture.h"
#include "core/uiapp.h"
#include "toolkit/qt/HelpWindow.h"

namespace {

const QString kGuide = QStringLiteral(":/help/guide/");

struct Link {
  QString href;
  bool image = false;
  int position = 0;
  bool listItem = false;  // the first thing of an item of a bulleted list
};

// Every link and picture of the document shown, in the order of the text.
std::vector<Link> LinksOf(const QTextDocument& document) {
  std::vector<Link> links;
  for (QTextBlock block = document.begin(); block.isValid(); block = block.next()) {
    for (auto it = block.begin(); !it.atEnd(); ++it) {
      const QTextFragment fragment = it.fragment();
      const QTextCharFormat format = fragment.charFormat();
      if (format.isImageFormat()) links.push_back({format.toImageFormat().name(), true, fragment.position()});
      const QTextList* list = block.textList();
      const bool bullet = list != nullptr && list->format().style() >= QTextListFormat::ListSquare &&
                          list->format().style() <= QTextListFormat::ListDisc;
      if (format.isAnchor() && !format.anchorHref().isEmpty())
        links.push_back({format.anchorHref(), false, fragment.position(), bullet && fragment.position() == block.position()});
    }
  }
  return links;
}

QStringList GuidePages() { return QDir(kGuide).entryList({QStringLiteral("*.md")}, QDir::Files, QDir::Name); }

// What a reader sees of a page, read here from the resource on its own.
QString VisibleText(const QString& page) {
  QFile file(kGuide + page);
  EXPECT_TRUE(file.open(QIODevice::ReadOnly)) << page.toStdString();
  QTextDocument document;
  document.setMarkdown(QString::fromUtf8(file.readAll()));
  return document.toPlainText();
}

std::string Text(const QStringList& list) { return list.join(QLatin1Char(' ')).toStdString(); }

QString PageOf(const QTextBrowser* browser) { return browser->source().path().section(QLatin1Char('/'), -1); }

class HelpWindowTest : public testing::Test {
 protected:
  static void SetUpTestSuite() { EnsureApplication(); }
};

// Shown in the browser as the reader follows it: each page is rendered, and each link reaches
// a page or a picture of the compiled guide. A link to a missing page or picture is named.
TEST_F(HelpWindowTest, EveryPageLoadsAndEveryLinkResolves) {
  HelpWindow window;
  const QStringList pages = GuidePages();
  ASSERT_GE(pages.size(), 20);
  QStringList broken;
  int pageLinks = 0;
  int pictures = 0;
  for (const QString& page : pages) {
    const QUrl url = HelpWindow::PageUrl(page);
    ASSERT_FALSE(url.isEmpty()) << page.toStdString();
    window.ShowPage(url);
    QTextBrowser* browser = window.Browser();
    ASSERT_EQ(browser->source(), url);
    const QString text = browser->document()->toPlainText();
    EXPECT_FALSE(text.trimmed().isEmpty()) << page.toStdString();
    EXPECT_FALSE(text.startsWith(QLatin1String("# "))) << page.toStdString() << " is shown as plain text";
    for (const Link& link : LinksOf(*browser->document())) {
      const QUrl target = url.resolved(QUrl(link.href));
      const QString path = QLatin1Char(':') + target.path();
      if (target.scheme() != QLatin1String("qrc") || !QFile::exists(path)) {
        broken << page + QStringLiteral(" → ") + link.href;
        continue;
      }
      if (link.image) {
        ++pictures;
        const QVariant data = browser->loadResource(QTextDocument::ImageResource, target);
        if (QImage::fromData(data.toByteArray()).isNull()) broken << page + QStringLiteral(" → ") + link.href + QStringLiteral(" (no picture)");
      } else {
        ++pageLinks;
        if (!link.href.endsWith(QLatin1String(".md"))) broken << page + QStringLiteral(" → ") + link.href + QStringLiteral(" (no page)");
      }
    }
  }
  EXPECT_TRUE(broken.isEmpty()) << broken.join(QLatin1Char('\n')).toStdString();
  EXPECT_GT(pageLinks, pages.size());
  EXPECT_GT(pictures, 10);
}

// The contents list is the index and the pages its bulleted list names, in that order, and
// reaches every page.
TEST_F(HelpWindowTest, ContentsHoldEveryPageInTheIndexOrder) {
  HelpWindow window;
  const QStringList contents = HelpWindow::Pages();
  ASSERT_FALSE(contents.isEmpty());
  EXPECT_EQ(contents.front().toStdString(), "index.md");
  const QStringList all = GuidePages();
  QStringList sorted = contents;
  sorted.sort();
  EXPECT_EQ(Text(sorted), Text(all));
  ASSERT_EQ(window.Contents()->count(), contents.size());
  window.ShowPage(HelpWindow::IndexUrl());
  QStringList linked;
  for (const Link& link : LinksOf(*window.Browser()->document())) {
    if (link.listItem && !linked.contains(link.href)) linked << link.href;
  }
  EXPECT_EQ(Text(contents.mid(1)), Text(linked));
  window.show();
  const int row = 5;
  QListWidget* list = window.Contents();
  list->scrollToItem(list->item(row));
  QTest::mouseClick(list->viewport(), Qt::LeftButton, {}, list->visualItemRect(list->item(row)).center());
  EXPECT_EQ(PageOf(window.Browser()).toStdString(), contents.at(row).toStdString());
}

TEST_F(HelpWindowTest, EveryWindowResourceHasItsPage) {
  for (const WindowResource& entry : uiapp::WindowResources()) {
    HelpWindow* window = HelpWindow::Show(entry.resource, nullptr);
    EXPECT_EQ(PageOf(window->Browser()).toStdString(), entry.resource + ".md");
    EXPECT_TRUE(window->isVisible());
  }
  for (const char* page : {"SettingStartUpDialog", "ConnectDialog.md", "unitsdlg.UnitsDialog", "keyboard"}) {
    EXPECT_FALSE(HelpWindow::PageUrl(QString::fromLatin1(page)).isEmpty()) << page;
  }
  // A window without a page, and no window at all, open the index.
  for (const char* none : {"nosuch.Win", "", "../images/loopgrid.png"}) {
    HelpWindow* window = HelpWindow::Show(none, nullptr);
    EXPECT_EQ(window->Browser()->source(), HelpWindow::IndexUrl()) << none;
  }
  HelpWindow* one = HelpWindow::Show("ber.BerWin", nullptr);
  EXPECT_EQ(HelpWindow::Show("error.ErrorWin", nullptr), one);
  delete one;
}

// How many pages hold the words, as counted here from the pages themselves: none, one, or many.
constexpr int kMany = -1;

struct SearchCase {
  const char* words;
  int pages;
};

class HelpSearchTest : public HelpWindowTest, public testing::WithParamInterface<SearchCase> {};

TEST_P(HelpSearchTest, ListsThePagesHoldingTheWordsAndMarksThem) {
  const SearchCase c = GetParam();
  const QStringList words = QString::fromLatin1(c.words).split(QLatin1Char(' '));
  QStringList holding;
  for (const QString& page : GuidePages()) {
    const QString text = VisibleText(page);
    if (std::all_of(words.begin(), words.end(), [&](const QString& w) { return text.contains(w, Qt::CaseInsensitive); })) holding << page;
  }
  if (c.pages == kMany) {
    ASSERT_GE(holding.size(), 2) << c.words;
  } else {
    ASSERT_EQ(holding.size(), c.pages) << c.words;
  }

  HelpWindow window;
  window.show();
  QTest::keyClicks(window.SearchField(), QString::fromLatin1(c.words));
  QTest::keyClick(window.SearchField(), Qt::Key_Return);
  QListWidget* hits = window.Hits();
  ASSERT_TRUE(hits->isVisible());
  QStringList listed;
  for (int row = 0; row < hits->count(); ++row) {
    const QVariant page = hits->item(row)->data(Qt::UserRole);
    if (page.isValid()) listed << page.toString();
  }
  std::sort(listed.begin(), listed.end());
  EXPECT_EQ(Text(listed), Text(holding));
  if (holding.isEmpty()) {
    ASSERT_EQ(hits->count(), 1);
    EXPECT_EQ(hits->item(0)->flags(), Qt::NoItemFlags);
    EXPECT_TRUE(window.Browser()->extraSelections().isEmpty());
    return;
  }
  const QString shown = PageOf(window.Browser());
  EXPECT_TRUE(holding.contains(shown)) << shown.toStdString();
  const auto marks = window.Browser()->extraSelections();
  ASSERT_FALSE(marks.isEmpty());
  for (const auto& mark : marks) {
    EXPECT_TRUE(words.contains(mark.cursor.selectedText(), Qt::CaseInsensitive)) << mark.cursor.selectedText().toStdString();
  }
  EXPECT_TRUE(words.contains(window.Browser()->textCursor().selectedText(), Qt::CaseInsensitive));

  // Emptying the field takes the marks away.
  window.SearchField()->clear();
  EXPECT_FALSE(hits->isVisible());
  EXPECT_TRUE(window.Browser()->extraSelections().isEmpty());
  EXPECT_FALSE(window.Browser()->textCursor().hasSelection());
}

INSTANTIATE_TEST_SUITE_P(Words, HelpSearchTest,
                         testing::Values(SearchCase{"femtoseconds", 1}, SearchCase{"Deserialise", 1},
                                         SearchCase{"segment", kMany}, SearchCase{"loop Ctrl+L", kMany},
                                         SearchCase{"femtoseconds Ctrl+L", 0}));

// A click on a link follows it; Back returns to the page before, Forward goes on again.
TEST_F(HelpWindowTest, BackAfterFollowingALinkReturnsToThePageBefore) {
  HelpWindow window;
  window.show();
  QTextBrowser* browser = window.Browser();
  window.ShowPage(HelpWindow::IndexUrl());
  EXPECT_FALSE(window.BackButton()->isEnabled());
  const std::vector<Link> links = LinksOf(*browser->document());
  const auto first = std::find_if(links.begin(), links.end(), [](const Link& l) { return !l.image; });
  ASSERT_NE(first, links.end());
  QTextCursor at(browser->document());
  at.setPosition(first->position + 1);
  browser->setTextCursor(at);
  browser->ensureCursorVisible();
  QTest::mouseClick(browser->viewport(), Qt::LeftButton, {}, browser->cursorRect(at).center());
  ASSERT_EQ(PageOf(browser).toStdString(), first->href.toStdString());
  ASSERT_TRUE(window.BackButton()->isEnabled());

  QTest::mouseClick(window.BackButton(), Qt::LeftButton);
  EXPECT_EQ(browser->source(), HelpWindow::IndexUrl());
  EXPECT_FALSE(window.BackButton()->isEnabled());
  ASSERT_TRUE(window.ForwardButton()->isEnabled());
  QTest::mouseClick(window.ForwardButton(), Qt::LeftButton);
  EXPECT_EQ(PageOf(browser).toStdString(), first->href.toStdString());
  EXPECT_FALSE(window.ForwardButton()->isEnabled());
  EXPECT_EQ(window.Contents()->currentItem()->data(Qt::UserRole).toString().toStdString(), first->href.toStdString());
}

}  // namespace
