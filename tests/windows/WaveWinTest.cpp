#include <gtest/gtest.h>

#include <QCoreApplication>
#include <QPushButton>
#include <QTest>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <map>
#include <memory>
#include <sstream>

#include <QSpinBox>

#include "capture/ui/WaveView.h"
#include "common/SigrokCli.h"
#include "common/gui/GuiSimFixture.h"
#include "instrument/QenGuiInst.h"
#include "windows/common/TaskFollower.h"
#include "windows/wavewin/WavewinWaveWin.h"

namespace {

constexpr long kDepth = 4096;
constexpr const char* kPort = ":CGR1:MOD3:CONN1";

// The waveform window against qensim: the first generator plays "W" (4 traces counting 0 … 15),
// which the first analyser receives with errors injected.
class WaveWinTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    const Dstring n = Other(":EDIT:SEGM:OPEN? \"W\"");
    const Dstring segm = ":EDIT:SEGM" + n + ":PATT:";
    if (Other(segm + "WIDT?") == "0") {
      Other(segm + "MOD:INS 0,TRAC,BEF,4");
      Other(segm + "MOD:INS 0,VECT,BEF,16");
      std::string rows;
      for (int t = 0; t < 4; ++t) {
        unsigned bits = 0;
        for (int v = 0; v < 16; ++v) bits |= ((v >> t) & 1u) << (15 - v);
        rows += static_cast<char>(bits >> 8);
        rows += static_cast<char>(bits & 0xFF);
      }
      Other(segm + "DATA 0,0,3,15,#500008" + rows);
    }
    std::string block = "(BLOCK,0,64,0,\"\",SYNC,\"W\",0,0";
    for (int port = 1; port < 10; ++port) block += ",PAUSE,0,0";
    Other(":SGEN:GLOB:SEQ (3.0,\"\"," + block + "))");
    Other(":MEAS:CAPT:DEPT " + std::to_string(kDepth));
    Other(std::string(kPort) + ":BER:INJ 1E-3");
    Other(":CAPT:PACE 0");
    Other(":SGEN:GLOB:INIT:CONT ON");
    Poll();
    mWin = std::make_unique<WavewinWaveWin>();
    ASSERT_EQ(mWin->Load(mList), 0) << mList.ToText();
    mWin->resize(1200, 600);
    mWin->show();
  }
  void TearDown() override {
    Other(":CAPT:ABOR");
    Other(":CAPT:PACE 250");
    Other(std::string(kPort) + ":BER:INJ 0");
    Other(":SGEN:GLOB:INIT:CONT OFF");
    mWin.reset();
    GuiSimFixture::TearDown();
  }
  void Click(const char* name) { QTest::mouseClick(mWin->findChild<QPushButton*>(QString::fromLatin1(name)), Qt::LeftButton); }
  // A block the instrument sends about the capture, without its header.
  std::string Block(const char* what) {
    const Dstring reply = Other(std::string(kPort) + ":CAPT:" + what + "? 0," + std::to_string(kDepth));
    return reply.substr(7);
  }
  static bool BitAt(const std::string& block, long trace, long vector) {
    return (static_cast<unsigned char>(block[static_cast<std::size_t>(trace * kDepth / 8 + vector / 8)]) >> (7 - vector % 8)) & 1;
  }

  std::unique_ptr<WavewinWaveWin> mWin;
};

// The values of every wire of a VCD at each vector (time / 1000 ps), the header aside.
std::map<std::string, std::vector<char>> ReadVcd(const std::string& path, long vectors) {
  std::ifstream in(path);
  std::map<std::string, std::string> names;  // id -> name
  std::map<std::string, std::vector<char>> values;
  std::map<std::string, char> now;
  std::string line;
  long time = 0;
  auto record = [&](long until) {
    for (long v = time / 1000; v < until && v < vectors; ++v) {
      for (auto& [id, value] : now) values[names[id]].push_back(value);
    }
  };
  while (std::getline(in, line)) {
    std::istringstream words(line);
    std::string first;
    words >> first;
    if (first == "$var") {
      std::string kind, size, id, name;
      words >> kind >> size >> id >> name;
      names[id] = name;
    } else if (!line.empty() && line[0] == '#') {
      const long next = std::stol(line.substr(1));
      record(next / 1000);
      time = next;
    } else if (!line.empty() && (line[0] == '0' || line[0] == '1')) {
      now[line.substr(1)] = line[0];
    }
  }
  return values;
}

}  // namespace

