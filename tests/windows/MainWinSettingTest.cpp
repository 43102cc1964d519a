#include <gtest/gtest.h>

#include <QAbstractButton>
#include <QApplication>
#include <QCheckBox>
#include <QComboBox>
#include <QDialogButtonBox>
#include <QDir>
#include <QInputDialog>
#include <QLabel>
#include <QMenuBar>
#include <QMessageBox>
#include <QPushButton>
#include <QRadioButton>
#include <QTest>
#include <QTimer>
#include <fstream>
#include <functional>
#include <memory>
#include <sstream>

#include "common/gui/GuiSimFixture.h"
#include "core/uiapp.h"
#include "settings/MemoryRegistryStore.h"
#include "settings/OpenSettingDs.h"
#include "settings/QENRegistryProfile.h"
#include "settings/SettingStartUp.h"
#include "settings/StartUpConfig.h"
#include "windows/MainWin.h"
#include "windows/SettingStartUpDialog.h"

namespace {

// Writes the picture to QEN_SCREENSHOT_DIR when that is set.
void Keep(QWidget* widget, const char* file) {
  ASSERT_NE(widget, nullptr) << file;
  const QPixmap picture = widget->grab();
  EXPECT_FALSE(picture.isNull());
  const QByteArray dir = qgetenv("QEN_SCREENSHOT_DIR");
  if (!dir.isEmpty()) {
    EXPECT_TRUE(picture.save(QDir(QString::fromLocal8Bit(dir)).filePath(file)));
  }
}

// Runs `answer` on the next modal dialog once it shows, looking again at each pass of the
// event loop; a dialog that never comes fails the test instead of waiting for ever.
void WhenModal(std::function<void(QWidget*)> answer, int passes = 1000) {
  QTimer::singleShot(0, [answer, passes] {
    QWidget* modal = QApplication::activeModalWidget();
    if (modal != nullptr && modal->isVisible()) return answer(modal);
    if (passes > 0) return WhenModal(answer, passes - 1);
    ADD_FAILURE() << "no dialog came";
  });
}

// The main window following the setting against qensim, as the window host starts it; the
// instrument holds the saved setting "bench1" at first.
class MainWinSettingTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    QENRegistryProfile::SetStore(&mRegistry);
    ASSERT_EQ(uiapp::GetOpenSettingDs()->Follow("G", mList), 0) << mList.ToText();
    // One qensim serves the suite: every test starts from the same values.
    Other(":CGR1:PER 2E-9");
    Other(":CGR1:MOD1:CONN1:VOLT:AMPL 1");
    ASSERT_EQ(uiapp::GetOpenSettingDs()->Save("bench1", uiapp::GetSettingMRU(), mList), 0) << mList.ToText();
    mWin = ShowMainWin();
    Poll();
  }
  void TearDown() override {
    mWin.reset();
    GuiSimFixture::TearDown();
    QENRegistryProfile::SetStore(nullptr);
  }
  QAction* Action(const char* text) {
    for (QAction* action : mWin->menuBar()->findChildren<QAction*>()) {
      if (action->text() == QLatin1String(text)) return action;
    }
    ADD_FAILURE() << "no action " << text;
    return nullptr;
  }
  void Trigger(const char* text) {
    if (QAction* action = Action(text)) action->trigger();
    QCoreApplication::processEvents();
  }
  std::string Title() const { return mWin->windowTitle().toStdString(); }
  static std::string FileText(const char* name) {
    std::ifstream in(sDataDir + "/settings/" + name + ".qset");
    std::stringstream text;
    text << in.rdbuf();
    return text.str();
  }
  // Answers the next name question (a typed name, or a pick from the list) with `name`.
  static void AnswerName(const QString& name, bool* asked) {
    WhenModal([name, asked](QWidget* modal) {
      auto* dialog = qobject_cast<QInputDialog*>(modal);
      *asked = dialog != nullptr;
      ASSERT_NE(dialog, nullptr);
      dialog->setTextValue(name);
      dialog->accept();
    });
  }
  void Modify() {
    Other(":CGR1:MOD1:CONN1:VOLT:AMPL 0.5");
    Poll();
    ASSERT_EQ(Title(), "bench1 * - Corvane 71300");
  }

  MemoryRegistryStore mRegistry;
  std::unique_ptr<MainWin> mWin;
};

}  // namespace

TEST_F(MainWinSettingTest, NewThenSaveAsksForANameAndLeavesTheSettingOpenedBefore) {
  EXPECT_EQ(Title(), "bench1 - Corvane 71300");
  const std::string bench1 = FileText("bench1");
  Trigger("&New Setting");
  EXPECT_EQ(Title(), "UNTITLED - Corvane 71300");
  EXPECT_DOUBLE_EQ(OtherNumber(":CGR1:PER"), 1E-9) << "a new setting is every parameter at its default";
  Other(":CGR1:PER 4E-9");
  Poll();
  EXPECT_EQ(Title(), "UNTITLED * - Corvane 71300");
  bool asked = false;
  AnswerName(QStringLiteral("bench2"), &asked);
  QTest::keyClick(mWin.get(), Qt::Key_S, Qt::ControlModifier);
  EXPECT_TRUE(asked) << "Save of a new setting asks for a name";
  EXPECT_EQ(Title(), "bench2 - Corvane 71300");
  EXPECT_EQ(FileText("bench1"), bench1);
  EXPECT_NE(FileText("bench2").find("\nvalue :CGR1:PER 4e-09\n"), std::string::npos) << FileText("bench2");
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
}

