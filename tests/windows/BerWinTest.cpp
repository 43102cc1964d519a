#include <gtest/gtest.h>

#include <QChart>
#include <QLineSeries>
#include <QPushButton>
#include <QRegularExpression>
#include <QValueAxis>
#include <QTableView>
#include <QTest>
#include <cstdio>
#include <fstream>
#include <memory>
#include <sstream>

#include "common/gui/GuiSimFixture.h"
#include "core/uiapp.h"
#include "data/BerSvr.h"
#include "data/RunStopDs.h"
#include "support/NumberText.h"
#include "windows/StateStatusBar.h"
#include "windows/ber/BerBerWin.h"
#include "windows/ber/BerTableModel.h"

namespace {

// The bit error rate window against qensim running with errors injected on one port.
class BerWinTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    Poll();
    mWin = std::make_unique<BerBerWin>();
    ASSERT_EQ(mWin->Load(mList), 0) << mList.ToText();
    mWin->show();
    ASSERT_FALSE(uiapp::GetBerSvr()->GetResults().empty());
    mPort = uiapp::GetBerSvr()->GetResults()[0].port;
  }
  void TearDown() override {
    Other(":SGEN:GLOB:INIT:CONT OFF");
    if (!mPort.empty()) Other(mPort + ":INJ 0");
    mWin.reset();
    GuiSimFixture::TearDown();
  }
  // Polls until the first port has counted errors; the server's clock is real, so this takes
  // as many polls as a few milliseconds need.
  void PollUntilErrors() {
    for (int i = 0; i < 2000 && ErrorsOfFirst() == 0; ++i) Poll();
    ASSERT_GT(ErrorsOfFirst(), 0u);
  }
  unsigned long long ErrorsOfFirst() const { return uiapp::GetBerSvr()->GetResults()[0].errors; }
  std::string Cell(int row, int column) const { return mWin->Model()->index(row, column).data().toString().toStdString(); }
  static std::string FileText(const std::string& path) {
    std::ifstream in(path);
    std::stringstream text;
    text << in.rdbuf();
    return text.str();
  }

  std::unique_ptr<BerBerWin> mWin;
  Dstring mPort;
};

}  // namespace

TEST_F(BerWinTest, TableAndChartFollowTheRunAndResetStartsAfresh) {
  const int ports = static_cast<int>(uiapp::GetBerSvr()->GetResults().size());
  EXPECT_EQ(mWin->Model()->rowCount(), ports);
  EXPECT_EQ(Cell(0, 3), "–");  // nothing compared yet
  Other(mPort + ":INJ 1E-2");
  Other(":SGEN:GLOB:INIT:CONT ON");
  PollUntilErrors();
  // The injected port's ratio is shown as the server counts it; the chart has a line per port.
  EXPECT_NEAR(std::stod(Cell(0, 3)), 1e-2, 2e-3) << Cell(0, 3);
  ASSERT_EQ(mWin->Chart()->series().size(), ports);
  auto* line = static_cast<QLineSeries*>(mWin->Chart()->series()[0]);
  ASSERT_GE(line->count(), 1);
  EXPECT_NEAR(line->at(line->count() - 1).y(), 1e-2, 2e-3);

  // Stopped, the counts stand still; reset starts them at nothing.
  Other(":SGEN:GLOB:INIT:CONT OFF");
  Poll();
  ASSERT_GT(uiapp::GetBerSvr()->GetResults()[0].compared, 0u);
  QTest::mouseClick(mWin->findChild<QPushButton*>(QStringLiteral("PButReset")), Qt::LeftButton);
  EXPECT_EQ(uiapp::GetBerSvr()->GetResults()[0].compared, 0u);
  EXPECT_EQ(Cell(0, 1), "0");
  EXPECT_EQ(Cell(0, 3), "–");
  EXPECT_LE(mWin->History().Samples().size(), 1u);
}

TEST_F(BerWinTest, ExportsTheTableAndTheHistoryAndNamesAPathItCannotWrite) {
  Other(mPort + ":INJ 1E-2");
  Other(":SGEN:GLOB:INIT:CONT ON");
  PollUntilErrors();
  const std::string table = testing::TempDir() + "ber-table.csv";
  const std::string history = testing::TempDir() + "ber-history.csv";
  ASSERT_EQ(mWin->ExportTable(table, mList), 0) << mList.ToText();
  ASSERT_EQ(mWin->ExportHistory(history, mList), 0) << mList.ToText();
  const std::string tableText = FileText(table);
  EXPECT_EQ(tableText.rfind("port,compared,errors,ratio\n" + mPort + ",", 0), 0u) << tableText;
  EXPECT_EQ(static_cast<std::size_t>(std::count(tableText.begin(), tableText.end(), '\n')),
            uiapp::GetBerSvr()->GetResults().size() + 1);
  const std::string historyText = FileText(history);
  EXPECT_EQ(historyText.rfind("seconds," + mPort, 0), 0u) << historyText;
  EXPECT_EQ(static_cast<std::size_t>(std::count(historyText.begin(), historyText.end(), '\n')),
            mWin->History().Samples().size() + 1);
  std::remove(table.c_str());
  std::remove(history.c_str());

  ConditionList refused;
  EXPECT_NE(mWin->ExportTable("/nonexistent-dir/ber.csv", refused), 0);
  EXPECT_NE(refused.ToText().find("/nonexistent-dir/ber.csv"), std::string::npos) << refused.ToText();
}

