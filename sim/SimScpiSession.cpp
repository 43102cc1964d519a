#include "SimScpiSession.h"

#include <cstdlib>

#include "SimScpiHeader.h"
#include "SimScpiReader.h"
#include "SimScpiValue.h"
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

// The texts of the errors the socket itself finds.
const char* TextOf(int code) {
  switch (code) {
    case -104:
      return "Data type error";
    case -108:
      return "Parameter not allowed";
    case -109:
      return "Missing parameter";
    case -113:
      return "Undefined header";
    case -131:
      return "Invalid suffix";
    case -138:
      return "Suffix not allowed";
    case -222:
      return "Data out of range";
    default:
      return "Execution error";
  }
}

// The first node of a canonical header.
Dstring FirstNode(const Dstring& header) {
  return header.substr(0, header.find_first_of(":?"));
}

// Queries answer, and so do the coupled queries and the search, which the language writes
// without a "?".
bool Answers(const Dstring& header) {
  const Dstring first = FirstNode(header);
  return header.EndsWith("?") || first == "VC" || first == "RC" || first == "SR";
}

std::string_view HeaderOf(std::string_view unit) {
  return unit.substr(0, unit.find_first_of(" \t"));
}

bool IsQueryUnit(std::string_view unit) {
  const std::string_view header = HeaderOf(unit);
  return header.ends_with('?') || (!header.starts_with('*') && Answers(SimScpiHeader::Canonical(header)));
}

// The text in upper case when it is short enough to be one of the words looked for; a block
// of data is never worth the conversion.
Dstring ShortUpper(std::string_view text) {
  return text.size() <= 8 ? Dstring(text).ToUpper() : Dstring();
}

// *WAI and *OPC? (without arguments) wait for the operations in progress.
bool Waits(std::string_view unit) {
  const Dstring upper = ShortUpper(unit);
  return upper == "*WAI" || upper == "*OPC?";
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
    {"*IDN?", &SimScpiSession::Idn, false},      {"*RST", &SimScpiSession::Rst, false},
    {"*CLS", &SimScpiSession::Cls, false},       {"*ESR?", &SimScpiSession::EsrQuery, false},
    {"*ESE", &SimScpiSession::Ese, true},        {"*ESE?", &SimScpiSession::EseQuery, false},
    {"*OPC", &SimScpiSession::Opc, false},       {"*OPC?", &SimScpiSession::OpcQuery, false},
    {"*OPT?", &SimScpiSession::OptQuery, false}, {"*STB?", &SimScpiSession::StbQuery, false},
    {"*SRE", &SimScpiSession::Sre, true},        {"*SRE?", &SimScpiSession::SreQuery, false},
    {"*WAI", &SimScpiSession::Wai, false},       {"*TST?", &SimScpiSession::TstQuery, false},
    {"*SAV", &SimScpiSession::Sav, true},        {"*RCL", &SimScpiSession::Rcl, true},
};

SimScpiSession::SimScpiSession(SimCommandProcessor& processor, int connection)
    : mProcessor(processor), mConnection(connection) {
  mProcessor.LetQueriesPassLock(connection);
  if (mProcessor.TakePowerOn()) mEsr = kPon;
  EnsureHandle();
  Sample();
}

// A message that asked anything is always answered, with what its queries produced, so a
// client never waits out its time-out for a query that failed. A command error ends the
// message there, as IEEE 488.2 has the parser skip to the terminator; other errors do not.
SimScpiSession::Outcome SimScpiSession::Execute(std::string message, Dstring& reply) {
  mUnits.clear();
  mNext = 0;
  mReplies.clear();
  // The units stay views into the message the session keeps while it runs: a data block is
  // never copied here. An indefinite-length block runs to the message's end; the language
  // takes it as a definite one of the same bytes.
  mMessage = std::move(message);
  if (const std::size_t at = SimScpiReader::FindIndefiniteBlock(mMessage); at != std::string::npos) {
    const std::string length = std::to_string(mMessage.size() - at - 2);
    mMessage.replace(at, 2, "#" + std::to_string(length.size()) + length);
  }
  ConditionList ignored;
  if (ParserExpression::SplitJoined(mMessage, mUnits, ignored) != 0) {
    mUnits.clear();
    Queue(-100, "Command error");
    reply.clear();
    return mMessage.find('?') != std::string::npos ? Outcome::Answered : Outcome::Silent;
  }
  mAsked = false;
  for (std::string_view& unit : mUnits) {
    unit = Trim(unit);
    mAsked = mAsked || IsQueryUnit(unit);
  }
  mCommandError = false;
  return Continue(reply);
}

