#include <gtest/gtest.h>

#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

#include <QApplication>
#include <QLineEdit>
#include <QMessageBox>
#include <QTimer>
#include <chrono>
#include <csignal>
#include <string>

#include "GuiHost.h"
#include "HostConnection.h"
#include "HostOptions.h"
#include "common/HostProcess.h"
#include "common/Loopback.h"
#include "common/SimProcess.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenSimProcess.h"
#include "windows/ConnectDialog.h"

namespace {

// A loopback port that accepts connections (the kernel completes them) and never says a word,
// as a port of another protocol does.
class SilentListener {
 public:
  SilentListener() : mFd(BindLoopback(mPort)) {}
  ~SilentListener() { close(mFd); }
  void Listen() { listen(mFd, 4); }
  unsigned short Port() const { return mPort; }

 private:
  unsigned short mPort = 0;  // before mFd: binding sets it
  int mFd = -1;
};

struct ConnectCase {
  const char* name;
  bool unknownHost;
  bool listening;
  const char* sentence;  // %P is the port
};

std::string WithPort(std::string text, unsigned short port) {
  const auto at = text.find("%P");
  if (at != std::string::npos) text.replace(at, 2, std::to_string(port));
  return text;
}

class ConnectFailureTest : public testing::TestWithParam<ConnectCase> {};

}  // namespace

TEST_P(ConnectFailureTest, SaysWhyInWordsWithinThreeSeconds) {
  const ConnectCase& c = GetParam();
  SilentListener port;
  if (c.listening) port.Listen();
  const std::string host = c.unknownHost ? "no-such-host.invalid" : "127.0.0.1";
  QenGuiInst::Init();
  ConditionList list;
  const auto start = std::chrono::steady_clock::now();
  EXPECT_NE(HostConnection::Open(host, port.Port(), "QEN1", list), 0);
  const double seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
  ASSERT_EQ(list.Size(), 1u) << list.ToText();
  EXPECT_EQ(list[0].GetMessage(), WithPort(c.sentence, port.Port()));
  EXPECT_LT(seconds, 3.0);
  EXPECT_EQ(QenGuiInst::GetInstrument(), nullptr) << "nothing is left connected";
  QenGuiInst::End();
}

INSTANTIATE_TEST_SUITE_P(
    Addresses, ConnectFailureTest,
    testing::Values(
        ConnectCase{"NothingListens", false, false, "No instrument server answers at 127.0.0.1:%P."},
        ConnectCase{"UnknownHost", true, false,
                    "The host \"no-such-host.invalid\" is not known; check the name, or give its address."},
        ConnectCase{"AnotherProtocol", false, true,
                    "127.0.0.1:%P accepted the connection but did not answer as an instrument server; is it the SCPI "
                    "port? The instrument server's port is 7130 by default."}),
    [](const testing::TestParamInfo<ConnectCase>& info) { return info.param.name; });

namespace {

// What the window host showed, answered as a user would: the message read, the connect
// dialog cancelled.
std::vector<std::string> gShown;
bool gAnswering = false;

// Runs whenever a QApplication is made; answers only while the test below runs.
void AnswerModalWindows() {
  if (!gAnswering) return;
  auto* timer = new QTimer(qApp);
  QObject::connect(timer, &QTimer::timeout, [] {
    QWidget* modal = QApplication::activeModalWidget();
    if (auto* box = qobject_cast<QMessageBox*>(modal)) {
      gShown.push_back("message: " + box->text().toStdString());
      box->accept();
    } else if (auto* dialog = qobject_cast<ConnectDialog*>(modal)) {
      gShown.push_back("connect dialog: " + dialog->AddressField()->text().toStdString());
      dialog->reject();
    }
  });
  timer->start(20);
}

}  // namespace

TEST(GuiHostConnect, AnAddressWithoutAServerBringsBackTheConnectDialogWithTheAddressAsTyped) {
  qputenv("QT_QPA_PLATFORM", "offscreen");
  SilentListener closed;
  HostOptions options;
  options.port = closed.Port();
  QenSimProcess sim;
  gShown.clear();
  gAnswering = true;
  qAddPreRoutine(AnswerModalWindows);
  static char name[] = "qengui";
  static char* argv[] = {name, nullptr};
  EXPECT_EQ(GuiHost::Run(1, argv, options, sim), 0) << "cancelled by the user, not failed";
  gAnswering = false;
  const std::string address = "127.0.0.1:" + std::to_string(closed.Port());
  ASSERT_EQ(gShown.size(), 2u);
  EXPECT_EQ(gShown[0], "message: ERROR -2\n\nNo instrument server answers at " + address + ".");
  EXPECT_EQ(gShown[1], "connect dialog: " + address);
}

TEST(ConsoleHostInterrupt, CtrlCEndsTheConsoleAtOnceWhileTheInstrumentIsSlow) {
  SimProcess sim;
  ASSERT_NE(sim.Port(), 0);
  HostProcess host({"--console", "127.0.0.1:" + std::to_string(sim.Port())}, ":TEST:DELAY 60000,1\n::TRIG:MODE?\n");
  // Fed by a pipe, the console prints one line per line: "OK" once the delay is armed.
  ASSERT_TRUE(host.WaitForOutput("OK\n", 15000)) << host.Output();
  host.Signal(SIGINT);
  EXPECT_EQ(host.WaitForExit(2000), 130) << host.Output();
  EXPECT_NE(host.Output().find("ERROR -9,\"The wait for the instrument server was given up"), std::string::npos)
      << host.Output();
}
