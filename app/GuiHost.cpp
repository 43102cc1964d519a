#include "GuiHost.h"

#include <QApplication>
#include <QMessageBox>
#include <QMdiArea>
#include <QPixmap>
#include <iostream>
#include <memory>

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
#include "toolkit/Toolkit.h"
#include "toolkit/qt/QtToolkit.h"
#include "windows/ConnectDialog.h"
#include "windows/GridClasses.h"
#include "windows/MainWin.h"

namespace {

// The server to use: as given, the simulator, or the one the user picks. False when cancelled
// or the simulator would not start.
bool ChooseServer(HostOptions& options, QenSimProcess& sim) {
  if (options.askServer) {
    ConnectDialog dialog;
    dialog.Search();
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
  int code = 1;
  if (!list.IsEmpty()) QenGuiInst::ShowErrorDlg(list, 1);
  list.Clear();
  if (ChooseServer(options, sim)) {
    if (HostConnection::Open(options.host, options.port, options.resource, list) == 0) {
      uiapp::RegistrationFinished();
      // The status bar shows the error counts while running: the service is set up at once. A
      // server without analyser ports just has none to show.
      ConditionList ber;
      uiapp::GetBerSvr()->Init(ber);
      auto window = std::make_unique<MainWin>();
      window->Attach();
      if (!options.screenshot.empty()) {
        code = Screenshot(*window, options);
      } else {
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
        code = 0;
      }
      window.reset();
    } else {
      QenGuiInst::ShowErrorDlg(list, 1);
    }
  } else if (!options.askServer) {
    code = 1;
  } else {
    code = 0;
  }
  ErrorJournal::Uninstall();
  list.Clear();
  uiapp::End(list);
  uiapp::UnregisterWindows();
  Toolkit::Install(nullptr);
  return code;
}