namespace {

struct LeaveCase {
  const char* what;
  const char* action;
  int answer;  // -1: no answer queued, the question goes to the alert sink and is cancelled
  const char* title;
  bool bench1Saved;
  bool picks;  // the setting to open is picked after the question
  bool closes;
};

void PrintTo(const LeaveCase& c, std::ostream* os) { *os << c.what; }

class LeavingAModifiedSetting : public MainWinSettingTest, public testing::WithParamInterface<LeaveCase> {};

}  // namespace

TEST_P(LeavingAModifiedSetting, AsksToSaveItFirst) {
  const LeaveCase& c = GetParam();
  Modify();
  const std::string bench1 = FileText("bench1");
  if (c.answer >= 0) mToolkit.QueueAnswer(c.answer);
  bool picked = false;
  if (c.picks) AnswerName(QStringLiteral("bench1"), &picked);
  Trigger(c.action);
  EXPECT_EQ(picked, c.picks);
  if (c.answer < 0) {
    ASSERT_EQ(mAlerts.size(), 1u);
    EXPECT_NE(mAlerts[0].find("The setting \"bench1\" has changes that are not saved. Save it before"),
              Dstring::npos) << mAlerts[0];
  } else {
    EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
  }
  EXPECT_EQ(Title(), c.title);
  EXPECT_EQ(FileText("bench1") != bench1, c.bench1Saved);
  EXPECT_EQ(mWin->isVisible(), !c.closes);
}

INSTANTIATE_TEST_SUITE_P(
    Table, LeavingAModifiedSetting,
    testing::Values(
        LeaveCase{"new cancelled", "&New Setting", -1, "bench1 * - Corvane 71300", false, false, false},
        LeaveCase{"new discarding", "&New Setting", ToolkitPort::kNo, "UNTITLED - Corvane 71300", false, false, false},
        LeaveCase{"new saving", "&New Setting", ToolkitPort::kYes, "UNTITLED - Corvane 71300", true, false, false},
        LeaveCase{"open cancelled", "&Open Setting...", -1, "bench1 * - Corvane 71300", false, false, false},
        LeaveCase{"open discarding", "&Open Setting...", ToolkitPort::kNo, "bench1 - Corvane 71300", false, true, false},
        LeaveCase{"quit cancelled", "&Quit", -1, "bench1 * - Corvane 71300", false, false, false},
        LeaveCase{"quit saving", "&Quit", ToolkitPort::kYes, "bench1 - Corvane 71300", true, false, true}));

TEST_F(MainWinSettingTest, SaveAsAsksBeforeReplacingAName) {
  ASSERT_EQ(uiapp::GetOpenSettingDs()->Save("bench2", uiapp::GetSettingMRU(), mList), 0);
  ASSERT_EQ(uiapp::GetOpenSettingDs()->Load("bench1", false, uiapp::GetSettingMRU(), mList), 0);
  Modify();
  const std::string bench2 = FileText("bench2");
  bool asked = false;
  AnswerName(QStringLiteral("bench2"), &asked);
  Trigger("Save Setting &As...");
  ASSERT_TRUE(asked);
  ASSERT_EQ(mAlerts.size(), 1u) << "the question, answered Cancel";
  EXPECT_EQ(mAlerts[0], "The instrument keeps a setting named \"bench2\" already. Replace it?");
  EXPECT_EQ(FileText("bench2"), bench2);
  EXPECT_EQ(Title(), "bench1 * - Corvane 71300");
  mToolkit.QueueAnswer(ToolkitPort::kYes);
  AnswerName(QStringLiteral("bench2"), &asked);
  Trigger("Save Setting &As...");
  EXPECT_NE(FileText("bench2"), bench2);
  EXPECT_EQ(Title(), "bench2 - Corvane 71300");
}

TEST_F(MainWinSettingTest, ASaveUnderAnotherClientsLockSaysSoAndKeepsTheTitleAndTheFile) {
  Modify();
  const std::string bench1 = FileText("bench1");
  // Taken after the last poll: the menu still offers the save.
  Control(":TEST:LOCK ON");
  Trigger("&Save Setting");
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_NE(mAlerts[0].find("The setting was not saved as \"bench1\"; the saved settings are as they were."),
            Dstring::npos) << mAlerts[0];
  EXPECT_NE(mAlerts[0].find("Another client holds the instrument."), Dstring::npos) << mAlerts[0];
  EXPECT_EQ(Title(), "bench1 * - Corvane 71300");
  Control(":TEST:LOCK OFF");
  EXPECT_EQ(FileText("bench1"), bench1);
}

