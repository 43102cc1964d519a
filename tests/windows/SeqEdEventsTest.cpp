#include <gtest/gtest.h>

#include <unistd.h>

#include <QCoreApplication>
#include <QTableWidget>
#include <filesystem>
#include <fstream>
#include <memory>

#include "common/gui/GuiSimFixture.h"
#include "windows/seqedit/SeqeditSeqEdWin.h"

namespace {

const Dstring kEmpty = "(\"\",0,())";

Dstring Events(const Dstring& first) {
  Dstring text = "(3.0," + first;
  for (int i = 1; i < 10; ++i) text += "," + kEmpty;
  return text + ")";
}

// The sequence editor against a qensim whose rack has a central module, so the sequencer has
// its ten events.
class SeqEdEventsTest : public GuiSimFixture {
 protected:
  static void SetUpTestSuite() {
    GuiSimFixture::SetUpTestSuite();
    sPlain = sSim;
    sConfig = (std::filesystem::temp_directory_path() / ("qengui-central-" + std::to_string(::getpid()) + ".qsc")).string();
    std::ifstream in(std::string(QEN_SOURCE_DIR) + "/sim/config/default.qsc");
    std::ofstream out(sConfig);
    out << in.rdbuf() << "\nparam :CENT:TYPE string \"K2200A\" readonly\n";
    out.close();
    sSim = new SimProcess({"--test-control", "--data-dir", sDataDir, "--config", sConfig});
  }
  static void TearDownTestSuite() {
    delete sSim;
    sSim = sPlain;
    std::filesystem::remove(sConfig.c_str());
    GuiSimFixture::TearDownTestSuite();
  }
  void SetUp() override {
    GuiSimFixture::SetUp();
    Other(":SGEN:GLOB:SEQ:EVEN " + Events(kEmpty));
    Poll();
    mWin = std::make_unique<SeqeditSeqEdWin>();
    ASSERT_EQ(mWin->Load(mList), 0) << mList.ToText();
    mWin->show();
  }
  void TearDown() override {
    mWin.reset();
    GuiSimFixture::TearDown();
  }
  void Type(int row, int column, const QString& text) {
    mWin->EventTable()->item(row, column)->setText(text);
    QCoreApplication::processEvents();
  }

  static inline SimProcess* sPlain = nullptr;
  static inline std::string sConfig;
  std::unique_ptr<SeqeditSeqEdWin> mWin;
};

}  // namespace

// An event's name and number typed in the table reach the instrument; a number that is none is
// refused and the table shows what the instrument holds; another client's events show in the poll.
TEST_F(SeqEdEventsTest, EventsAreEditedAndFollowed) {
  ASSERT_EQ(mWin->EventTable()->rowCount(), 10);
  ASSERT_TRUE(mWin->EventTable()->isVisibleTo(mWin.get()));
  Type(0, 0, QStringLiteral("Arm"));
  Type(0, 1, QStringLiteral("3"));
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
  EXPECT_EQ(Other(":SGEN:GLOB:SEQ:EVEN?"), Events("(\"Arm\",3,())"));

  Type(0, 1, QStringLiteral("three"));
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_NE(mAlerts[0].find("no event number"), std::string::npos) << mAlerts[0];
  EXPECT_EQ(mWin->EventTable()->item(0, 1)->text(), QStringLiteral("3"));
  EXPECT_EQ(Other(":SGEN:GLOB:SEQ:EVEN?"), Events("(\"Arm\",3,())"));

  Other(":SGEN:GLOB:SEQ:EVEN " + Events("(\"Halt\",7,(('ERR','','',HALT)))"));
  for (int i = 0; i < 20 && mWin->EventTable()->item(0, 0)->text() != QStringLiteral("Halt"); ++i) Poll();
  EXPECT_EQ(mWin->EventTable()->item(0, 0)->text(), QStringLiteral("Halt"));
  EXPECT_EQ(mWin->EventTable()->item(0, 2)->text(), QStringLiteral("('ERR','','',HALT)"));
}
