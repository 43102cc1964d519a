#include <gtest/gtest.h>

#include <QAction>
#include <QApplication>
#include <QLabel>
#include <QLineEdit>
#include <QPointer>
#include <QMdiArea>
#include <QMdiSubWindow>
#include <QPushButton>
#include <QStatusBar>
#include <QTimer>
#include <QtTest/QTest>
#include <algorithm>
#include <memory>

#include "common/gui/GuiSimFixture.h"
#include "core/uiapp.h"
#include "instrument/AppHandle.h"
#include "instrument/QenTcpInstrument.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "windows/InstrumentWaitView.h"
#include "windows/MainWin.h"
#include "windows/StateStatusBar.h"
#include "windows/dtecmd/DtecmdCmdWin.h"

namespace {

// Counts its paints: the window is alive when they keep coming.
class PaintCounter : public QWidget {
 public:
  int mPaints = 0;

 protected:
  void paintEvent(QPaintEvent*) override { ++mPaints; }
};

// Every command of the application's connection, in order, with its status.
class RecordingInstrument : public QenInstrument {
 public:
  explicit RecordingInstrument(std::unique_ptr<QenInstrument> inner) : mInner(std::move(inner)) {}
  int Connect(const Dstring& host, unsigned short port) override { return mInner->Connect(host, port); }
  int Disconnect() override { return mInner->Disconnect(); }
  bool IsConnected() const override { return mInner->IsConnected(); }
  int Call(const Dstring& cmd, Dstring& reply) override {
    const std::size_t at = mCalls.size();
    mCalls.push_back({cmd, 1});
    const int status = mInner->Call(cmd, reply);
    mCalls[at].second = status;
    return status;
  }
  void SetCallProgress(CallProgress* progress) override { mInner->SetCallProgress(progress); }
  void SetCallWaiter(CallWaiter* waiter) override { mInner->SetCallWaiter(waiter); }
  long Count(const Dstring& cmd) const {
    return std::count_if(mCalls.begin(), mCalls.end(), [&](const auto& c) { return c.first == cmd; });
  }

  std::vector<std::pair<Dstring, int>> mCalls;

 private:
  std::unique_ptr<QenInstrument> mInner;
};

class InstrumentWaitTest : public GuiSimFixture {
 protected:
  void SetUp() override {
    GuiSimFixture::SetUp();
    mWin = ShowMainWin();
  }
  void TearDown() override {
    QCoreApplication::processEvents();
    mWin.reset();
    GuiSimFixture::TearDown();
  }
  // The next reply on the application's connection comes `ms` late.
  void DelayNext(int ms) {
    Dstring reply;
    ASSERT_EQ(QenGuiInst::Call(Dstring::Format(":TEST:DELAY %d,1", ms), reply, mList), 0);
  }
  int Call(const Dstring& rest, Dstring& reply) { return QenGuiInst::Call(":" + mHandle + rest, reply, mList); }
  // The application's connection made anew through a recorder, under a handle of its own.
  RecordingInstrument* Record() {
    auto tcp = std::make_unique<QenTcpInstrument>();
    EXPECT_EQ(tcp->Connect("127.0.0.1", sSim->Port()), 0);
    Dstring handle = "_R";
    EXPECT_EQ(AppHandle::Create(tcp.get(), handle, "R", mList), 0);
    auto recording = std::make_unique<RecordingInstrument>(std::move(tcp));
    RecordingInstrument* raw = recording.get();
    QenGuiInst::SetInstrument(std::move(recording));
    QenGuiInst::SetAppHandle(handle);
    mHandle = handle;
    return raw;
  }

  std::unique_ptr<MainWin> mWin;
};

}  // namespace

TEST_F(InstrumentWaitTest, TheWindowsStayAliveAndShowTheWaitWhileAReplyTakesTwoSeconds) {
  PaintCounter painted;
  painted.resize(50, 50);
  painted.show();
  QLineEdit field;
  field.show();
  int ticks = 0;
  bool sawBusyCursor = false;
  QString message;
  QTimer timer;
  timer.setInterval(10);
  QObject::connect(&timer, &QTimer::timeout, [&] {
    ++ticks;
    painted.update();
    if (ticks == 5) QTest::keyClicks(&field, "2.5");
    const QCursor* cursor = QApplication::overrideCursor();
    sawBusyCursor = sawBusyCursor || (cursor && cursor->shape() == Qt::BusyCursor);
    if (mWin->statusBar()->currentMessage().contains(QStringLiteral(" 1 s"))) message = mWin->statusBar()->currentMessage();
  });
  DelayNext(2000);
  const int paintsBefore = painted.mPaints;
  timer.start();
  Dstring reply;
  ASSERT_EQ(Call(":TRIG:MODE?", reply), 0);
  timer.stop();
  EXPECT_EQ(reply, "SEQ");
  // A frozen loop gives no tick at all; a live one about 200.
  EXPECT_GE(ticks, 50);
  EXPECT_GE(painted.mPaints - paintsBefore, 10);
  EXPECT_EQ(field.text(), "2.5") << "a key typed during the wait stays in the field";
  EXPECT_TRUE(sawBusyCursor);
  EXPECT_EQ(message, "Waiting for the instrument: :TRIG:MODE?… 1 s");
  EXPECT_EQ(QApplication::overrideCursor(), nullptr);
  EXPECT_TRUE(mWin->statusBar()->currentMessage().isEmpty());
  EXPECT_FALSE(mWin->WaitView()->isVisible()) << "the Disconnect bar waits five seconds";
}

