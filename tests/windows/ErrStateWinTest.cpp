#include <gtest/gtest.h>

#include <QPushButton>
#include <QTest>
#include <memory>
#include <numeric>

#include "common/gui/GuiSimFixture.h"
#include "core/uiapp.h"
#include "data/BerSvr.h"
#include "data/RunStopDs.h"
#include "instrument/QenGuiInst.h"
#include "segments/ui/GridDisp.h"
#include "windows/errstate/ErrStateGridManager.h"
#include "windows/errstate/ErrstateErrStateWin.h"

namespace {

// The error state window against qensim running with errors injected on one port.
class ErrStateWinTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    Poll();
    mWin = std::make_unique<ErrstateErrStateWin>();
    ASSERT_EQ(mWin->Load(mList), 0) << mList.ToText();
    mWin->resize(900, 420);
    mWin->show();
    ASSERT_FALSE(Results().empty());
    mPort = Results()[0].port;
  }
  void TearDown() override {
    Other(":SGEN:GLOB:INIT:CONT OFF");
    if (!mPort.empty()) Other(mPort + ":INJ 0");
    mWin.reset();
    GuiSimFixture::TearDown();
  }
  const std::vector<BerSvr::PortResult>& Results() const { return mWin->Grid()->GetResults(); }
  void RunUntilErrors() {
    Other(mPort + ":INJ 1E-2");
    Other(":SGEN:GLOB:INIT:CONT ON");
    for (int i = 0; i < 2000 && (Results().empty() || Results()[0].errors == 0); ++i) Poll();
    ASSERT_GT(Results()[0].errors, 0u);
  }

  std::unique_ptr<ErrstateErrStateWin> mWin;
  Dstring mPort;
};

}  // namespace

TEST_F(ErrStateWinTest, ChannelsAddUpToThePortsErrorsAndResetClearsThem) {
  ASSERT_EQ(Results().size(), uiapp::GetBerSvr()->GetResults().size());
  // Read at opening, before any run: every port has its channels, none in error.
  for (const BerSvr::PortResult& port : Results()) {
    ASSERT_FALSE(port.channels.empty()) << port.port;
    EXPECT_EQ(std::accumulate(port.channels.begin(), port.channels.end(), 0ull), 0u);
  }
  RunUntilErrors();
  Other(":SGEN:GLOB:INIT:CONT OFF");
  // The poll reads only while running; told of the stop, the window reads the final counts.
  for (int i = 0; i < 50 && uiapp::GetRunStopDs()->IsRunning(); ++i) Poll();
  ASSERT_FALSE(uiapp::GetRunStopDs()->IsRunning());
  const BerSvr::PortResult& first = Results()[0];
  EXPECT_EQ(std::accumulate(first.channels.begin(), first.channels.end(), 0ull), first.errors);
  // The server agrees with what the grid shows.
  const Dstring served = Other(mPort + ":CHAN?");
  Dstring shown;
  for (unsigned long long count : first.channels) shown += (shown.empty() ? "" : ",") + std::to_string(count);
  EXPECT_EQ(served, shown);
  const GridDisp* channels = mWin->Grid()->findChild<GridDisp*>(QStringLiteral("channels"));
  ASSERT_NE(channels, nullptr);
  EXPECT_EQ(mWin->Grid()->DispCell(*channels, 0, 0).marked, first.channels[0] > 0);
  EXPECT_EQ(mWin->Grid()->DispCell(*channels, 0, 0).text, ErrStateGridManager::CountText(first.channels[0]));

  QTest::mouseClick(mWin->findChild<QPushButton*>(QStringLiteral("PButReset")), Qt::LeftButton);
  for (const BerSvr::PortResult& port : Results()) {
    EXPECT_EQ(port.errors, 0u);
    EXPECT_EQ(std::accumulate(port.channels.begin(), port.channels.end(), 0ull), 0u) << port.port;
  }
  EXPECT_FALSE(mWin->Grid()->DispCell(*channels, 0, 0).marked);
}

TEST_F(ErrStateWinTest, KeysMoveTheCursorOverPortsAndChannels) {
  ErrStateGridManager* grid = mWin->Grid();
  grid->setFocus();
  const long lastChannel = static_cast<long>(Results()[0].channels.size()) - 1;
  QTest::keyClick(grid, Qt::Key_End);
  EXPECT_EQ(grid->CursorChannel(), lastChannel);
  QTest::keyClick(grid, Qt::Key_Right);
  EXPECT_EQ(grid->CursorChannel(), lastChannel);
  QTest::keyClick(grid, Qt::Key_Home);
  QTest::keyClick(grid, Qt::Key_Down);
  EXPECT_EQ(grid->CursorLine(), 1);
  EXPECT_EQ(grid->CursorChannel(), 0);
  QTest::keyClick(grid, Qt::Key_PageDown);
  EXPECT_EQ(grid->CursorLine(), static_cast<long>(Results().size()) - 1);
  QTest::keyClick(grid, Qt::Key_Up);
  EXPECT_EQ(grid->CursorText().toStdString().rfind("Group ", 0), 0u);
  EXPECT_NE(grid->CursorText().toStdString().find(", channel 0: 0 errors"), std::string::npos) << grid->CursorText().toStdString();
}

TEST_F(ErrStateWinTest, AChannelReplyThatCannotBeReadKeepsTheLastCounts) {
  RunUntilErrors();
  Other(":SGEN:GLOB:INIT:CONT OFF");
  Poll();
  const std::vector<BerSvr::PortResult> before = Results();
  for (const char* form : {"1,x", "-3", "1.5", ""}) {
    Dstring reply;
    ASSERT_EQ(QenGuiInst::Call(":TEST:MALF \"" + mPort + ":CHAN?\",\"" + form + "\"", reply, mList), 0);
    ConditionList list;
    EXPECT_NE(uiapp::GetBerSvr()->UpdateFromFW(BerSvr::kReadResults, list), 0) << form;
    EXPECT_NE(list.ToText().find(":CHAN?"), std::string::npos) << list.ToText();
    EXPECT_EQ(Results(), before) << form;
  }
}