TEST_F(WaveWinTest, ACaptureShowsWhatWasSentWithItsErrorsMarked) {
  Click("PButCapture");
  const CaptureData& data = mWin->Data();
  ASSERT_EQ(data.GetLength(), kDepth) << mWin->StateText().toStdString();
  ASSERT_EQ(data.GetWidth(), 4);
  long errorVectors = 0;
  for (long v = 0; v < kDepth; ++v) {
    for (long t = 0; t < 4; ++t) ASSERT_EQ(data.Bit(t, v) != data.IsError(t, v), ((v % 16) >> t) & 1) << t << "," << v;
    errorVectors += data.HasError(v, v + 1);
  }
  EXPECT_GT(errorVectors, 3);
  EXPECT_EQ(data.ErrorVectors(), errorVectors);

  // N puts cursor A on the first error vector, which the instrument says is one.
  WaveView* view = mWin->View();
  view->setFocus();
  QTest::keyClick(view, Qt::Key_N);
  const long first = view->GetCursor(0);
  const std::string errors = Block("ERR");
  bool marked = false;
  for (long t = 0; t < 4; ++t) marked = marked || BitAt(errors, t, first);
  EXPECT_TRUE(marked) << first;
  for (long v = 0; v < first; ++v) ASSERT_FALSE(data.HasError(v, v + 1)) << v;
  QTest::keyClick(view, Qt::Key_N);
  EXPECT_EQ(view->GetCursor(0), data.NextError(first));
  QTest::keyClick(view, Qt::Key_P);
  EXPECT_EQ(view->GetCursor(0), first);
}

TEST_F(WaveWinTest, TwoCursorsPlacedWithTheMouseTellTheirDistanceInVectorsAndTime) {
  Click("PButCapture");
  WaveView* view = mWin->View();
  // Four pixels a vector from vector 0.
  view->ZoomBy(view->GetVectorsPerPixel() / 0.25, 0);
  ASSERT_DOUBLE_EQ(view->GetVectorsPerPixel(), 0.25);
  QTest::mouseClick(view, Qt::LeftButton, {}, QPoint(WaveView::kNameWidth + 4 * 10 + 1, 100));
  QTest::mouseClick(view, Qt::RightButton, {}, QPoint(WaveView::kNameWidth + 4 * 110 + 2, 100));
  EXPECT_EQ(view->GetCursor(0), 10);
  EXPECT_EQ(view->GetCursor(1), 110);
  EXPECT_NE(mWin->CursorText().indexOf(QStringLiteral("B − A: 100 vectors = 100\u202Fns")), -1) << mWin->CursorText().toStdString();
  // Dragging pans and sets no cursor; the keys zoom and fit.
  QTest::mousePress(view, Qt::LeftButton, {}, QPoint(700, 100));
  QTest::mouseMove(view, QPoint(300, 100));
  QTest::mouseRelease(view, Qt::LeftButton, {}, QPoint(300, 100));
  EXPECT_DOUBLE_EQ(view->GetFirst(), 100.0);
  EXPECT_EQ(view->GetCursor(0), 10);
  view->setFocus();
  QTest::keyClick(view, Qt::Key_Minus);
  EXPECT_DOUBLE_EQ(view->GetVectorsPerPixel(), 0.5);
  QTest::keyClick(view, Qt::Key_F);
  EXPECT_DOUBLE_EQ(view->GetFirst(), 0.0);
  EXPECT_DOUBLE_EQ(view->VisibleVectors(), static_cast<double>(kDepth));
}