TEST_F(MainWinSettingTest, TheSettingCommandsAreOffWhileAnotherClientHoldsTheInstrument) {
  const char* commands[] = {"&New Setting", "&Open Setting...", "Recent &Settings", "&Save Setting", "Save Setting &As..."};
  for (const char* text : commands) EXPECT_TRUE(Action(text)->isEnabled()) << text;
  Control(":TEST:LOCK ON");
  Poll();
  Poll();
  ASSERT_TRUE(mWin->IsShowingLock());
  for (const char* text : commands) EXPECT_FALSE(Action(text)->isEnabled()) << text;
  EXPECT_TRUE(Action("&Quit")->isEnabled());
  Control(":TEST:LOCK OFF");
  Poll();
  Poll();
  for (const char* text : commands) EXPECT_TRUE(Action(text)->isEnabled()) << text;
}

// The start-up dialog of the window host: the choice that does not check out is shown again
// with the reason; the one that does is made on the instrument and kept for the next start.
TEST_F(MainWinSettingTest, TheStartUpDialogLoadsTheChosenSettingAndKeepsTheChoice) {
  Other(":CGR1:PER 8E-9");
  StartUpConfig config;
  config.SetShowDialog(true);
  ASSERT_EQ(config.Write(0, mList), 0);
  SettingStartUpDialog dialog;
  SettingStartUp::SetDialog(&dialog);
  int shown = 0;
  std::function<void(QWidget*)> answer = [&](QWidget* modal) {
    ASSERT_EQ(modal, &dialog);
    ++shown;
    dialog.LoadButton()->setChecked(true);
    if (shown == 1) {
      dialog.NameBox()->setEditText(QStringLiteral("no such"));
    } else {
      EXPECT_TRUE(dialog.ProblemLabel()->isVisible());
      EXPECT_EQ(dialog.ProblemLabel()->text(), "The instrument keeps no setting named \"no such\".");
      Keep(&dialog, "startup-dialog.png");
      dialog.NameBox()->setCurrentIndex(dialog.NameBox()->findText(QStringLiteral("bench1")));
      dialog.ShowDialogBox()->setChecked(false);
    }
    QTest::mouseClick(dialog.findChild<QDialogButtonBox*>()->button(QDialogButtonBox::Ok), Qt::LeftButton);
    if (shown == 1) WhenModal(answer);
  };
  WhenModal(answer);
  EXPECT_EQ(SettingStartUp::Run(0, mToolkit, uiapp::GetSettingMRU(), *uiapp::GetOpenSettingDs()), 0);
  SettingStartUp::SetDialog(nullptr);
  EXPECT_EQ(shown, 2);
  EXPECT_DOUBLE_EQ(OtherNumber(":CGR1:PER"), 2E-9);
  EXPECT_EQ(uiapp::GetOpenSettingDs()->Title(), "bench1");
  StartUpConfig kept;
  ASSERT_EQ(kept.Read(0, mList), 0);
  EXPECT_EQ(kept.GetStart(), StartUpConfig::Start::kLoadSetting);
  EXPECT_EQ(kept.GetSettingName(), "bench1");
  EXPECT_FALSE(kept.GetShowDialog());
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
}

// The questions as the user sees them, answered by clicking.
TEST_F(MainWinSettingTest, QuestionsShowTheirChoicesAndTheirPicturesAreKept) {
  Modify();
  mToolkit.SetAlertSink(nullptr);
  QStringList buttons;
  WhenModal([&](QWidget* modal) {
    auto* box = qobject_cast<QMessageBox*>(modal);
    ASSERT_NE(box, nullptr);
    for (QAbstractButton* button : box->buttons()) buttons << button->text();
    Keep(box, "question-save-setting.png");
    box->button(QMessageBox::Cancel)->click();
  });
  Trigger("&New Setting");
  buttons.sort();
  EXPECT_EQ(buttons.join(','), "Cancel,Discard,Save");
  EXPECT_EQ(Title(), "bench1 * - Corvane 71300");

  bool asked = false;
  WhenModal([&](QWidget* modal) {
    auto* dialog = qobject_cast<QInputDialog*>(modal);
    ASSERT_NE(dialog, nullptr);
    asked = true;
    dialog->setTextValue(QStringLiteral("bench1"));
    dialog->accept();
    WhenModal([](QWidget* next) {
      auto* box = qobject_cast<QMessageBox*>(next);
      ASSERT_NE(box, nullptr);
      Keep(box, "question-replace-setting.png");
      box->button(QMessageBox::Cancel)->click();
    });
  });
  Trigger("Save Setting &As...");
  EXPECT_TRUE(asked);

  Control(":TEST:LOCK ON");
  WhenModal([&](QWidget* modal) {
    auto* box = qobject_cast<QMessageBox*>(modal);
    ASSERT_NE(box, nullptr);
    Keep(box, "setting-not-saved.png");
    box->accept();
  });
  Trigger("&Save Setting");
  Control(":TEST:LOCK OFF");
  EXPECT_EQ(Title(), "bench1 * - Corvane 71300");
}
