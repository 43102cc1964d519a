#include <gtest/gtest.h>

#include <QCoreApplication>
#include <QFile>
#include <QTest>
#include <QWheelEvent>
#include <QXmlStreamReader>
#include <memory>

#include "common/gui/GuiSimFixture.h"
#include "sequences/ui/SchemeView.h"
#include "windows/bconnect/BconnectConnectWin.h"

namespace {

constexpr const char* kGen1 = ":CGR1:MOD1:CONN1";
constexpr const char* kGen2 = ":CGR1:MOD2:CONN1";
constexpr const char* kAna1 = ":CGR1:MOD3:CONN1";
constexpr const char* kAna2 = ":CGR1:MOD3:CONN2";
constexpr const char* kDefault =
    "(\":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\"),(\":CGR1:MOD1:CONN2\",\":CGR1:MOD3:CONN2\"),"
    "(\":CGR2:MOD1:CONN1\",\":CGR2:MOD2:CONN1\"),(\":CGR2:MOD1:CONN2\",\":CGR2:MOD2:CONN2\")";

// The system scheme against qensim over the real socket, with a second client that reads and
// changes the cabling as another user would.
class ConnectWinTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    // One qensim serves the suite: every test starts from its default wiring.
    RestoreDefault();
    Poll();
    mWin = std::make_unique<BconnectConnectWin>();
    ASSERT_EQ(mWin->Load(mList), 0) << mList.ToText();
    mWin->resize(1000, 700);
    mWin->show();
    QCoreApplication::processEvents();
  }
  void TearDown() override {
    mWin.reset();
    GuiSimFixture::TearDown();
  }
  void RestoreDefault() {
    // Whatever a test left: its changes undone, the refusals of what was not there drained.
    const std::pair<const char*, const char*> undo[] = {{"DEL", kGen2}, {"DEL", kGen1}, {"ADD", kGen1}};
    const char* const analyser[] = {kAna1, kAna2, kAna1};
    for (std::size_t i = 0; i < 3; ++i) {
      Dstring ignored;
      mOther->Call(Dstring::Format(":%s:CONF:CONN:%s \"%s\",\"%s\"", mOtherHandle.c_str(), undo[i].first,
                                   undo[i].second, analyser[i]),
                   ignored);
      mOther->Call(":" + mOtherHandle + ":SYST:ERR?", ignored);
    }
    ASSERT_EQ(Other(":CONF:CONN?"), kDefault);
  }
  QPoint At(const char* port) const {
    QPointF at;
    EXPECT_TRUE(mWin->View()->PortAnchor(port, at)) << port;
    return mWin->View()->mapFromScene(at);
  }
  // A drag with the mouse in the view from one port to another.
  void Drag(const char* from, const char* to) {
    QWidget* viewport = mWin->View()->viewport();
    QTest::mousePress(viewport, Qt::LeftButton, {}, At(from));
    QTest::mouseMove(viewport, (At(from) + At(to)) / 2);
    QTest::mouseMove(viewport, At(to));
    QTest::mouseRelease(viewport, Qt::LeftButton, {}, At(to));
    QCoreApplication::processEvents();
  }
  Dstring ExportPath(const char* name) const { return sDataDir + "/" + name; }

  std::unique_ptr<BconnectConnectWin> mWin;
};

}  // namespace

TEST_F(ConnectWinTest, DrawsTheRackAndItsConnections) {
  EXPECT_EQ(mWin->View()->NumLines(), 4);
  EXPECT_EQ(mWin->SummaryText(), QStringLiteral("4 of 4 analyser ports driven"));
  QPointF at;
  for (const char* port : {kGen1, kGen2, kAna1, kAna2, ":CGR1:MOD1:CONN3", ":CGR2:MOD2:CONN2"}) {
    EXPECT_TRUE(mWin->View()->PortAnchor(port, at)) << port;
  }
  // Generators on the left, analysers on the right.
  QPointF gen, ana;
  mWin->View()->PortAnchor(kGen1, gen);
  mWin->View()->PortAnchor(kAna1, ana);
  EXPECT_LT(gen.x(), ana.x());
}

