#include "SimScpiSession.h"

#include <cmath>
#include <cstdlib>

#include "SimCommand.h"
#include "support/ConditionList.h"
#include "support/ParserExpression.h"

namespace {

std::string_view Trim(std::string_view text) {
  const std::size_t first = text.find_first_not_of(" \t\r\n");
  if (first == std::string_view::npos) return {};
  const std::size_t last = text.find_last_not_of(" \t\r\n");
  return text.substr(first, last - first + 1);
}

// The event bit of an error's class (IEEE 488.2 and SCPI-99).
std::uint8_t EventBitOf(int code) {
  if (code <= -100 && code > -200) return SimScpiSession::kCme;
  if (code <= -200 && code > -300) return SimScpiSession::kExe;
  if (code <= -400 && code > -500) return SimScpiSession::kQye;
  return SimScpiSession::kDde;
}

// SYSTem:ERRor[:NEXT]? in any of its short and long forms and any case.
bool IsErrorQuery(std::string_view header) {
  Dstring h = Dstring(header).ToUpper();
  if (h.StartsWith(":")) h.erase(0, 1);
  for (const char* form : {"SYST:ERR?", "SYSTEM:ERR?", "SYST:ERROR?", "SYSTEM:ERROR?", "SYST:ERR:NEXT?",
                           "SYSTEM:ERR:NEXT?", "SYST:ERROR:NEXT?", "SYSTEM:ERROR:NEXT?"}) {
    if (h == form) return true;
  }
  return false;
}

// An error queue entry `code,"text"` taken apart.
bool ReadEntry(const Dstring& entry, int& code, Dstring& text) {
  char* end = nullptr;
  const long value = std::strtol(entry.c_str(), &end, 10);
  const std::size_t open = entry.find('"');
  if (end == entry.c_str() || open == Dstring::npos || entry.size() < open + 2 || entry.back() != '"') return false;
  code = static_cast<int>(value);
  text = entry.substr(open + 1, entry.size() - open - 2);
  return true;
}

}  // namespace

const SimScpiSession::CommonEntry SimScpiSession::kCommon[] = {
    {"*IDN?", &SimScpiSession::Idn},      {"*RST", &SimScpiSession::Rst},
    {"*CLS", &SimScpiSession::Cls},       {"*ESR?", &SimScpiSession::EsrQuery},
    {"*ESE", &SimScpiSession::Ese},       {"*ESE?", &SimScpiSession::EseQuery},
    {"*OPC", &SimScpiSession::Opc},       {"*OPC?", &SimScpiSession::OpcQuery},
    {"*STB?", &SimScpiSession::StbQuery}, {"*SRE", &SimScpiSession::Sre},
    {"*SRE?", &SimScpiSession::SreQuery}, {"*WAI", &SimScpiSession::Wai},
    {"*TST?", &SimScpiSession::TstQuery},
};

SimScpiSession::SimScpiSession(SimCommandProcessor& processor, int connection)
    : mProcessor(processor), mConnection(connection) {
  mProcessor.LetQueriesPassLock(connection);
  EnsureHandle();
}

bool SimScpiSession::Execute(std::string_view message, Dstring& reply) {
  std::vector<std::string_view> units;
  ConditionList ignored;
  if (ParserExpression::SplitJoined(message, units, ignored) != 0) {
    Queue(-100, "Command error");
    return false;
  }
  DstringList replies;
  for (std::string_view unit : units) {
    unit = Trim(unit);
    if (!unit.empty()) RunUnit(unit, replies);
  }
  if (replies.empty()) return false;
  reply = replies.Join(";");
  return true;
}

std::uint8_t SimScpiSession::StatusByte() const {
  std::uint8_t stb = 0;
  if (!mErrors.IsEmpty()) stb |= kEav;
  if ((mEsr & mEse) != 0) stb |= kEsb;
  if ((stb & mSre) != 0) stb |= kMss;
  return stb;
}

void SimScpiSession::RunUnit(std::string_view unit, DstringList& replies) {
  const std::size_t blank = unit.find_first_of(" \t");
  const std::string_view header = unit.substr(0, blank);
  const std::string_view args = blank == std::string_view::npos ? std::string_view() : Trim(unit.substr(blank));
  if (header.starts_with('*')) return RunCommon(header, args, replies);
  if (IsErrorQuery(header)) {
    if (!args.empty()) return Queue(-108, "Parameter not allowed");
    return ErrQuery(args, replies);
  }
  RunInstrument(unit, replies);
}

