#include "ConsoleHost.h"

#include <istream>
#include <ostream>
#include <string>

#include "InterruptWaiter.h"
#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "support/ConditionList.h"

int ConsoleHost::Run() {
  if (mInteractive) mOut << "Connected; application handle " << QenGuiInst::GetAppHandle() << ". Type help for help.\n";
  std::string line;
  while ((!mInteractive || mOut << "qen> " << std::flush) && std::getline(mIn, line)) {
    if (!HandleLine(Dstring(line).Trimmed()) || InterruptWaiter::IsInterrupted()) break;
  }
  if (mInteractive) mOut << "\n";
  mOut << std::flush;
  if (InterruptWaiter::IsInterrupted()) return kInterruptedExitCode;
  return mFailed ? kCommandFailedExitCode : 0;
}

bool ConsoleHost::HandleLine(const Dstring& line) {
  // A script's blank line still gets its line, so that outputs pair with inputs.
  if (line.empty()) {
    if (!mInteractive) mOut << "OK\n";
    return true;
  }
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
  const int status = QenGuiInst::Call(CommandText::ExpandHandle(line, QenGuiInst::GetAppHandle()), reply, list);
  if (status != 0 || !list.IsEmpty()) mFailed = true;
  mOut << ResultLine(status, reply, list) << "\n";
  return true;
}

Dstring ConsoleHost::ResultLine(int status, const Dstring& reply, const ConditionList& list) {
  if (status == 0 && list.IsEmpty()) return reply.empty() ? Dstring("OK") : reply;
  Dstring line = "ERROR ";
  if (list.IsEmpty()) return line + Dstring::Format("%d,\"Command failed\"", status);
  bool first = true;
  for (const auto& c : list) {
    Dstring text;
    for (char ch : c.GetMessage()) {
      if (ch == '"') text += '"';
      text += ch == '\n' ? ' ' : ch;
    }
    line += Dstring::Format("%s%ld,\"%s\"", first ? "" : ";", c.GetCode(), text.c_str());
    first = false;
  }
  return line;
}

void ConsoleHost::PrintHelp() {
  mOut << "Type a command of the instrument's language and press Enter: a write prints OK, a query\n"
          "its reply, a failure ERROR code,\"text\". Several commands may be joined with \";\".\n"
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