SimScpiSession::Outcome SimScpiSession::Tick(Dstring& reply) {
  const std::uint16_t operation = Sample();
  if (mOpcArmed && (operation & SimScpiStatus::kPendingOperations) == 0) {
    mOpcArmed = false;
    mEsr |= kOpc;
  }
  return IsWaiting() ? Continue(reply) : Outcome::Silent;
}

SimScpiSession::Outcome SimScpiSession::Continue(Dstring& reply) {
  while (mNext < mUnits.size() && !mCommandError) {
    const std::string_view unit = mUnits[mNext];
    if (Waits(unit) && (Sample() & SimScpiStatus::kPendingOperations) != 0) return Outcome::Waiting;
    ++mNext;
    if (!unit.empty()) RunUnit(unit, mReplies);
  }
  mUnits.clear();
  mNext = 0;
  Sample();
  if (!mAsked) return Outcome::Silent;
  reply = mReplies.size() == 1 ? std::move(mReplies.front()) : mReplies.Join(";");
  mReplies.clear();
  return Outcome::Answered;
}

void SimScpiSession::DeviceClear() {
  mUnits.clear();
  mNext = 0;
  mReplies.clear();
  mOpcArmed = false;
}

bool SimScpiSession::IsDeviceClear(std::string_view message) {
  const Dstring upper = ShortUpper(Trim(message));
  return upper == "DCL" || upper == "SDC";
}

std::uint8_t SimScpiSession::StatusByte() const {
  std::uint8_t stb = mStatus.SummaryBits();
  if (!mErrors.IsEmpty()) stb |= kEav;
  if ((mEsr & mEse) != 0) stb |= kEsb;
  if ((stb & mSre) != 0) stb |= kMss;
  return stb;
}

void SimScpiSession::RunUnit(std::string_view unit, DstringList& replies) {
  const std::string_view header = HeaderOf(unit);
  const std::string_view args = Trim(unit.substr(header.size()));
  if (header.starts_with('*')) return RunCommon(header, args, replies);
  const Dstring canonical = SimScpiHeader::Canonical(header);
  if (canonical.StartsWith("SYST:ERR")) return RunError(canonical, args, replies);
  int error = 0;
  // A condition is the state now.
  if (canonical.StartsWith("STAT:")) Sample();
  if (mStatus.Run(canonical, args, replies, error)) {
    if (error != 0) Queue(error, TextOf(error));
    return;
  }
  RunInstrument(canonical, args, replies);
}

void SimScpiSession::RunCommon(std::string_view header, std::string_view args, DstringList& replies) {
  const Dstring upper = Dstring(header).ToUpper();
  for (const CommonEntry& e : kCommon) {
    if (upper != e.header) continue;
    if (!args.empty() && !e.takesValue) return Queue(-108, "Parameter not allowed");
    return (this->*e.run)(args, replies);
  }
  Queue(-113, "Undefined header");
}

// SYSTem:ERRor[:NEXT]?, :ALL? (every entry, oldest first, and the queue is empty) and :COUNt?.
void SimScpiSession::RunError(const Dstring& header, std::string_view args, DstringList& replies) {
  if (header != "SYST:ERR?" && header != "SYST:ERR:ALL?" && header != "SYST:ERR:COUN?") {
    return Queue(-113, "Undefined header");
  }
  if (!args.empty()) return Queue(-108, "Parameter not allowed");
  if (header == "SYST:ERR:COUN?") return replies.push_back(std::to_string(mErrors.Count()));
  DstringList entries;
  entries.push_back(mErrors.Pop());
  while (header == "SYST:ERR:ALL?" && !mErrors.IsEmpty()) entries.push_back(mErrors.Pop());
  replies.push_back(entries.Join(","));
}

