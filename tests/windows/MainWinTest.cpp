#include <gtest/gtest.h>

#include <QApplication>
#include <QLabel>
#include <QLineEdit>
#include <QMenuBar>
#include <QMdiArea>
#include <QMdiSubWindow>
#include <QPushButton>
#include <QTableView>
#include <QTest>
#include <QTextBrowser>
#include <QTimer>
#include <QDialog>
#include <QToolBar>
#include <QTreeWidget>
#include <functional>
#include <iterator>
#include <memory>

#include "common/gui/GuiSimFixture.h"
#include "core/ErrorJournal.h"
#include "core/uiapp.h"
#include "data/SystemStateDs.h"
#include "params/ui/ParSpinBox.h"
#include "params/ui/QenDsCBut.h"
#include "params/ui/QenDsSTEd.h"
#include "params/ui/QenParEd.h"
#include "params/ui/UnitLabel.h"
#include "toolkit/qt/HelpWindow.h"
#include "windows/MainWin.h"
#include "segments/QenSegmentDs.h"
#include "segments/QenSegmentPool.h"
#include "segments/ui/SegmentGridManager.h"
#include "windows/StateStatusBar.h"
#include "windows/dataedit/DataeditSegmentEditWin.h"
#include "windows/dtecmd/DtecmdCmdWin.h"
#include "windows/error/ErrorErrorWin.h"
#include "windows/error/ErrorJournalModel.h"
#include "windows/paramedit/ParameditParamEdWin.h"
#include "windows/selftest/SelftestResultWin.h"
#include "windows/smseqedit/SmseqeditWin.h"

namespace {

// The main window against qensim, as the window host shows it.
class MainWinTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    Other(":CGR1:MOD1:CONN2:VOLT:AMPL 1");
    Other(":CGR2:MOD1:CONN1:VOLT:AMPL 1");
    mWin = ShowMainWin();
    Poll();
  }
  void TearDown() override {
    mWin.reset();
    GuiSimFixture::TearDown();
  }
  template <class T>
  T* Open(const char* resource) {
    auto* window = qobject_cast<T*>(mWin->OpenWindow(QString::fromLatin1(resource)));
    EXPECT_NE(window, nullptr) << resource << ": " << (mAlerts.empty() ? "" : mAlerts.back());
    return window;
  }
  QenParEd* Field(ParameditParamEdWin* editor, const char* name) {
    return editor->CurrentPanel()->findChild<QenParEd*>(QString::fromLatin1(name));
  }

  std::unique_ptr<MainWin> mWin;
};

}  // namespace

TEST_F(MainWinTest, AWindowOpensOnceAndIsRaisedWhenAskedAgain) {
  QWidget* first = mWin->OpenWindow("error.ErrorWin");
  mWin->OpenWindow("dtecmd.CmdWin");
  EXPECT_EQ(mWin->OpenWindow("error.ErrorWin"), first);
  EXPECT_EQ(mWin->Area()->subWindowList().size(), 2);
  EXPECT_EQ(mWin->Area()->activeSubWindow()->widget(), first);
  EXPECT_EQ(mWin->OpenWindow("nosuch.Win"), nullptr);
  QCoreApplication::processEvents();
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_NE(mAlerts[0].find("nosuch.Win"), Dstring::npos);
}