TEST_F(ConnectWinTest, ZoomsWithKeysAndTheWheelAndFits) {
  SchemeView* view = mWin->View();
  const QRect whole = view->mapFromScene(view->scene()->sceneRect()).boundingRect();
  EXPECT_TRUE(view->viewport()->rect().adjusted(-2, -2, 2, 2).contains(whole)) << "fitted at the start";
  const double fitted = view->Zoom();
  QTest::keyClick(view, Qt::Key_Plus, Qt::ControlModifier);
  EXPECT_NEAR(view->Zoom(), fitted * 1.25, 1e-9);
  QTest::keyClick(view, Qt::Key_Minus, Qt::ControlModifier);
  QTest::keyClick(view, Qt::Key_Minus, Qt::ControlModifier);
  EXPECT_NEAR(view->Zoom(), fitted / 1.25, 1e-9);
  const QPoint middle = view->viewport()->rect().center();
  auto wheel = [&](Qt::KeyboardModifiers modifiers) {
    QWheelEvent event(middle, view->viewport()->mapToGlobal(middle), {}, {0, 240}, Qt::NoButton, modifiers,
                      Qt::NoScrollPhase, false);
    QCoreApplication::sendEvent(view->viewport(), &event);
  };
  wheel(Qt::ControlModifier);
  EXPECT_NEAR(view->Zoom(), fitted / 1.25 * 1.15 * 1.15, 1e-9);
  wheel(Qt::NoModifier);
  EXPECT_NEAR(view->Zoom(), fitted / 1.25 * 1.15 * 1.15, 1e-9) << "the plain wheel scrolls";
  // Zoomed by hand, a new size keeps the zoom; Ctrl+0 fits again.
  mWin->resize(900, 600);
  QCoreApplication::processEvents();
  EXPECT_NEAR(view->Zoom(), fitted / 1.25 * 1.15 * 1.15, 1e-9);
  QTest::keyClick(view, Qt::Key_0, Qt::ControlModifier);
  EXPECT_TRUE(view->viewport()
                  ->rect()
                  .adjusted(-2, -2, 2, 2)
                  .contains(view->mapFromScene(view->scene()->sceneRect()).boundingRect()));
}

TEST_F(ConnectWinTest, ARemovedAndADrawnConnectionReachTheOtherClient) {
  // Select the line and press Delete.
  ASSERT_TRUE(mWin->View()->SelectConnection({kGen1, kAna1}));
  EXPECT_EQ(
      mWin->StateText(),
      QStringLiteral("Selected: CGR1 MOD1 CONN1 drives CGR1 MOD3 CONN1. Delete removes the connection."));
  QTest::keyClick(mWin->View(), Qt::Key_Delete);
  QCoreApplication::processEvents();
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
  EXPECT_EQ(Other(":CONF:CONN?"),
            "(\":CGR1:MOD1:CONN2\",\":CGR1:MOD3:CONN2\"),(\":CGR2:MOD1:CONN1\",\":CGR2:MOD2:CONN1\"),"
            "(\":CGR2:MOD1:CONN2\",\":CGR2:MOD2:CONN2\")");
  EXPECT_EQ(mWin->View()->NumLines(), 3);
  EXPECT_EQ(mWin->SummaryText(), QStringLiteral("3 of 4 analyser ports driven"));

  Drag(kGen2, kAna1);
  EXPECT_TRUE(mAlerts.empty()) << mAlerts.front();
  EXPECT_EQ(Other(":CONF:CONN?"),
            "(\":CGR1:MOD2:CONN1\",\":CGR1:MOD3:CONN1\"),(\":CGR1:MOD1:CONN2\",\":CGR1:MOD3:CONN2\"),"
            "(\":CGR2:MOD1:CONN1\",\":CGR2:MOD2:CONN1\"),(\":CGR2:MOD1:CONN2\",\":CGR2:MOD2:CONN2\")");
  EXPECT_EQ(mWin->View()->NumLines(), 4);
  EXPECT_EQ(mWin->StateText(), QStringLiteral("Connected CGR1 MOD2 CONN1 to CGR1 MOD3 CONN1."));
  EXPECT_TRUE(mWin->View()->SelectConnection({kGen2, kAna1}));

  // Dragged backwards, from the analyser, it means the same.
  ASSERT_EQ(mWin->Disconnect(kGen2, kAna1, mList), 0) << mList.ToText();
  Drag(kAna1, kGen1);
  EXPECT_EQ(Other(":CONF:CONN?"), kDefault);
}

TEST_F(ConnectWinTest, AnImpossibleConnectionIsRefusedAndNothingWritten) {
  Drag(kGen2, kAna1);  // driven already
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_NE(mAlerts[0].find(":CGR1:MOD3:CONN1 is driven by :CGR1:MOD1:CONN1 already"), std::string::npos)
      << mAlerts[0];
  EXPECT_TRUE(mWin->StateText().startsWith(
      QStringLiteral("Refused: Settings conflict; :CGR1:MOD3:CONN1 is driven by")))
      << mWin->StateText().toStdString();
  EXPECT_EQ(Other(":CONF:CONN?"), kDefault);
  EXPECT_EQ(mWin->View()->NumLines(), 4);
  EXPECT_FALSE(mWin->View()->SelectConnection({kGen2, kAna1}));

  // A clock port takes no line at all: the drag pans instead.
  mAlerts.clear();
  Drag(":CGR1:MOD1:CONN3", kAna2);
  EXPECT_TRUE(mAlerts.empty());
  EXPECT_EQ(Other(":CONF:CONN?"), kDefault);
}

