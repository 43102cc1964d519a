// File › Export Setting… and Import Setting…, and the sequence editors' Export Sequence… and
// Import Sequence…, driven from the windows against qensim: the file chosen through the hook,
// the cable-delay question answered through the toolkit, every refusal shown in words.
#include <gtest/gtest.h>

#include <QApplication>
#include <QDir>
#include <QMenu>
#include <QMenuBar>
#include <QPainter>
#include <QPushButton>
#include <QStatusBar>
#include <QTableWidget>
#include <filesystem>
#include <fstream>
#include <memory>
#include <sstream>
#include <unistd.h>

#include "common/gui/GuiSimFixture.h"
#include "windows/common/FileChoice.h"
#include "windows/MainWin.h"
#include "windows/smseqedit/SequenceBlockModel.h"
#include "windows/smseqedit/SmseqeditWin.h"

namespace {

std::string Slurp(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  std::stringstream text;
  text << in.rdbuf();
  return text.str();
}

// The text of a block reply.
std::string Unblocked(const std::string& reply) { return reply.substr(2 + static_cast<std::size_t>(reply[1] - '0')); }

class SettingFileWinTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    Other(":MMEM:SETT:NEW");
    mDir = (std::filesystem::temp_directory_path() / ("qengui-filewin-" + std::to_string(::getpid()))).string();
    std::filesystem::create_directories(mDir);
    mPath = mDir + "/bench.qset";
    FileChoice::SetHook([this](FileChoice::Mode, const QString& title) {
      mTitles << title;
      return QString::fromStdString(mPath);
    });
    mWin = ShowMainWin();
    Poll();
  }
  void TearDown() override {
    mWin.reset();
    FileChoice::SetHook({});
    std::filesystem::remove_all(mDir);
    GuiSimFixture::TearDown();
  }
  QMenu* FileMenu() const {
    for (QAction* action : mWin->menuBar()->actions()) {
      if (action->text() == QStringLiteral("&File")) return action->menu();
    }
    return nullptr;
  }
  static void Trigger(QMenu* menu, const char* text) {
    for (QAction* action : menu->actions()) {
      if (action->text() == QLatin1String(text)) {
        action->trigger();
        QCoreApplication::processEvents();
        return;
      }
    }
    ADD_FAILURE() << "no entry " << text;
  }
  std::string Setting() { return Unblocked(Other(":MMEM:SETT:DATA?")); }
  std::string Alerts() const {
    std::string all;
    for (const Dstring& alert : mAlerts) all += alert + "\n";
    return all;
  }

  std::string mDir;
  std::string mPath;
  QStringList mTitles;
  std::unique_ptr<MainWin> mWin;
};

}  // namespace

TEST_F(SettingFileWinTest, ExportThenImportPutsTheWholeSettingBack) {
  Other(":CGR1:MOD1:CONN1:VOLT:AMPL 1.511");
  Other(":MEAS:MODE BER");
  Other(":CGR1:MOD1:CONN1:PULS:DEL 1.5E-10");
  Other(":CONF:PROF \"OPENSETTING_NAME\",\"bench\"");
  const std::string held = Setting();
  Trigger(FileMenu(), "&Export Setting...");
  EXPECT_EQ(mTitles, QStringList{QStringLiteral("Export Setting")});
  EXPECT_EQ(Slurp(mPath), held);
  EXPECT_EQ(mWin->statusBar()->currentMessage(), QString::fromStdString("The setting was exported to " + mPath + "."));

  Other(":MMEM:SETT:NEW");
  Other(":CGR1:MOD1:CONN1:PULS:DEL 9E-11");
  mToolkit.QueueAnswer(ToolkitPort::kNo);  // keep this instrument's delays
  Trigger(FileMenu(), "&Import Setting...");
  EXPECT_TRUE(mAlerts.empty()) << Alerts();
  EXPECT_EQ(Other(":CGR1:MOD1:CONN1:VOLT:AMPL?"), "1.511000000000E+00");
  EXPECT_EQ(Other(":MEAS:MODE?"), "BER");
  EXPECT_EQ(Other(":CGR1:MOD1:CONN1:PULS:DEL?"), "9.000000000000E-11");
  EXPECT_TRUE(mWin->windowTitle().startsWith(QStringLiteral("UNTITLED"))) << mWin->windowTitle().toStdString();

  mToolkit.QueueAnswer(ToolkitPort::kYes);  // take the file's delays
  Trigger(FileMenu(), "&Import Setting...");
  EXPECT_EQ(Setting(), held) << "every value as exported";
}

TEST_F(SettingFileWinTest, ALockLeavesTheFileAndTheInstrumentAsTheyWereAndSaysSo) {
  std::ofstream(mPath) << "the user's own\n";
  Other(":CGR1:MOD1:CONN1:VOLT:AMPL 2");
  const std::string held = Setting();
  Control(":TEST:LOCK ON");
  Trigger(FileMenu(), "&Export Setting...");
  EXPECT_NE(Alerts().find("Another client holds the instrument."), std::string::npos) << Alerts();
  EXPECT_NE(Alerts().find("The setting was not exported: the file " + mPath + " is as it was."), std::string::npos)
      << Alerts();
  EXPECT_EQ(Slurp(mPath), "the user's own\n");

  std::ofstream(mPath) << held;
  mAlerts.clear();
  mToolkit.QueueAnswer(ToolkitPort::kYes);
  Trigger(FileMenu(), "&Import Setting...");
  EXPECT_NE(Alerts().find("The setting of " + mPath + " was not imported: the instrument holds what it held before."),
            std::string::npos)
      << Alerts();
  Control(":TEST:LOCK OFF");
  EXPECT_EQ(Setting(), held);
}