TEST_F(WaveWinTest, TheVcdExportHoldsTheCapturedBitsAndErrors) {
  Click("PButCapture");
  const std::string path = (std::filesystem::temp_directory_path() / "qen-wavewin-test.vcd").string();
  ASSERT_EQ(mWin->ExportVcd(path, mList), 0) << mList.ToText();
  const auto values = ReadVcd(path, kDepth);
  const std::string data = Block("DATA");
  const std::string errors = Block("ERR");
  for (long t = 0; t < 4; ++t) {
    const std::vector<char>& trace = values.at("d" + std::to_string(t));
    ASSERT_EQ(static_cast<long>(trace.size()), kDepth);
    for (long v = 0; v < kDepth; ++v) ASSERT_EQ(trace[static_cast<std::size_t>(v)] == '1', BitAt(data, t, v)) << t << "," << v;
  }
  const std::vector<char>& error = values.at("error");
  for (long v = 0; v < kDepth; ++v) {
    const bool any = BitAt(errors, 0, v) || BitAt(errors, 1, v) || BitAt(errors, 2, v) || BitAt(errors, 3, v);
    ASSERT_EQ(error[static_cast<std::size_t>(v)] == '1', any) << v;
  }
  // Between the cursors only; an unwritable path is a condition.
  mWin->View()->SetCursor(0, 30);
  mWin->View()->SetCursor(1, 20);
  ASSERT_EQ(mWin->ExportVcd(path, mList), 0);
  EXPECT_EQ(ReadVcd(path, kDepth).at("d0").size(), 11u);
  std::filesystem::remove(path);
  EXPECT_NE(mWin->ExportVcd("/nonexistent/dir/c.vcd", mList), 0);
  EXPECT_NE(mList.ToText().find("/nonexistent/dir/c.vcd"), std::string::npos);
}