void SimScpiSession::RunInstrument(const Dstring& header, std::string_view args, DstringList& replies) {
  if (!EnsureHandle()) return Queue(-200, "Execution error");
  const bool query = header.EndsWith("?");
  Dstring text = Addressed(header);
  if (!args.empty()) text += " ";
  Dstring value;
  std::size_t index = 0;
  std::size_t initial = 0;
  const Dstring bare = ":" + Dstring(header.substr(0, header.size() - (query ? 1 : 0)));
  if (!args.empty() && mProcessor.Params().Find(bare, index) && mProcessor.GetInitialParams().Find(bare, initial)) {
    const SimParam& param = mProcessor.Params().At(index);
    const SimParam& configured = mProcessor.GetInitialParams().At(initial);
    const SimScpiValue::Keyword keyword = SimScpiValue::KeywordOf(args);
    if (query && keyword != SimScpiValue::Keyword::None && (param.IsNumeric() || keyword == SimScpiValue::Keyword::Def)) {
      return replies.push_back(SimScpiValue::Of(keyword, param, configured));
    }
    if (!query) {
      if (int rc = SimScpiValue::Resolve(args, param, configured, value)) return Queue(rc, TextOf(rc));
    }
  }
  // Data blocks are large: the arguments are copied once, straight into the command, which
  // the handle keeps as its last batch, handing back the room of the one before.
  mText.assign(text);
  mText.append(value.empty() ? args : std::string_view(value));
  SimReply reply = mProcessor.ExecuteTaking(mConnection, mText);
  if (reply.status == -19) return Queue(-203, "Command protected");
  // Handle-free commands leave their errors on the connection's queue, which the error query
  // of any name that is no handle reads; test control plants errors without failing.
  const Dstring first = FirstNode(header);
  if (first == "TEST" || first == "QEN") TakeErrors("TEST", kAll);
  if (reply.status > 0 || first == "TEST") TakeErrors(mHandle, kAll);
  if (reply.status == 0 && Answers(header)) replies.push_back(std::move(reply.text));
}

// The header with this connection's handle where the language wants it: first, or after a
// prefix word; the handle-free commands (test control, handles) go as they are.
Dstring SimScpiSession::Addressed(const Dstring& header) const {
  const Dstring first = FirstNode(header);
  const Dstring rest = header.substr(first.size());
  for (const char* word : {"VC", "RC", "SR", "L"}) {
    if (first == word) return ":" + first + ":" + mHandle + rest;
  }
  if (first == "TEST" || first == "QEN") return ":" + header;
  return ":" + mHandle + ":" + header;
}

bool SimScpiSession::EnsureHandle() {
  if (!mHandle.empty()) return true;
  const SimReply reply = mProcessor.Execute(mConnection, ":QEN:INST:HAND:CRE? SCPI,\"PSX\",\"SCPI\"");
  if (reply.status == 0) mHandle = reply.text;
  return !mHandle.empty();
}

Dstring SimScpiSession::Ask(const char* header) {
  const SimReply reply = mProcessor.Execute(mConnection, ":" + mHandle + ":" + header);
  return reply.status == 0 ? reply.text : Dstring();
}

std::uint16_t SimScpiSession::Sample() {
  if (!EnsureHandle()) return 0;
  struct Source {
    const char* query;
    const char* word;  // the reply starts with it when the bit is set
    std::uint16_t bit;
  };
  static constexpr Source kOperation[] = {
      {"SYST:DESK:STAT?", "RUNN", SimScpiStatus::kCalibrating},
      {"SGEN:GLOB:INIT:CONT?", "ON", SimScpiStatus::kMeasuring},
      {"SGEN:GLOB:SYST:STAT?", "SYNC", SimScpiStatus::kSynchronising},
      {"SYST:TEST:STAT?", "RUNN", SimScpiStatus::kSelfTest},
      {"CAPT:STAT?", "RUNN", SimScpiStatus::kCapturing},
  };
  std::uint16_t operation = 0;
  for (const Source& s : kOperation) {
    if (Ask(s.query).StartsWith(s.word)) operation |= s.bit;
  }
  const std::uint16_t questionable = Ask("SGEN:GLOB:PLL:STAT?") == "LOCK" ? 0 : SimScpiStatus::kPllUnlocked;
  mStatus.Sample(operation, questionable);
  return operation;
}

void SimScpiSession::Queue(int code, const Dstring& text) {
  mEsr |= EventBitOf(code);
  mCommandError = mCommandError || EventBitOf(code) == kCme;
  mErrors.Push(code, text);
}

// Moves up to `count` errors, oldest first, from the queue that `owner`'s error query reads.
void SimScpiSession::TakeErrors(const Dstring& owner, int count) {
  const Dstring query = ":" + owner + ":SYST:ERR?";
  for (int i = 0; i < count; ++i) {
    int code = 0;
    Dstring text;
    const SimReply reply = mProcessor.Execute(mConnection, query);
    if (reply.status != 0 || !ReadEntry(reply.text, code, text) || code == 0) return;
    Queue(code, text);
  }
}