// The Windows menu ends with the open windows by title, the active one checked; Ctrl+Tab and
// Ctrl+Shift+Tab go round them from inside any of them.
TEST_F(MainWinTest, TheOpenWindowsAreListedAndCtrlTabGoesRoundThem) {
  QWidget* errors = mWin->OpenWindow("error.ErrorWin");
  auto* cmd = Open<DtecmdCmdWin>("dtecmd.CmdWin");
  QMenu* menu = nullptr;
  for (QAction* top : mWin->menuBar()->actions()) {
    if (top->text() == QStringLiteral("&Windows")) menu = top->menu();
  }
  ASSERT_NE(menu, nullptr);
  auto listed = [&] {
    emit menu->aboutToShow();
    QStringList titles;
    for (QAction* action : menu->actions()) {
      if (action->isCheckable()) titles << action->text() + (action->isChecked() ? QStringLiteral(" *") : QString());
    }
    return titles.join(QStringLiteral(", ")).toStdString();
  };
  const size_t windows = mWin->Area()->subWindowList().size();
  ASSERT_GE(windows, 2u);
  const std::string list = listed();
  EXPECT_NE(list.find("Command Window *"), std::string::npos) << list;
  EXPECT_NE(list.find("Error List"), std::string::npos) << list;
  EXPECT_EQ(std::count(list.begin(), list.end(), ','), static_cast<long>(windows) - 1) << "listed once each: " << list;
  EXPECT_EQ(listed(), list) << "the list is made anew each time";
  std::vector<QWidget*> seen;
  for (size_t i = 0; i < windows; ++i) {
    QTest::keyClick(cmd->Input(), Qt::Key_Tab, Qt::ControlModifier);
    seen.push_back(mWin->Area()->activeSubWindow()->widget());
  }
  EXPECT_EQ(seen.back(), cmd) << "round all windows and back";
  EXPECT_NE(std::find(seen.begin(), seen.end(), errors), seen.end());
  QTest::keyClick(cmd->Input(), Qt::Key_Backtab, Qt::ControlModifier | Qt::ShiftModifier);
  EXPECT_NE(mWin->Area()->activeSubWindow()->widget(), cmd);
}

// The Windows menu is the window table's: its entries in the table's order, Ctrl+1 … Ctrl+9 on
// the first nine and none after, and each opens the table's window under the table's title.
TEST_F(MainWinTest, TheWindowsMenuOpensEachWindowOfTheTableUnderItsTitle) {
  QMenu* menu = nullptr;
  for (QAction* top : mWin->menuBar()->actions()) {
    if (top->text() == QStringLiteral("&Windows")) menu = top->menu();
  }
  ASSERT_NE(menu, nullptr);
  QList<QAction*> entries;
  for (QAction* action : menu->actions()) {
    if (action->isSeparator()) break;
    entries << action;
  }
  std::vector<const WindowResource*> onMenu;
  for (const WindowResource& window : uiapp::WindowResources()) {
    if (window.onMenu) onMenu.push_back(&window);
  }
  ASSERT_EQ(static_cast<std::size_t>(entries.size()), onMenu.size());
  ASSERT_GT(onMenu.size(), 9u);
  for (std::size_t i = 0; i < onMenu.size(); ++i) {
    SCOPED_TRACE(onMenu[i]->resource);
    QAction* entry = entries[static_cast<int>(i)];
    EXPECT_EQ(entry->text().toStdString(), onMenu[i]->title);
    EXPECT_EQ(entry->shortcut(), i < 9 ? QKeySequence(Qt::CTRL | (Qt::Key_1 + static_cast<int>(i))) : QKeySequence());
    entry->trigger();
    QWidget* window = mWin->FindWindow(QString::fromStdString(onMenu[i]->resource));
    ASSERT_NE(window, nullptr) << (mAlerts.empty() ? "" : mAlerts.back());
    EXPECT_EQ(window->parentWidget()->windowTitle().toStdString(), onMenu[i]->title);
  }
}