TEST_F(ConnectWinTest, AnotherClientsChangeIsShownWithinThePoll) {
  Other(Dstring(":CONF:CONN:DEL \"") + kGen1 + "\",\"" + kAna1 + "\"");
  EXPECT_EQ(mWin->View()->NumLines(), 4);
  Poll();
  QCoreApplication::processEvents();
  EXPECT_EQ(mWin->View()->NumLines(), 3);
  EXPECT_FALSE(mWin->View()->SelectConnection({kGen1, kAna1}));
  Other(Dstring(":CONF:CONN:ADD \"") + kGen2 + "\",\"" + kAna1 + "\"");
  Poll();
  EXPECT_TRUE(mWin->View()->SelectConnection({kGen2, kAna1}));
}

TEST_F(ConnectWinTest, UnderAnotherClientsLockTheSchemeIsReadOnlyAndSaysSo) {
  Control(":TEST:LOCK ON");
  // The first tick meets the lock; the next one's guard knows it.
  Poll();
  Poll();
  QCoreApplication::processEvents();
  EXPECT_TRUE(mWin->View()->IsReadOnly());
  EXPECT_TRUE(mWin->StateText().startsWith(QStringLiteral("Read-only: another client holds the instrument")));
  ASSERT_TRUE(mWin->View()->SelectConnection({kGen1, kAna1}));
  QTest::keyClick(mWin->View(), Qt::Key_Delete);
  Drag(kGen2, kAna2);
  EXPECT_EQ(mWin->View()->NumLines(), 4);
  Control(":TEST:LOCK OFF");
  Poll();
  Poll();
  QCoreApplication::processEvents();
  EXPECT_FALSE(mWin->View()->IsReadOnly());
  EXPECT_EQ(Other(":CONF:CONN?"), kDefault);
}

TEST_F(ConnectWinTest, ExportsAValidPngAndAnSvgThatNamesTheModules) {
  ASSERT_TRUE(mWin->View()->SelectConnection({kGen1, kAna1}));
  const Dstring png = ExportPath("scheme.png");
  ASSERT_EQ(mWin->ExportPng(png, mList), 0) << mList.ToText();
  QFile pngFile(QString::fromStdString(png));
  ASSERT_TRUE(pngFile.open(QIODevice::ReadOnly));
  const QByteArray bytes = pngFile.readAll();
  ASSERT_GT(bytes.size(), 24);
  EXPECT_EQ(bytes.left(8), QByteArray("\x89PNG\r\n\x1a\n", 8));
  const QRectF rect = mWin->View()->scene()->sceneRect();
  auto be32 = [&](int at) {
    return (static_cast<unsigned char>(bytes[at]) << 24) | (static_cast<unsigned char>(bytes[at + 1]) << 16) |
           (static_cast<unsigned char>(bytes[at + 2]) << 8) | static_cast<unsigned char>(bytes[at + 3]);
  };
  EXPECT_EQ(be32(16), qRound(rect.width() * 2));
  EXPECT_EQ(be32(20), qRound(rect.height() * 2));
  EXPECT_TRUE(mWin->View()->SelectConnection({kGen1, kAna1})) << "the selection comes back after the picture";

  const Dstring svg = ExportPath("scheme.svg");
  ASSERT_EQ(mWin->ExportSvg(svg, mList), 0) << mList.ToText();
  QFile svgFile(QString::fromStdString(svg));
  ASSERT_TRUE(svgFile.open(QIODevice::ReadOnly));
  QXmlStreamReader xml(&svgFile);
  QString text;
  bool root = false;
  while (!xml.atEnd()) {
    if (xml.readNext() == QXmlStreamReader::StartElement && xml.name() == QLatin1String("svg")) root = true;
    if (xml.isCharacters()) text += xml.text();
  }
  ASSERT_FALSE(xml.hasError()) << xml.errorString().toStdString();
  EXPECT_TRUE(root);
  for (const char* model : {"K2268A", "K2269B", "K2270A", "K2268B"})
    EXPECT_TRUE(text.contains(QLatin1String(model))) << model;

  EXPECT_EQ(mWin->ExportPng("/nonexistent/dir/x.png", mList), 1);
  EXPECT_EQ(mList.Last().GetKey(), "GUI_SCHEME_EXPORT_FAILED");
}