bool SimScpiSession::ReadValue(std::string_view args, int max, int& value) {
  const int rc = SimScpiStatus::ReadMask(args, max, value);
  if (rc != 0) Queue(rc, TextOf(rc));
  return rc == 0;
}

void SimScpiSession::Idn(std::string_view, DstringList& replies) {
  replies.push_back("Corvane,71300 qensim,0," QENSIM_VERSION);
}

// Stopped, every task ended, and a new setting: the configured values, the sequence of the
// start and the default wiring. The status registers and the error queue stay.
void SimScpiSession::Rst(std::string_view, DstringList&) {
  const Dstring h = ":" + mHandle;
  const SimReply reply = mProcessor.Execute(mConnection, h + ":SYST:TEST:ABOR;" + h + ":SYST:DESK:ABOR;" + h +
                                                             ":CAPT:ABOR;" + h + ":SGEN:GLOB:INIT:CONT OFF;" + h +
                                                             ":MMEM:SETT:NEW");
  if (reply.status == -19) return Queue(-203, "Command protected");
  if (reply.status > 0) TakeErrors(mHandle, kAll);
}

void SimScpiSession::Cls(std::string_view, DstringList&) {
  mErrors.Clear();
  mEsr = 0;
  mStatus.ClearEvents();
  mOpcArmed = false;
}

void SimScpiSession::EsrQuery(std::string_view, DstringList& replies) {
  replies.push_back(std::to_string(mEsr));
  mEsr = 0;
}

void SimScpiSession::Ese(std::string_view args, DstringList&) {
  int value = 0;
  if (ReadValue(args, 255, value)) mEse = static_cast<std::uint8_t>(value);
}

void SimScpiSession::EseQuery(std::string_view, DstringList& replies) {
  replies.push_back(std::to_string(mEse));
}

void SimScpiSession::Opc(std::string_view, DstringList&) {
  if ((Sample() & SimScpiStatus::kPendingOperations) != 0) {
    mOpcArmed = true;
  } else {
    mEsr |= kOpc;
  }
}

// Reached only when the operations are done (Continue waits before it).
void SimScpiSession::OpcQuery(std::string_view, DstringList& replies) {
  replies.push_back("1");
}

// The options are the modules in the rack, by model, in rack order.
void SimScpiSession::OptQuery(std::string_view, DstringList& replies) {
  DstringList models;
  const SimParamTable& params = mProcessor.Params();
  for (std::size_t i = 0; i < params.Size(); ++i) {
    const SimParam& p = params.At(i);
    if (p.GetHeader().EndsWith(":TYPE") && p.GetType() == SimParamType::String) models.push_back(p.GetText());
  }
  replies.push_back(models.empty() ? Dstring("0") : models.Join(","));
}

void SimScpiSession::StbQuery(std::string_view, DstringList& replies) {
  Sample();
  replies.push_back(std::to_string(StatusByte()));
}

// The summary bit is the status byte's own; its enable bit is ignored.
void SimScpiSession::Sre(std::string_view args, DstringList&) {
  int value = 0;
  if (ReadValue(args, 255, value)) mSre = static_cast<std::uint8_t>(value & ~kMss);
}

void SimScpiSession::SreQuery(std::string_view, DstringList& replies) {
  replies.push_back(std::to_string(mSre));
}

// Reached only when the operations are done (Continue waits before it).
void SimScpiSession::Wai(std::string_view, DstringList&) {}

void SimScpiSession::TstQuery(std::string_view, DstringList& replies) {
  replies.push_back("0");
}

// The numbered states are settings named "state0" … "state9" on the instrument.
void SimScpiSession::Sav(std::string_view args, DstringList& replies) {
  int n = 0;
  if (ReadValue(args, kMaxSaved, n)) RunInstrument("MMEM:SETT:SAVE", Dstring::Format("\"state%d\"", n), replies);
}

void SimScpiSession::Rcl(std::string_view args, DstringList& replies) {
  int n = 0;
  if (ReadValue(args, kMaxSaved, n)) RunInstrument("MMEM:SETT:LOAD", Dstring::Format("\"state%d\",ON", n), replies);
}