// A ratio and a count read the same in the table and in the status bar: "1.00E-02", "12 345".
TEST_F(BerWinTest, TheTableAndTheStatusBarWriteRatiosAndCountsInOneForm) {
  StateStatusBar bar;
  bar.Attach();
  Other(mPort + ":INJ 1E-2");
  Other(":SGEN:GLOB:INIT:CONT ON");
  // The counts an earlier run left are there from the start: wait for this run to be seen.
  for (int i = 0; i < 200 && !uiapp::GetRunStopDs()->IsRunning(); ++i) Poll();
  PollUntilErrors();
  bar.ShowState();
  unsigned long long compared = 0;
  unsigned long long errors = 0;
  for (const BerSvr::PortResult& r : uiapp::GetBerSvr()->GetResults()) {
    compared += r.compared;
    errors += r.errors;
  }
  const BerSvr::PortResult& first = uiapp::GetBerSvr()->GetResults()[0];
  const QRegularExpression ratio(QStringLiteral("^\\d\\.\\d\\dE-\\d\\d$"));
  EXPECT_TRUE(ratio.match(QString::fromStdString(Cell(0, 3))).hasMatch()) << Cell(0, 3);
  EXPECT_EQ(Cell(0, 3), NumberText::Ratio(first.errors, first.compared));
  EXPECT_EQ(Cell(0, 2), NumberText::Grouped(first.errors));
  const QString summary = QStringLiteral("BER %1 (%2 errors)")
                              .arg(QString::fromStdString(NumberText::Ratio(errors, compared)),
                                   QString::fromStdString(NumberText::Grouped(errors)));
  EXPECT_TRUE(ratio.match(QString::fromStdString(NumberText::Ratio(errors, compared))).hasMatch());
  EXPECT_TRUE(bar.Text().contains(summary)) << bar.Text().toStdString() << " lacks " << summary.toStdString();
}

// A program started after a run shows the counts the run left, not nothing: the service reads
// them when it is set up, as the host does at start.
TEST_F(BerWinTest, ANewlyStartedProgramShowsTheCountsARunLeft) {
  Other(mPort + ":INJ 1E-2");
  Other(":SGEN:GLOB:INIT:CONT ON");
  for (int i = 0; i < 2000 && Other(mPort + "?").find(",0,") != std::string::npos; ++i) {
  }
  Other(":SGEN:GLOB:INIT:CONT OFF");
  const Dstring counts = Other(mPort + "?");
  const std::size_t comma = counts.find(',');
  const unsigned long long compared = std::stoull(counts.substr(0, comma));
  const unsigned long long errors = std::stoull(counts.substr(comma + 1));
  ASSERT_GT(errors, 0u) << counts;

  mWin.reset();
  uiapp::GetBerSvr()->End();
  ASSERT_EQ(uiapp::GetBerSvr()->Init(mList), 0) << mList.ToText();
  Poll();
  mWin = std::make_unique<BerBerWin>();
  ASSERT_EQ(mWin->Load(mList), 0) << mList.ToText();
  EXPECT_EQ(Cell(0, 1), NumberText::Grouped(compared));
  EXPECT_EQ(Cell(0, 2), NumberText::Grouped(errors));
  EXPECT_NEAR(std::stod(Cell(0, 3)), 1e-2, 2e-3) << Cell(0, 3);
}

// The counts are the instrument's since its run started; the chart begins when the window saw
// them first, and says when and why.
TEST_F(BerWinTest, TheChartSaysFromWhenItCounts) {
  auto since = [](const BerBerWin& win, const char* why) {
    const QRegularExpression title(QStringLiteral("^Bit error rate since (\\d\\d:\\d\\d:\\d\\d), %1$").arg(QLatin1String(why)));
    const QRegularExpressionMatch match = title.match(win.Chart()->title());
    if (!match.hasMatch()) return "no match: " + win.Chart()->title().toStdString();
    const QString axis = win.Chart()->axes(Qt::Horizontal).first()->titleText();
    return axis == QStringLiteral("Seconds since ") + match.captured(1) ? std::string("ok") : "axis: " + axis.toStdString();
  };
  EXPECT_EQ(since(*mWin, "when this window opened"), "ok");
  Other(mPort + ":INJ 1E-2");
  Other(":SGEN:GLOB:INIT:CONT ON");
  Poll();
  EXPECT_EQ(since(*mWin, "when the run started"), "ok");
  PollUntilErrors();
  EXPECT_EQ(mWin->History().Samples().front().seconds, 0.0);

  // Opened in the middle of the run, the table has the whole run and the chart says it began later.
  BerBerWin late;
  ASSERT_EQ(late.Load(mList), 0) << mList.ToText();
  EXPECT_EQ(since(late, "when this window opened"), "ok");
  EXPECT_EQ(late.Model()->index(0, 2).data(), mWin->Model()->index(0, 2).data());
  EXPECT_EQ(late.History().Samples().size(), 1u);

  QTest::mouseClick(mWin->findChild<QPushButton*>(QStringLiteral("PButReset")), Qt::LeftButton);
  EXPECT_EQ(since(*mWin, "when the counts were reset"), "ok");
  EXPECT_EQ(since(late, "when this window opened"), "ok");
}
