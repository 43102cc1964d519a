#include <gtest/gtest.h>

#include <QAction>
#include <QApplication>
#include <QMdiArea>
#include <QMdiSubWindow>
#include <QTest>
#include <QTimer>
#include <memory>

#include "common/gui/GuiSimFixture.h"
#include "segments/QenSegmentPool.h"
#include "segments/ui/SegmentGridManager.h"
#include "windows/MainWin.h"
#include "windows/dataedit/DataeditSegmentEditWin.h"

namespace {

// Keys in the main window against qensim: an editor's own keys win over the frame's.
class EditorKeysTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    mWin = ShowMainWin();
    Poll();
  }
  void TearDown() override {
    mWin.reset();
    QenSegmentPool::Delete("Keys/Save", mList);
    GuiSimFixture::TearDown();
  }
  QAction* SaveSetting() const {
    for (QAction* action : mWin->findChildren<QAction*>()) {
      if (action->text() == QStringLiteral("&Save Setting")) return action;
    }
    return nullptr;
  }

  std::unique_ptr<MainWin> mWin;
};

}  // namespace

// Ctrl+S in the segment editor saves the segment, and asks for no setting's name; another
// window active, Ctrl+S is the setting's again.
TEST_F(EditorKeysTest, CtrlSInTheSegmentEditorSavesTheSegment) {
  MakeSegment("Keys/Save", 16, 8);
  auto* editor =
      qobject_cast<DataeditSegmentEditWin*>(mWin->OpenWindow(QStringLiteral("dataedit.SegmentEditWin")));
  ASSERT_NE(editor, nullptr);
  ASSERT_EQ(editor->OpenSegment("Keys/Save", mList), 0) << mList.ToText();
  SegmentGridManager* grid = editor->Grid();
  grid->setFocus();
  QTest::keyClicks(grid, QStringLiteral("5a"));
  ASSERT_TRUE(grid->IsDirty());
  ASSERT_NE(SaveSetting(), nullptr);
  EXPECT_TRUE(SaveSetting()->shortcut().isEmpty()) << SaveSetting()->shortcut().toString().toStdString();
  // A dialog that opens is recorded and closed, so that the test goes on.
  QString asked;
  QTimer::singleShot(0, [&asked] {
    if (QWidget* dialog = QApplication::activeModalWidget()) {
      asked = dialog->windowTitle();
      dialog->close();
    }
  });
  QTest::keyClick(grid, Qt::Key_S, Qt::ControlModifier);
  QCoreApplication::processEvents();
  EXPECT_TRUE(asked.isEmpty()) << asked.toStdString();
  EXPECT_FALSE(grid->IsDirty());
  EXPECT_FALSE(editor->windowTitle().endsWith(QStringLiteral(" *")));
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();

  mWin->OpenWindow(QStringLiteral("error.ErrorWin"));
  ASSERT_NE(mWin->Area()->activeSubWindow()->widget(), editor);
  EXPECT_EQ(SaveSetting()->shortcut(), QKeySequence(QKeySequence::Save));
  mWin->OpenWindow(QStringLiteral("dataedit.SegmentEditWin"));
  EXPECT_TRUE(SaveSetting()->shortcut().isEmpty());
}