TEST_F(MainWinTest, ParameterEditorWritesAndFollowsASecondClient) {
  auto* editor = Open<ParameditParamEdWin>("paramedit.ParamEd");
  ASSERT_TRUE(editor->SelectPath(":CGR1:MOD1:CONN2"));
  QenParEd* ampl = Field(editor, "FieldAmpl");
  ASSERT_NE(ampl, nullptr);
  EXPECT_EQ(ampl->Editor()->Text(), "1");
  ampl->Editor()->setFocus();
  QTest::keyClick(ampl->Editor(), Qt::Key_A, Qt::ControlModifier);
  QTest::keyClicks(ampl->Editor(), "2.25");
  QTest::keyClick(ampl->Editor(), Qt::Key_Return);
  EXPECT_DOUBLE_EQ(OtherNumber(":CGR1:MOD1:CONN2:VOLT:AMPL"), 2.25);
  EXPECT_DOUBLE_EQ(OtherNumber(":CGR1:MOD1:CONN1:VOLT:AMPL"), 1.0) << "another port was written";
  Other(":CGR1:MOD1:CONN2:VOLT:AMPL 0.75");
  Poll();
  EXPECT_EQ(ampl->Editor()->Text(), "0.75");
  // The same panel moves to another port of another group.
  ASSERT_TRUE(editor->SelectPath(":CGR2:MOD1:CONN1"));
  EXPECT_EQ(Field(editor, "FieldAmpl"), ampl);
  EXPECT_EQ(ampl->Editor()->Text(), "1");
  EXPECT_TRUE(mAlerts.empty());
}

TEST_F(MainWinTest, TextAFieldLeavesOutIsSaidInTheStatusBar) {
  auto* editor = Open<ParameditParamEdWin>("paramedit.ParamEd");
  ASSERT_TRUE(editor->SelectPath(":CGR1:MOD1:CONN2"));
  QenParEd* ampl = Field(editor, "FieldAmpl");
  ASSERT_NE(ampl, nullptr);
  ampl->Editor()->setFocus();
  QTest::keyClick(ampl->Editor(), Qt::Key_A, Qt::ControlModifier);
  QTest::keyClicks(ampl->Editor(), "1.5 volts");
  QTest::keyClick(ampl->Editor(), Qt::Key_Return);
  EXPECT_DOUBLE_EQ(OtherNumber(":CGR1:MOD1:CONN2:VOLT:AMPL"), 1.5);
  EXPECT_EQ(mWin->statusBar()->currentMessage(), "1.5 V sent; \"volts\" ignored: this field is in V");
}

TEST_F(MainWinTest, ParameterEditorShowsOnlyWhatTheItemHas) {
  auto* editor = Open<ParameditParamEdWin>("paramedit.ParamEd");
  ASSERT_TRUE(editor->SelectPath(":CGR1:MOD1"));
  EXPECT_EQ(editor->CurrentPanel()->findChild<QLabel*>("LabelMemory")->text(), "128 MBit");
  EXPECT_TRUE(editor->CurrentPanel()->findChild<QWidget*>("BoxUcas")->isVisibleTo(editor));
  ASSERT_TRUE(editor->SelectPath(":CGR1:MOD3"));
  EXPECT_FALSE(editor->CurrentPanel()->findChild<QWidget*>("BoxUcas")->isVisibleTo(editor));
  EXPECT_EQ(editor->CurrentPanel()->findChild<QLabel*>("LabelMemory")->text(), "none");
  for (const auto& e : ErrorJournal::Entries()) ADD_FAILURE() << e.command << ": " << e.text;
}

// The module's model cannot be written: its field never writes and shows a plain text.
TEST_F(MainWinTest, AReadOnlyFieldNeverWritesAndLooksReadOnly) {
  auto* editor = Open<ParameditParamEdWin>("paramedit.ParamEd");
  ASSERT_TRUE(editor->SelectPath(":CGR1:MOD1"));
  auto* model = editor->CurrentPanel()->findChild<QenDsSTEd*>(QStringLiteral("TextType"));
  ASSERT_NE(model, nullptr);
  const Dstring quoted = Other(":CGR1:MOD1:TYPE?");
  ASSERT_EQ(quoted, "\"K2268A\"");
  EXPECT_TRUE(model->isReadOnly());
  EXPECT_EQ(model->text().toStdString(), "K2268A");
  EXPECT_FALSE(model->hasFrame());
  EXPECT_EQ(model->palette().color(QPalette::Base), model->palette().color(QPalette::Window));
  const std::size_t journal = ErrorJournal::Entries().size();
  model->setFocus();
  QTest::keyClick(model, Qt::Key_Return);
  editor->Tree()->setFocus();
  ConditionList list;
  EXPECT_EQ(model->SendValue(list), 0);
  QCoreApplication::processEvents();
  EXPECT_EQ(ErrorJournal::Entries().size(), journal) << ErrorJournal::Entries().front().command;
  EXPECT_TRUE(list.IsEmpty());
  EXPECT_TRUE(mAlerts.empty()) << (mAlerts.empty() ? "" : mAlerts[0]);
  EXPECT_EQ(model->text().toStdString(), "K2268A");
}