void SimScpiSession::RunCommon(std::string_view header, std::string_view args, DstringList& replies) {
  const Dstring upper = Dstring(header).ToUpper();
  for (const CommonEntry& e : kCommon) {
    if (upper != e.header) continue;
    // Only *ESE and *SRE take a value.
    if (!args.empty() && upper != "*ESE" && upper != "*SRE") return Queue(-108, "Parameter not allowed");
    return (this->*e.run)(args, replies);
  }
  Queue(-113, "Undefined header");
}

void SimScpiSession::RunInstrument(std::string_view unit, DstringList& replies) {
  if (!EnsureHandle()) return Queue(-200, "Execution error");
  const Dstring text = ":" + mHandle + (unit.starts_with(':') ? "" : ":") + Dstring(unit);
  const SimReply reply = mProcessor.Execute(mConnection, text);
  if (reply.status == -19) return Queue(-203, "Command protected");
  if (reply.status > 0) TakeHandleErrors(reply.status);
  if (reply.status == 0 && SimCommand(unit).IsQuery()) replies.push_back(reply.text);
}

bool SimScpiSession::EnsureHandle() {
  if (!mHandle.empty()) return true;
  const SimReply reply = mProcessor.Execute(mConnection, ":QEN:INST:HAND:CRE? SCPI,\"PSX\",\"SCPI\"");
  if (reply.status == 0) mHandle = reply.text;
  return !mHandle.empty();
}

void SimScpiSession::Queue(int code, const Dstring& text) {
  mEsr |= EventBitOf(code);
  mErrors.Push(code, text);
}

void SimScpiSession::TakeHandleErrors(int count) {
  const Dstring query = ":" + mHandle + ":SYST:ERR?";
  for (int i = 0; i < count; ++i) {
    int code = 0;
    Dstring text;
    const SimReply reply = mProcessor.Execute(mConnection, query);
    if (reply.status != 0 || !ReadEntry(reply.text, code, text) || code == 0) return;
    Queue(code, text);
  }
}

bool SimScpiSession::ReadRegister(std::string_view args, std::uint8_t& value) {
  if (args.empty()) {
    Queue(-109, "Missing parameter");
    return false;
  }
  DataParcel items;
  ConditionList ignored;
  double number = 0;
  if (ParserExpression::Parse(args, items, ignored) != 0 || items.size() != 1 || !items[0].GetDouble(number)) {
    Queue(-104, "Data type error");
    return false;
  }
  number = std::round(number);
  if (!(number >= 0 && number <= 255)) {
    Queue(-222, "Data out of range");
    return false;
  }
  value = static_cast<std::uint8_t>(number);
  return true;
}

void SimScpiSession::Idn(std::string_view, DstringList& replies) {
  replies.push_back("Corvane,71300 qensim,0," QENSIM_VERSION);
}

// The setting goes back to its configured values, as a new setting; the status stays.
void SimScpiSession::Rst(std::string_view, DstringList& replies) {
  RunInstrument(":MMEM:SETT:NEW", replies);
}

void SimScpiSession::Cls(std::string_view, DstringList&) {
  mErrors.Clear();
  mEsr = 0;
}

void SimScpiSession::EsrQuery(std::string_view, DstringList& replies) {
  replies.push_back(std::to_string(mEsr));
  mEsr = 0;
}

void SimScpiSession::Ese(std::string_view args, DstringList&) {
  ReadRegister(args, mEse);
}

void SimScpiSession::EseQuery(std::string_view, DstringList& replies) {
  replies.push_back(std::to_string(mEse));
}

// Every operation is complete when its command returns.
void SimScpiSession::Opc(std::string_view, DstringList&) {
  mEsr |= kOpc;
}

void SimScpiSession::OpcQuery(std::string_view, DstringList& replies) {
  replies.push_back("1");
}

void SimScpiSession::StbQuery(std::string_view, DstringList& replies) {
  replies.push_back(std::to_string(StatusByte()));
}

// The summary bit is the status byte's own; its enable bit is ignored.
void SimScpiSession::Sre(std::string_view args, DstringList&) {
  std::uint8_t value = 0;
  if (ReadRegister(args, value)) mSre = static_cast<std::uint8_t>(value & ~kMss);
}

void SimScpiSession::SreQuery(std::string_view, DstringList& replies) {
  replies.push_back(std::to_string(mSre));
}

void SimScpiSession::Wai(std::string_view, DstringList&) {}

void SimScpiSession::TstQuery(std::string_view, DstringList& replies) {
  replies.push_back("0");
}

void SimScpiSession::ErrQuery(std::string_view, DstringList& replies) {
  replies.push_back(mErrors.Pop());
}
