#include "ConsoleHost.h"

#include <istream>
#include <ostream>
#include <string>

#include "InterruptWaiter.h"
#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "support/ConditionList.h"

int ConsoleHost::Run() {
  mOut << "Connected; application handle " << QenGuiInst::GetAppHandle() << ". Type help for help.\n";
  std::string line;
  while (mOut << "qen> " << std::flush, std::getline(mIn, line)) {
    if (!HandleLine(Dstring(line).Trimmed()) || InterruptWaiter::IsInterrupted()) break;
  }
  mOut << "\n";
  return InterruptWaiter::IsInterrupted() ? kInterruptedExitCode : 0;
}

bool ConsoleHost::HandleLine(const Dstring& line) {
  if (line.empty()) return true;
  if (line == "quit" || line == "exit") return false;
  if (line == "help") {
    PrintHelp();
    return true;
  }
  if (line == "handle") {
    mOut << QenGuiInst::GetAppHandle() << "\n";
    return true;
  }
  Dstring reply;
  ConditionList list;
  int status = QenGuiInst::Call(CommandText::ExpandHandle(line, QenGuiInst::GetAppHandle()), reply, list);
  if (!reply.empty()) mOut << reply << "\n";
  if (status != 0) mOut << "status " << status << "\n";
  for (const auto& c : list) mOut << "error " << c.GetCode() << ": " << c.GetMessage() << "\n";
  return true;
}

void ConsoleHost::PrintHelp() {
  mOut << "Type a command of the instrument's language and press Enter; the reply and any errors\n"
          "that the command queued are printed. Several commands may be joined with \";\".\n"
          "  ::HEADER        the application handle is filled in: ::TRIG:MODE? sends :"
       << QenGuiInst::GetAppHandle()
       << ":TRIG:MODE?\n"
          "  handle          print the application handle\n"
          "  help            this text\n"
          "  quit, exit      leave (end of input too)\n"
          "Examples:\n"
          "  ::TRIG:MODE?\n"
          "  ::CGR1:PER 2.5E-9;::CGR1:FREQ?\n"
          "  ::SYST:ERR?\n";
}