// What a logic analyser program reads from the exported file: every sample of every trace, the
// bus's traces and the errors, as the instrument sent them; a range from cursor to cursor at its
// own time in the capture, with the header naming it.
TEST_F(WaveWinTest, SigrokReadsTheExportedCaptureAndARangeAtItsTime) {
  if (!SigrokCli::IsInstalled()) GTEST_SKIP() << "sigrok-cli is not installed";
  Click("PButCapture");
  ASSERT_EQ(mWin->Data().GetLength(), kDepth);
  mWin->findChild<QSpinBox*>(QStringLiteral("SpinBusLow"))->setValue(1);
  mWin->findChild<QSpinBox*>(QStringLiteral("SpinBusHigh"))->setValue(3);
  const std::string data = Block("DATA");
  const std::string errors = Block("ERR");
  auto anyError = [&](long v) {
    return BitAt(errors, 0, v) || BitAt(errors, 1, v) || BitAt(errors, 2, v) || BitAt(errors, 3, v);
  };
  // How the samples of a channel lie: `size` in all, vector `vector` + i at first + i * step.
  struct Samples {
    long size, first, step, vector, count;
  };
  auto expect = [&](const std::map<std::string, std::string>& channels, const std::string& name,
                    const Samples& at, auto bit) {
    ASSERT_TRUE(channels.count(name)) << name;
    const std::string& samples = channels.at(name);
    ASSERT_EQ(static_cast<long>(samples.size()), at.size) << name;
    for (long i = 0; i < at.count; ++i) {
      ASSERT_EQ(samples[static_cast<std::size_t>(at.first + i * at.step)] == '1', bit(at.vector + i))
          << name << " at vector " << at.vector + i;
    }
  };
  auto expectAll = [&](const std::map<std::string, std::string>& channels, const Samples& at) {
    ASSERT_EQ(channels.size(), 4u + 1u + 3u);
    for (long t = 0; t < 4; ++t) {
      auto bit = [&](long v) { return BitAt(data, t, v); };
      expect(channels, "d" + std::to_string(t), at, bit);
      if (t >= 1) expect(channels, "bus[" + std::to_string(t) + "]", at, bit);
    }
    expect(channels, "error", at, anyError);
  };
  const std::string path = (std::filesystem::temp_directory_path() / "qen-wavewin-sigrok.vcd").string();
  std::map<std::string, std::string> channels;
  std::string error;

  // The whole capture, a sample a vector (the time scale is 1 ps, the period 1 ns).
  ASSERT_EQ(mWin->ExportVcd(path, mList), 0) << mList.ToText();
  ASSERT_TRUE(SigrokCli::Read(path, "downsample=1000", channels, error)) << error;
  expectAll(channels, {kDepth, 0, 1, 0, kDepth});

  // Vectors 100 to 199: read as sigrok reads by default, from the first time in the file, every
  // picosecond; and a sample a vector, counted from time 0, where the range starts at 100.
  mWin->View()->SetCursor(0, 199);
  mWin->View()->SetCursor(1, 100);
  ASSERT_EQ(mWin->ExportVcd(path, mList), 0) << mList.ToText();
  std::ifstream in(path);
  const std::string text((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
  EXPECT_NE(text.find("$comment vectors 100 to 199 of 4096; vector 0 is at time 0 $end"), std::string::npos)
      << text.substr(0, 300);
  EXPECT_NE(text.find("\n#100000\n$dumpvars\n"), std::string::npos);
  ASSERT_TRUE(SigrokCli::Read(path, "", channels, error)) << error;
  expectAll(channels, {100 * 1000, 500, 1000, 100, 100});
  ASSERT_TRUE(SigrokCli::Read(path, "downsample=1000", channels, error)) << error;
  expectAll(channels, {200, 100, 1, 100, 100});
  std::filesystem::remove(path);
}

TEST_F(WaveWinTest, ACaptureWhileNothingRunsIsRefusedAndACancelledOneKeepsTheLast) {
  Click("PButCapture");
  ASSERT_EQ(mWin->Data().GetLength(), kDepth);
  Other(":SGEN:GLOB:INIT:CONT OFF");
  Poll();
  const Dstring before = Other(":CAPT:STAT?");
  Click("PButCapture");
  QCoreApplication::processEvents();
  EXPECT_EQ(mWin->StateText().toStdString(), "Not captured: nothing runs.");
  ASSERT_FALSE(mAlerts.empty());
  EXPECT_NE(mAlerts.back().find("Nothing runs"), std::string::npos) << mAlerts.back();
  EXPECT_EQ(Other(":CAPT:STAT?"), before);

  Other(":SGEN:GLOB:INIT:CONT ON");
  Poll();
  Other(":MEAS:CAPT:DEPT 8192");
  Other(":CAPT:PACE 60000");
  Click("PButCapture");
  EXPECT_TRUE(mWin->Follower()->IsActive());
  Click("PButCancel");
  EXPECT_FALSE(mWin->Follower()->IsActive());
  EXPECT_EQ(mWin->StateText().toStdString(), "Cancelled; the last capture is kept.");
  EXPECT_EQ(mWin->Data().GetLength(), kDepth);
  EXPECT_EQ(Other(std::string(kPort) + ":CAPT:SIZE?"), "4096,4");
}

TEST_F(WaveWinTest, ARepliedCaptureThatCannotBeReadLeavesNoneAndSaysWhichReply) {
  Click("PButCapture");
  const std::pair<const char*, const char*> kCases[] = {
      {":CGR1:MOD3:CONN1:CAPT:SIZE?", "4096"},           {":CGR1:MOD3:CONN1:CAPT:SIZE?", "4096,-4"},
      {":CGR1:PER?", "0"},                               {":CGR1:MOD3:CONN1:CAPT:DATA?", "#15abcde"},
      {":CGR1:MOD3:CONN1:CAPT:ERR?", "0"},
  };
  for (const auto& [header, form] : kCases) {
    Dstring reply;
    ASSERT_EQ(QenGuiInst::Call(":TEST:MALF \"" + Dstring(header) + "\",\"" + form + "\"", reply, mList), 0);
    ConditionList list;
    EXPECT_NE(mWin->ReadCapture(list), 0) << header << " " << form;
    EXPECT_NE(list.ToText().find(Dstring(header).substr(0, std::strlen(header) - 1)), std::string::npos) << list.ToText();
    EXPECT_EQ(mWin->Data().GetLength(), 0);
  }
  ConditionList list;
  EXPECT_EQ(mWin->ReadCapture(list), 0) << list.ToText();
  EXPECT_EQ(mWin->Data().GetLength(), kDepth);
}