// A refused value names the parameter by its place and label, the value asked and the limits
// the instrument holds, then the code and text.
TEST_F(MainWinTest, ARefusedValueSaysWhichParameterWhatWasAskedAndTheLimits) {
  auto* editor = Open<ParameditParamEdWin>("paramedit.ParamEd");
  ASSERT_TRUE(editor->SelectPath(":CGR1:MOD1:CONN2"));
  struct Case {
    const char* field;
    const char* typed;
    const char* alert;
  };
  const Case cases[] = {
      {"FieldAmpl", "99",
       "Group 1 \u203A Module 1 \u203A Port 2 \u00B7 Amplitude: 99 V asked; the instrument takes 0.1 V to 5 V.\n\n"
       "ERROR -222\n\nData out of range."},
      {"FieldAmpl", "5", ""},
      // The delay is held within the clock group's period, 1 ns.
      {"FieldDelay", "1.5",
       "Group 1 \u203A Module 1 \u203A Port 2 \u00B7 Delay: 1.5 ns asked; the instrument takes 0 ns to 1 ns.\n\n"
       "ERROR -222\n\nData out of range."},
      {"FieldDelay", "1", ""},
  };
  for (const Case& c : cases) {
    mAlerts.clear();
    QenParEd* field = Field(editor, c.field);
    ASSERT_NE(field, nullptr) << c.field;
    field->Editor()->setFocus();
    QTest::keyClick(field->Editor(), Qt::Key_A, Qt::ControlModifier);
    QTest::keyClicks(field->Editor(), c.typed);
    QTest::keyClick(field->Editor(), Qt::Key_Return);
    QCoreApplication::processEvents();
    if (*c.alert == '\0') {
      EXPECT_TRUE(mAlerts.empty()) << c.field << " " << c.typed << ": " << (mAlerts.empty() ? "" : mAlerts[0]);
      continue;
    }
    ASSERT_EQ(mAlerts.size(), 1u) << c.field << " " << c.typed;
    EXPECT_EQ(std::string(mAlerts[0]), std::string(c.alert)) << c.field;
  }
  Other(":CGR1:MOD1:CONN2:VOLT:AMPL 1");
  Other(":CGR1:MOD1:CONN2:PULS:DEL 0");
}

// The instrument refuses the self test while it runs: the dialog says so and the button goes off.
TEST_F(MainWinTest, ARefusedSelfTestSaysWhyAndItsButtonIsOffWhileItCannotWork) {
  auto* window = Open<SelftestResultWin>("selftest.Result");
  auto* start = window->findChild<QPushButton*>(QStringLiteral("PButStart"));
  ASSERT_NE(start, nullptr);
  EXPECT_TRUE(start->isEnabled());
  // Started by another client, not yet seen by the poll.
  Other(":SGEN:GLOB:INIT:CONT ON");
  QTest::mouseClick(start, Qt::LeftButton);
  QCoreApplication::processEvents();
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_EQ(mAlerts[0], "Self test: the self test cannot start while the instrument runs.\n\nERROR -200\n\nExecution error.");
  EXPECT_FALSE(start->isEnabled());
  EXPECT_EQ(start->toolTip(), "The self test cannot start while the instrument runs.");
  Other(":SGEN:GLOB:INIT:CONT OFF");
  Poll();
  EXPECT_TRUE(start->isEnabled());
}

