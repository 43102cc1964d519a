#include "GuiHost.h"

#include <QApplication>
#include <QMessageBox>
#include <QLineEdit>
#include <QMdiArea>
#include <QPixmap>
#include <iostream>

#include "HostConnection.h"
#include "HostOptions.h"
#include "core/ErrorJournal.h"
#include "core/ServerDeathRescue.h"
#include "core/uiapp.h"
#include "data/BerSvr.h"
#include "data/DirtyFlagDs.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenSimProcess.h"
#include "params/ui/BoundControlClasses.h"
#include "settings/SettingStartUp.h"
#include "toolkit/Toolkit.h"
#include "toolkit/qt/QtToolkit.h"
#include "windows/ConnectDialog.h"
#include "windows/GridClasses.h"
#include "windows/MainWin.h"
#include "windows/SettingStartUpDialog.h"

namespace {

// The server to use: as given, the simulator, or the one the user picks (with `typed` in the
// address field). False when cancelled or the simulator would not start.
bool ChooseServer(HostOptions& options, QenSimProcess& sim, const QString& typed) {
  if (options.askServer) {
    ConnectDialog dialog;
    dialog.Search();
    if (!typed.isEmpty()) dialog.AddressField()->setText(typed);
    if (dialog.exec() != QDialog::Accepted) return false;
    options.simulate = dialog.UseSimulator();
    if (!options.simulate) {
      options.host = dialog.Host();
      options.port = dialog.Port();
    }
  }
  if (options.simulate && sim.Port() == 0) {
    if (!sim.Start(QenSimProcess::FindBesideExecutable(), {"--quiet"})) {
      QMessageBox::critical(nullptr, QStringLiteral("qengui"), QStringLiteral("The simulator qensim could not be started."));
      return false;
    }
    options.host = "127.0.0.1";
    options.port = sim.Port();
  }
  return true;
}

// The first poll as the alarm and the main loop would run it: every state is read.
void PollOnce() {
  uiapp::GetDirtyFlagDs()->ForceUpdate();
  uiapp::AsyncAlarmProc(nullptr);
  uiapp::SyncTimeOut();
  QCoreApplication::processEvents();
}

int Screenshot(MainWin& window, const HostOptions& options) {
  window.resize(options.width, options.height);
  window.show();
  PollOnce();
  for (const std::string& resource : options.open) {
    if (window.OpenWindow(QString::fromStdString(resource)) == nullptr) {
      std::cerr << "qengui: the window " << resource << " could not be opened\n";
      return 1;
    }
  }
  window.Area()->tileSubWindows();
  QCoreApplication::processEvents();
  if (!window.grab().save(QString::fromStdString(options.screenshot), "PNG")) {
    std::cerr << "qengui: the picture could not be written to " << options.screenshot << "\n";
    return 1;
  }
  return 0;
}

// The address to offer again in the connect dialog; the simulator is chosen from its list.
QString TypedAddress(const HostOptions& options) {
  if (options.simulate) return {};
  return QStringLiteral("%1:%2").arg(QString::fromStdString(options.host)).arg(options.port);
}

// Connected and with the handle: the first setting, the main window and its loop. Sets
// `reconnect` when the user gave the connection up and wants another.
int RunSession(const HostOptions& options, bool& reconnect) {
  // Cancelling the start-up dialog ends the start as if it had not begun; a picture only looks.
  const uiapp::StartUse use = options.screenshot.empty() ? uiapp::StartUse::kConfigured : uiapp::StartUse::kOnlyLook;
  if (uiapp::RegistrationFinished(use) != 0) return 0;
  // The status bar shows the error counts while running: the service is set up at once. A
  // server without analyser ports just has none to show.
  ConditionList ber;
  uiapp::GetBerSvr()->Init(ber);
  auto window = std::make_unique<MainWin>();
  window->Attach();
  if (!options.screenshot.empty()) return Screenshot(*window, options);
  // The first poll reads every state: nothing marks them changed when the start keeps what
  // the instrument holds.
  uiapp::GetDirtyFlagDs()->ForceUpdate();
  uiapp::StartPolling();
  window->show();
  // Where most work starts; the frame is never empty on a first run.
  if (QWidget* editor = window->OpenWindow(QStringLiteral("paramedit.ParamEd"))) editor->parentWidget()->showMaximized();
  // Work the server's death left unsaved is offered back once the window stands.
  ConditionList rescue;
  ServerDeathRescue::OfferPutBack(rescue);
  QenGuiInst::ShowErrorDlg(rescue, 1);
  uiapp::MainLoop();
  uiapp::EndPolling();
  reconnect = window->EndedToReconnect();
  return 0;
}

// Ends the services of a connection that was given up and starts them anew for the next.
void Restart(ConditionList& list) {
  ErrorJournal::Uninstall();
  uiapp::End(list);
  list.Clear();
  uiapp::Init(list);
  ErrorJournal::Install();
  if (!list.IsEmpty()) QenGuiInst::ShowErrorDlg(list, 1);
  list.Clear();
}

}  // namespace

int GuiHost::Run(int argc, char** argv, HostOptions options, QenSimProcess& sim) {
  if (!options.screenshot.empty() && qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) {
    qputenv("QT_QPA_PLATFORM", "offscreen");
  }
  QApplication app(argc, argv);
  QApplication::setApplicationDisplayName(QStringLiteral("qengui"));
  QtToolkit toolkit;
  Toolkit::Install(&toolkit);
  // A picture taken without anyone watching must not wait for a message to be dismissed.
  if (!options.screenshot.empty()) {
    toolkit.SetAlertSink([](const Dstring& text, ToolkitPort::Icon) { std::cerr << "qengui: " << text << "\n"; });
  }
  BoundControlClasses::AddFactories();
  GridClasses::AddFactories();
  ConditionList list;
  uiapp::LoadDatLib(list);
  uiapp::RegisterClasses(list);
  uiapp::RegisterConstants();
  uiapp::RegisterEvents();
  uiapp::RegisterVerbs();
  uiapp::RegisterWindows();
  uiapp::Init(list);
  ErrorJournal::Install();
  if (!list.IsEmpty()) QenGuiInst::ShowErrorDlg(list, 1);
  list.Clear();
  SettingStartUpDialog startUp;
  SettingStartUp::SetDialog(&startUp);
  int code = 1;
  QString typed;
  for (;;) {
    if (!ChooseServer(options, sim, typed)) {
      code = options.askServer ? 0 : 1;
      break;
    }
    if (HostConnection::Open(options.host, options.port, options.resource, list) != 0) {
      QenGuiInst::ShowErrorDlg(list, 1);
      list.Clear();
      if (!options.screenshot.empty()) break;
      // The user corrects the address instead of starting the program again.
      typed = TypedAddress(options);
      options.askServer = true;
      continue;
    }
    bool reconnect = false;
    code = RunSession(options, reconnect);
    if (!reconnect) break;
    // The user gave up a connection that did not answer and asks for another (or the same).
    Restart(list);
    typed = TypedAddress(options);
    options.askServer = true;
  }
  SettingStartUp::SetDialog(nullptr);
  ErrorJournal::Uninstall();
  list.Clear();
  uiapp::End(list);
  uiapp::UnregisterWindows();
  Toolkit::Install(nullptr);
  return code;
}