TEST_F(InstrumentWaitTest, APollDueDuringTheWaitRunsAfterItOnce) {
  RecordingInstrument* recorder = Record();
  const Dstring poll = mHandle + ":DFL?";
  DelayNext(600);
  QTimer::singleShot(100, [] { uiapp::AsyncAlarmProc(nullptr); });
  Dstring reply;
  ASSERT_EQ(Call(":TRIG:MODE?", reply), 0);
  EXPECT_EQ(recorder->Count(poll), 0) << "nothing is sent while a call waits";
  ASSERT_EQ(recorder->mCalls.back().first, ":" + mHandle + ":TRIG:MODE?");
  QCoreApplication::processEvents();
  uiapp::EndPolling();
  EXPECT_EQ(recorder->Count(poll), 1);
  for (const auto& [cmd, status] : recorder->mCalls) EXPECT_NE(status, QenStatus::kCallBusy) << cmd;
}

TEST_F(InstrumentWaitTest, RunClickedDuringTheWaitIsRefusedInWordsAndNothingIsInterleaved) {
  RecordingInstrument* recorder = Record();
  QAction* run = nullptr;
  for (QAction* action : mWin->findChildren<QAction*>()) {
    if (action->shortcut() == QKeySequence(Qt::Key_F5)) run = action;
  }
  ASSERT_NE(run, nullptr);
  DelayNext(500);
  QTimer::singleShot(100, run, &QAction::trigger);
  Dstring reply;
  ASSERT_EQ(Call(":TRIG:MODE?", reply), 0);
  EXPECT_EQ(reply, "SEQ");
  ASSERT_EQ(recorder->mCalls.size(), 2u) << "the delay and the query, nothing of Run";
  ASSERT_FALSE(mAlerts.empty());
  EXPECT_NE(mAlerts.back().find("Not done: the instrument is still answering an earlier command; try again when it has answered (uiapp::Run)."),
            std::string::npos)
      << mAlerts.back();
}

TEST_F(InstrumentWaitTest, AWindowClosedDuringItsOwnWaitClosesOnceTheReplyIsIn) {
  auto* cmd = qobject_cast<DtecmdCmdWin*>(mWin->OpenWindow(QStringLiteral("dtecmd.CmdWin")));
  ASSERT_NE(cmd, nullptr);
  QPointer<QMdiSubWindow> sub = qobject_cast<QMdiSubWindow*>(cmd->parentWidget());
  ASSERT_NE(sub, nullptr);
  DelayNext(500);
  QTimer::singleShot(100, sub, &QWidget::close);
  QTest::keyClicks(cmd->Input(), "::TRIG:MODE?");
  QTest::keyClick(cmd->Input(), Qt::Key_Return);
  EXPECT_TRUE(cmd->Transcript().contains("SEQ")) << "the window outlived its own wait";
  for (int i = 0; i < 5 && sub; ++i) QCoreApplication::processEvents();
  QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
  EXPECT_TRUE(sub.isNull() || !sub->isVisible());
}

TEST_F(InstrumentWaitTest, AfterFiveSecondsTheBarOffersDisconnectAndTheWindowAsksForAnotherServer) {
  DelayNext(20000);
  bool offered = false;
  QTimer timer;
  timer.setInterval(50);
  QObject::connect(&timer, &QTimer::timeout, [&] {
    if (!mWin->WaitView()->isVisible()) return;
    offered = true;
    EXPECT_TRUE(mWin->WaitView()->findChild<QLabel*>(QStringLiteral("InstrumentWaitText"))
                    ->text()
                    .startsWith(QStringLiteral("The instrument has not answered :TRIG:MODE? for 5 s.")));
    QTest::mouseClick(mWin->WaitView()->findChild<QPushButton*>(QStringLiteral("PButDisconnect")), Qt::LeftButton);
  });
  timer.start();
  Dstring reply;
  EXPECT_EQ(Call(":TRIG:MODE?", reply), QenStatus::kAbandoned);
  timer.stop();
  EXPECT_TRUE(offered);
  EXPECT_FALSE(QenGuiInst::GetInstrument()->IsConnected());
  QCoreApplication::processEvents();
  EXPECT_TRUE(mWin->EndedToReconnect());
  EXPECT_FALSE(mWin->isVisible());
}

TEST(InstrumentWaitText, NamesTheCommandAsTheUserKnowsIt) {
  QenGuiInst::SetAppHandle("_QEN1X");
  struct Case {
    const char* cmd;
    long long ms;
    const char* text;
  };
  const Case cases[] = {
      {":_QEN1X:SGEN:GLOB:SYST:TEST?", 3999, "Waiting for the instrument: :SGEN:GLOB:SYST:TEST?… 3 s"},
      {"_QEN1X:DFL?", 500, "Waiting for the instrument: :DFL?… 0 s"},
      {":VC:_QEN1X:CGR1:PER 1E-9", 1000, "Waiting for the instrument: :VC:_QEN1X:CGR1:PER 1E-9… 1 s"},
      {":_QEN1X:EDIT:SEGM1:PATT:DATA 0,0,1,8,#18\x01\x02", 2000,
       "Waiting for the instrument: :EDIT:SEGM1:PATT:DATA 0,0,1,8,… 2 s"},
  };
  for (const Case& c : cases) EXPECT_EQ(InstrumentWaitView::WaitingText(c.cmd, c.ms).toStdString(), c.text) << c.cmd;
  QenGuiInst::SetAppHandle("");
}