// What cannot work while another client holds the instrument is off; what only reads stays.
TEST_F(MainWinTest, ALockTurnsOffWhatWouldChangeTheInstrumentAndKeepsWhatOnlyReads) {
  auto* editor = Open<ParameditParamEdWin>("paramedit.ParamEd");
  Open<DtecmdCmdWin>("dtecmd.CmdWin");
  ASSERT_TRUE(editor->SelectPath(":CGR1:MOD1:CONN1"));
  QWidget* portPanel = editor->CurrentPanel();
  // Reads nothing to open, opened in the lock: still only what reads works in it.
  struct Expected {
    const char* text;  // without "&"
    bool locked;       // enabled while locked
  };
  const Expected commands[] = {
      {"New Setting", false},   {"Open Setting...", false},   {"Recent Settings", false},
      {"Save Setting", false},  {"Save Setting As...", false}, {"Export Setting...", false},
      {"Import Setting...", false}, {"Quit", true},
      {"\u25B6 Run", false},    {"\u25A0 Stop", false},        {"Sequence Force", false},
      {"Outputs On", false},    {"Outputs Off", false},       {"Check Trigger Mode", false},
      {"Self Test...", false},  {"Parameter Editor", true},   {"Segment Editor", false},
      {"Simple Sequence", false}, {"Loop Grid", false},       {"Sequence", false},
      {"System Scheme", true},  {"Command Window", true},     {"Error List", true},
      {"Bit Error Rate", true}, {"Error State", true},        {"Waveform", true},
      {"Measurement Mode", false}, {"Deskew", true},          {"Self Test", true},
      {"Next Window", true},    {"Previous Window", true},
      {"Cascade", true},        {"Tile", true},               {"User Guide", true},
      {"Keyboard Shortcuts", true}, {"About qengui", true},
  };
  auto find = [&](const char* text) -> QAction* {
    for (QAction* a : mWin->Commands()) {
      if (a->text().remove(QLatin1Char('&')) == QString::fromUtf8(text)) return a;
    }
    return nullptr;
  };
  const QList<QAction*> all = mWin->Commands();
  EXPECT_EQ(all.size(), static_cast<qsizetype>(std::size(commands))) << "a command without an expectation";
  for (const Expected& c : commands) {
    ASSERT_NE(find(c.text), nullptr) << c.text;
    EXPECT_TRUE(find(c.text)->isEnabled()) << c.text << " is off while the instrument is free";
  }
  // The toolbar holds the very actions of the menu.
  auto* bar = mWin->findChild<QToolBar*>(QStringLiteral("RunToolBar"));
  ASSERT_NE(bar, nullptr);
  EXPECT_EQ(bar->actions(), (QList<QAction*>{find("\u25B6 Run"), find("\u25A0 Stop"), find("Sequence Force")}));

  Control(":TEST:LOCK ON");
  // The first tick meets the lock; the next one's guard knows it.
  Poll();
  Poll();
  ASSERT_TRUE(mWin->IsShowingLock());
  for (const Expected& c : commands) EXPECT_EQ(find(c.text)->isEnabled(), c.locked) << c.text << " while locked";
  // The parameter tree still moves; the panel is read-only, and an item not read yet says so.
  EXPECT_TRUE(editor->isEnabled());
  EXPECT_TRUE(editor->Tree()->isEnabled());
  EXPECT_FALSE(portPanel->isEnabled());
  EXPECT_FALSE(mWin->FindWindow(QStringLiteral("dtecmd.CmdWin"))->isEnabled());
  ASSERT_TRUE(editor->SelectPath(":CGR2:MOD1:CONN1"));
  auto* unread = qobject_cast<QLabel*>(editor->ShownPage());
  ASSERT_NE(unread, nullptr);
  EXPECT_EQ(unread->text().toStdString(),
            "Another client holds the instrument: the values of Clock group 2 \u203A Module 1 (K2268B) \u203A Port 1 data out "
            "are read once it lets go.");
  EXPECT_EQ(editor->CurrentPanel(), portPanel) << "the panel stays with what it shows";
  EXPECT_EQ(Field(editor, "FieldAmpl")->GetDsName(), ":" + mHandle + ":CGR1:MOD1:CONN1:VOLT:AMPL");
  // A window that must read to open says why it does not.
  EXPECT_EQ(mWin->OpenWindow(QStringLiteral("smseqedit.Win")), nullptr);
  QCoreApplication::processEvents();
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_NE(mAlerts[0].find("\"Simple Sequence\" reads the instrument to open"), Dstring::npos) << mAlerts[0];
  mAlerts.clear();

  Control(":TEST:LOCK OFF");
  Poll();
  Poll();
  EXPECT_FALSE(mWin->IsShowingLock());
  for (const Expected& c : commands) EXPECT_TRUE(find(c.text)->isEnabled()) << c.text << " after the lock";
  EXPECT_TRUE(portPanel->isEnabled());
  EXPECT_TRUE(mWin->FindWindow(QStringLiteral("dtecmd.CmdWin"))->isEnabled());
  // The item chosen in the lock is read now.
  EXPECT_EQ(editor->ShownPage(), editor->CurrentPanel());
  EXPECT_EQ(Field(editor, "FieldAmpl")->GetDsName(), ":" + mHandle + ":CGR2:MOD1:CONN1:VOLT:AMPL");
  EXPECT_TRUE(mAlerts.empty());
}