TEST_F(SettingFileWinTest, AFileWithAWrongLineIsRefusedNamingItAndNothingChanges) {
  Other(":CGR1:MOD1:CONN1:VOLT:AMPL 2");
  const std::string held = Setting();
  std::ofstream(mPath) << "qen setting 1\nvalue :CGR1:PER 2e-09\nvalue :CGR1:FREQ\nend\n";
  mToolkit.QueueAnswer(ToolkitPort::kYes);
  Trigger(FileMenu(), "&Import Setting...");
  EXPECT_NE(Alerts().find("Line 3 of " + mPath + " cannot be read: the value \"\" of :CGR1:FREQ is not one number"), std::string::npos)
      << Alerts();
  EXPECT_EQ(Setting(), held);
}

TEST_F(SettingFileWinTest, ACancelDoesNothing) {
  const std::string held = Setting();
  std::ofstream(mPath) << "qen setting 1\nsequence (3.0,,)\nend\n";
  mToolkit.QueueAnswer(ToolkitPort::kCancel);
  Trigger(FileMenu(), "&Import Setting...");
  mPath.clear();
  Trigger(FileMenu(), "&Export Setting...");
  EXPECT_TRUE(mAlerts.empty()) << Alerts();
  EXPECT_EQ(Setting(), held);
}

class SequenceFileWin : public SettingFileWinTest, public testing::WithParamInterface<const char*> {};

// One implementation behind the button of each editor.
TEST_P(SequenceFileWin, ExportsAndImportsTheSequence) {
  const Dstring initial = Other(":SGEN:GLOB:SEQ?");
  const std::string block = initial.substr(initial.find("(BLOCK"), initial.size() - initial.find("(BLOCK") - 1);
  const std::string two = "(3.0,\"go\",(SEQ," + block + ",\"b2\"," + block + "))";
  Other(":SGEN:GLOB:SEQ " + two);
  Poll();
  QWidget* editor = mWin->OpenWindow(QString::fromLatin1(GetParam()));
  ASSERT_NE(editor, nullptr) << Alerts();
  auto* button = editor->findChild<QPushButton*>(QStringLiteral("PButSequenceFile"));
  ASSERT_NE(button, nullptr);
  ASSERT_NE(button->menu(), nullptr);
  mPath = mDir + "/two.qseq";
  Trigger(button->menu(), "&Export Sequence...");
  EXPECT_EQ(Slurp(mPath), Unblocked(Other(":SGEN:GLOB:SEQ:DATA?")));

  Other(":SGEN:GLOB:SEQ " + initial);
  Trigger(button->menu(), "&Import Sequence...");
  EXPECT_TRUE(mAlerts.empty()) << Alerts();
  EXPECT_EQ(Other(":SGEN:GLOB:SEQ?"), two);
  if (auto* simple = qobject_cast<SmseqeditWin*>(editor)) {
    EXPECT_EQ(simple->Model()->rowCount(), 2) << "the editor shows what was imported";
  }

  std::ofstream(mPath) << "qen sequence 1\nsequence (3.0,,)\nevents (3.0)\nend\n";
  Trigger(button->menu(), "&Import Sequence...");
  QCoreApplication::processEvents();
  EXPECT_NE(Alerts().find("Line 3 of " + mPath + " cannot be read: this instrument has no central module"), std::string::npos)
      << Alerts();
  EXPECT_EQ(Other(":SGEN:GLOB:SEQ?"), two);
}

INSTANTIATE_TEST_SUITE_P(Editors, SequenceFileWin,
                         testing::Values("smseqedit.Win", "LoopGridEdit.Win", "seqedit.SeqEdWin"),
                         [](const testing::TestParamInfo<const char*>& info) {
                           return std::string(info.param).substr(0, std::string(info.param).find('.'));
                         });

// The File menu as it opens, over the window (QEN_SCREENSHOT_DIR names the folder).
TEST_F(SettingFileWinTest, Screenshot) {
  mWin->resize(900, 520);
  QMenu* menu = FileMenu();
  const QPoint at = mWin->menuBar()->actionGeometry(mWin->menuBar()->actions().first()).bottomLeft();
  menu->popup(mWin->mapToGlobal(at));
  QCoreApplication::processEvents();
  QPixmap picture = mWin->grab();
  {
    QPainter painter(&picture);
    painter.drawPixmap(mWin->mapFromGlobal(menu->pos()), menu->grab());
  }
  menu->hide();
  EXPECT_FALSE(picture.isNull());
  const QByteArray dir = qgetenv("QEN_SCREENSHOT_DIR");
  if (!dir.isEmpty()) {
    EXPECT_TRUE(picture.save(QDir(QString::fromLocal8Bit(dir)).filePath("file-menu.png")));
  }
}