// The self test cannot run while the instrument runs: its command is off then.
TEST_F(MainWinTest, TheSelfTestIsOffWhileTheInstrumentRuns) {
  QAction* selfTest = nullptr;
  for (QAction* a : mWin->Commands()) {
    if (a->text() == QStringLiteral("Self &Test...")) selfTest = a;
  }
  ASSERT_NE(selfTest, nullptr);
  EXPECT_TRUE(selfTest->isEnabled());
  Other(":SGEN:GLOB:INIT:CONT ON");
  Poll();
  EXPECT_FALSE(selfTest->isEnabled());
  EXPECT_EQ(selfTest->statusTip(), "The self test cannot start while the instrument runs.");
  Other(":SGEN:GLOB:INIT:CONT OFF");
  Poll();
  EXPECT_TRUE(selfTest->isEnabled());
}

// One poll after any start or stop, by this program or by another client, the status bar shows
// the state the instrument holds.
TEST_F(MainWinTest, TheStateShowsWhatTheInstrumentHoldsOnePollAfterAnyRunOrStop) {
  QAction* run = nullptr;
  QAction* stop = nullptr;
  for (QAction* a : mWin->Commands()) {
    if (a->shortcut() == QKeySequence(Qt::Key_F5)) run = a;
    if (a->shortcut() == QKeySequence(Qt::SHIFT | Qt::Key_F5)) stop = a;
  }
  ASSERT_TRUE(run != nullptr && stop != nullptr);
  struct Step {
    const char* what;
    std::function<void()> act;
    bool running;
  };
  const Step steps[] = {
      {"Run here", [&] { run->trigger(); }, true},
      {"Stop here", [&] { stop->trigger(); }, false},
      {"Run elsewhere", [&] { Other(":SGEN:GLOB:INIT:CONT ON"); }, true},
      {"Stop elsewhere", [&] { Other(":SGEN:GLOB:INIT:CONT OFF"); }, false},
      {"Run here, stop elsewhere", [&] { run->trigger(), Other(":SGEN:GLOB:INIT:CONT OFF"); }, false},
      {"Run elsewhere, stop here", [&] { Other(":SGEN:GLOB:INIT:CONT ON"), Poll(), stop->trigger(); }, false},
      {"Run here by the keyboard", [&] { QTest::keyClick(mWin.get(), Qt::Key_F5); }, true},
      {"Stop here by the keyboard", [&] { QTest::keyClick(mWin.get(), Qt::Key_F5, Qt::ShiftModifier); }, false},
  };
  auto* system = mWin->StatusBarView()->findChild<QLabel*>(QStringLiteral("StatusSystem"));
  auto* state = mWin->StatusBarView()->findChild<QLabel*>(QStringLiteral("StatusRun"));
  for (const Step& s : steps) {
    s.act();
    Poll();
    if (s.running) {
      // Synchronising for half a second after a start, then running: either, never "Programming".
      EXPECT_TRUE(system->text() == "System: Synchronising" || system->text() == "System: Running")
          << s.what << ": " << system->text().toStdString();
      EXPECT_TRUE(uiapp::GetSystemState() == kSysSync || uiapp::GetSystemState() == kSysRunning) << s.what;
      EXPECT_EQ(state->text().toStdString(), "\u25B6 Running") << s.what;
    } else {
      EXPECT_EQ(Other(":SGEN:GLOB:SYST:STAT?"), "PROG") << s.what;
      EXPECT_EQ(system->text().toStdString(), "System: Programming") << s.what;
      EXPECT_EQ(uiapp::GetSystemState(), kSysProg) << s.what;
      EXPECT_EQ(state->text().toStdString(), "\u25A0 Stopped") << s.what;
    }
  }
  EXPECT_TRUE(mAlerts.empty()) << (mAlerts.empty() ? "" : mAlerts[0]);
}

// The one help window, wherever it was opened from.
HelpWindow* ShownHelp() {
  for (QWidget* w : QApplication::topLevelWidgets()) {
    if (auto* help = qobject_cast<HelpWindow*>(w)) return help;
  }
  return nullptr;
}

// F1 opens the guide's page of the window that has the focus; in a modal dialog, the dialog's
// page, in a help window the dialog does not block.
TEST_F(MainWinTest, F1OpensTheGuidePageOfWhatHasTheFocus) {
  auto* cmd = Open<DtecmdCmdWin>("dtecmd.CmdWin");
  QTest::keyClick(cmd->Input(), Qt::Key_F1);
  HelpWindow* help = ShownHelp();
  ASSERT_NE(help, nullptr);
  ASSERT_TRUE(help->isVisible());
  EXPECT_EQ(help->Browser()->source().fileName().toStdString(), "dtecmd.CmdWin.md");
  QTimer::singleShot(0, [] {
    QWidget* dialog = QApplication::activeModalWidget();
    ASSERT_NE(dialog, nullptr);
    QTest::keyClick(dialog, Qt::Key_F1);
    HelpWindow* shown = ShownHelp();
    ASSERT_NE(shown, nullptr);
    EXPECT_EQ(shown->Browser()->source().fileName().toStdString(), "unitsdlg.UnitsDialog.md");
    EXPECT_EQ(shown->parentWidget(), dialog);
    static_cast<QDialog*>(dialog)->reject();
  });
  auto* editor = Open<ParameditParamEdWin>("paramedit.ParamEd");
  QTest::mouseClick(Field(editor, "FieldAmpl")->GetUnitLabel(), Qt::LeftButton);
  help = HelpWindow::Show("index", nullptr);
  EXPECT_EQ(help->Browser()->source().fileName().toStdString(), "index.md");
  help->close();
}

TEST_F(MainWinTest, CommandWindowShowsRepliesAndTheErrorListTheErrors) {
  auto* errors = Open<ErrorErrorWin>("error.ErrorWin");
  auto* cmd = Open<DtecmdCmdWin>("dtecmd.CmdWin");
  QTest::keyClicks(cmd->Input(), "::TRIG:MODE?");
  QTest::keyClick(cmd->Input(), Qt::Key_Return);
  EXPECT_TRUE(cmd->Transcript().contains("> ::TRIG:MODE?\nSEQ")) << cmd->Transcript().toStdString();
  QTest::keyClicks(cmd->Input(), "::NO:SUCH:HEADER 1");
  QTest::keyClick(cmd->Input(), Qt::Key_Return);
  EXPECT_TRUE(cmd->Transcript().contains("error -113")) << cmd->Transcript().toStdString();
  ASSERT_EQ(errors->Model()->rowCount(), 1);
  EXPECT_EQ(errors->Model()->index(0, ErrorJournalModel::kCode).data().toString(), "-113");
  EXPECT_EQ(errors->Model()->index(0, ErrorJournalModel::kCommand).data().toString().toStdString(),
            ":" + mHandle + ":NO:SUCH:HEADER 1");
  EXPECT_EQ(mWin->Area()->subWindowList(QMdiArea::StackingOrder).last()->widget(), errors)
      << "a new error raises the open list";
  EXPECT_EQ(mWin->Area()->activeSubWindow()->widget(), cmd) << "without taking the focus from the typing";
  // History: Up brings back the last line, Down the text begun.
  QTest::keyClicks(cmd->Input(), "::CGR");
  QTest::keyClick(cmd->Input(), Qt::Key_Up);
  EXPECT_EQ(cmd->Input()->text(), "::NO:SUCH:HEADER 1");
  QTest::keyClick(cmd->Input(), Qt::Key_Up);
  EXPECT_EQ(cmd->Input()->text(), "::TRIG:MODE?");
  QTest::keyClick(cmd->Input(), Qt::Key_Down);
  QTest::keyClick(cmd->Input(), Qt::Key_Down);
  EXPECT_EQ(cmd->Input()->text(), "::CGR");
}

TEST_F(MainWinTest, ALineThatWouldBreakTheLanguageIsRefusedAndListed) {
  auto* cmd = Open<DtecmdCmdWin>("dtecmd.CmdWin");
  const std::size_t sent = ErrorJournal::Entries().size();
  EXPECT_NE(cmd->RunLine(QStringLiteral("::TRIG:MODE SEQ\x01")), 0);
  EXPECT_TRUE(cmd->Transcript().contains("refused")) << cmd->Transcript().toStdString();
  EXPECT_EQ(ErrorJournal::Entries().size(), sent + 1);
  EXPECT_EQ(Other(":TRIG:MODE?"), "SEQ");
  // A ";" inside quotes is the user's business: it goes out as typed.
  cmd->RunScript(QStringLiteral("::TRIG:MODE CLOC\n\n::TRIG:MODE?"));
  EXPECT_TRUE(cmd->Transcript().endsWith("CLOC")) << cmd->Transcript().toStdString();
  Other(":TRIG:MODE SEQ");
  ConditionList list;
  EXPECT_NE(cmd->SaveTranscript(QStringLiteral("/nonexistent-dir/t.txt"), list), 0);
  EXPECT_FALSE(list.IsEmpty());
}

// A block's segment opens in the segment editor from the sequence; asking again raises that window.
TEST_F(MainWinTest, TheSequenceOpensItsSegmentsInTheSegmentEditor) {
  MakeSegment("Seq/Shown", 64, 8);
  auto* sequence = Open<SmseqeditWin>("smseqedit.Win");
  ASSERT_NE(sequence, nullptr);
  auto* button = sequence->findChild<QPushButton*>(QStringLiteral("PButOpenSegment"));
  QAbstractItemModel* blocks = sequence->Table()->model();
  sequence->Table()->setCurrentIndex(blocks->index(0, 2));
  EXPECT_FALSE(button->isEnabled());  // a word, PAUSE
  blocks->setData(blocks->index(0, 2), QStringLiteral("Seq/Shown"));
  sequence->Table()->setCurrentIndex(blocks->index(0, 3));
  sequence->Table()->setCurrentIndex(blocks->index(0, 2));
  ASSERT_TRUE(button->isEnabled());
  const qsizetype windows = mWin->Area()->subWindowList().size();
  QTest::mouseClick(button, Qt::LeftButton);
  auto* editor = qobject_cast<DataeditSegmentEditWin*>(mWin->Area()->activeSubWindow()->widget());
  ASSERT_NE(editor, nullptr);
  EXPECT_EQ(editor->Grid()->GetSegmentDs()->GetName(), Dstring("Seq/Shown"));
  QTest::mouseClick(button, Qt::LeftButton);
  EXPECT_EQ(mWin->Area()->subWindowList().size(), windows + 1);
  editor->close();
  QenSegmentPool::Delete("Seq/Shown", mList);
}
