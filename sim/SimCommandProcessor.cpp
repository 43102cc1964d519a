#include "SimCommandProcessor.h"

#include "SimBerMeter.h"
#include "SimCapture.h"
#include "SimCabling.h"
#include "SimChannelErrors.h"
#include "SimDeskew.h"
#include "SimSelfTest.h"
#include "SimSegmentStore.h"
#include "SimSequence.h"
#include "SimSettingStore.h"

#include <cctype>
#include <chrono>
#include <climits>
#include <thread>

#include "support/ConditionList.h"
#include "support/ParserExpression.h"

namespace {

struct ErrorText {
  int code;
  const char* text;
};

constexpr ErrorText kErrorTexts[] = {
    {-100, "Command error"},           {-104, "Data type error"}, {-109, "Missing parameter"},
    {-113, "Undefined header"},        {-200, "Execution error"}, {-221, "Settings conflict"},
    {-222, "Data out of range"},
    {-224, "Illegal parameter value"}, {-250, "Mass storage error"}, {-256, "File name not found"},
    {-257, "File name error"}, {SimContext::kCancelled, "Cancelled by the client"},
};

struct SwitchWord {
  const char* word;
  bool on;
};

constexpr SwitchWord kSwitchWords[] = {{"ON", true}, {"OFF", false}, {"1", true}, {"0", false}};

struct LimitWord {
  const char* word;
  double (SimParam::*get)() const;
};

constexpr LimitWord kLimitWords[] = {
    {"HLIM", &SimParam::GetHlim},
    {"LLIM", &SimParam::GetLlim},
    {"HMAX", &SimParam::GetHmax},
    {"LMAX", &SimParam::GetLmax},
};

// First path elements that are not handles; a handle can never be named like them.
constexpr const char* kReservedWords[] = {"QEN", "TEST", "VC", "RC", "SR", "L"};
constexpr const char* kPrefixWords[] = {"VC", "RC", "SR", "L"};

constexpr std::size_t kMaxHandleLength = 32;
constexpr long kMaxDelayMs = 600000;
constexpr long kMaxBigBytes = 64L * 1024 * 1024;

const char* TextOf(int code) {
  for (const ErrorText& e : kErrorTexts) {
    if (e.code == code) return e.text;
  }
  return "Execution error";
}

template <std::size_t N>
bool IsOneOf(const char* const (&words)[N], const Dstring& word) {
  for (const char* w : words) {
    if (word == w) return true;
  }
  return false;
}

bool IsHandleName(const Dstring& name) {
  if (name.empty() || name.size() > kMaxHandleLength) return false;
  for (char c : name) {
    if (!std::isalnum(static_cast<unsigned char>(c)) && c != '_') return false;
  }
  return true;
}

// The n-th letter suffix: A, B, ..., Z, AA, AB, ...
Dstring Letters(unsigned long n) {
  Dstring out;
  for (++n; n > 0; n /= 26) {
    --n;
    out.insert(out.begin(), static_cast<char>('A' + n % 26));
  }
  return out;
}

Dstring Pattern(std::size_t bytes) {
  Dstring out(bytes, '\0');
  for (std::size_t i = 0; i < bytes; ++i) out[i] = static_cast<char>('0' + i % 10);
  return out;
}

}  // namespace

const SimCommandProcessor::Entry SimCommandProcessor::kHandleCommands[] = {
    {":SYST:ERR", &SimCommandProcessor::QueryError, nullptr, false},
    {":DFL", &SimCommandProcessor::QueryDirty, nullptr, false},
    {":SYST:LOCK", &SimCommandProcessor::QueryLock, &SimCommandProcessor::WriteLock, false},
    {":SGEN:GLOB:INIT:CONT", &SimCommandProcessor::QueryRunning, &SimCommandProcessor::WriteRunning, false},
    {":SGEN:GLOB:SYST:STAT", &SimCommandProcessor::QuerySystem, nullptr, false},
    {":SGEN:GLOB:PLL:STAT", &SimCommandProcessor::QueryPll, nullptr, false},
    {":SGEN:GLOB:CONN", &SimCommandProcessor::QueryConnected, &SimCommandProcessor::WriteConnected, false},
    {":SGEN:GLOB:SEQ:FORC", nullptr, &SimCommandProcessor::ForceSequence, false},
    {":SYST:VERS", &SimCommandProcessor::QueryVersion, nullptr, false},
};

const SimCommandProcessor::Entry SimCommandProcessor::kGlobalCommands[] = {
    {":QEN:INST:HAND:CRE", &SimCommandProcessor::CreateHandle, nullptr, false},
    {":QEN:INST:HAND:DEST", nullptr, &SimCommandProcessor::DestroyHandle, false},
    {":TEST:LOCK", nullptr, &SimCommandProcessor::TestLock, true},
    {":TEST:DELAY", nullptr, &SimCommandProcessor::TestDelay, true},
    {":TEST:DROP", nullptr, &SimCommandProcessor::TestDrop, true},
    {":TEST:DIE", nullptr, &SimCommandProcessor::TestDie, true},
    {":TEST:ERR", nullptr, &SimCommandProcessor::TestErr, true},
    {":TEST:MALF", nullptr, &SimCommandProcessor::TestMalformed, true},
    {":TEST:BIG", nullptr, &SimCommandProcessor::TestBig, true},
    {":TEST:SET", nullptr, &SimCommandProcessor::TestSet, true},
    {":TEST:STAT", nullptr, &SimCommandProcessor::TestStat, true},
    {":TEST:ECHO", nullptr, &SimCommandProcessor::TestEcho, true},
};

SimCommandProcessor::SimCommandProcessor(SimParamTable params, const SimClock& clock, bool testControl,
                                         Dstring dataDir)
    : mParams(std::move(params)), mInitialParams(mParams), mClock(clock), mTestControl(testControl) {
  // The modules, one line each; the data directory is theirs to keep files in.
  auto connections = std::make_shared<SimCabling>(mParams.GetRack());
  auto sequence = std::make_shared<SimSequence>(mParams);
  mModules.push_back(std::make_shared<SimSettingStore>(mParams, dataDir, sequence, connections));
  mModules.push_back(connections);
  auto ber = std::make_shared<SimBerMeter>(connections);
  auto segments = std::make_shared<SimSegmentStore>(dataDir);
  mModules.push_back(ber);
  mModules.push_back(sequence);
  mModules.push_back(segments);
  mModules.push_back(std::make_shared<SimSelfTest>());
  mModules.push_back(std::make_shared<SimDeskew>());
  auto capture = std::make_shared<SimCapture>(sequence, segments, ber, connections);
  mModules.push_back(capture);
  mModules.push_back(std::make_shared<SimChannelErrors>(ber, capture));
}

SimReply SimCommandProcessor::Execute(int connection, std::string_view text, SimWorkListener* listener) {
  return Run(connection, text, listener, nullptr);
}

SimReply SimCommandProcessor::ExecuteTaking(int connection, std::string& text, SimWorkListener* listener) {
  return Run(connection, text, listener, &text);
}

SimReply SimCommandProcessor::Run(int connection, std::string_view text, SimWorkListener* listener,
                                  std::string* taken) {
  ResetFrame(connection);
  mListener = listener;
  NoteStates(mGlobal.Advance(mClock.NowMs()));
  for (auto& module : mModules) module->Advance(*this);
  if (IsRefused(text)) return SimReply{"", -19, SimReplyAction::Send, 0};
  int delayMs = mSessions[connection].TakeDelay();
  // Only the header decides the kind of request: a data block after it is not copied for that.
  SimCommand first(text.substr(0, text.find_first_of(" \t", std::min(text.size(), text.find_first_not_of(" \t")))));
  const DstringList& path = first.GetPath();
  if (!path.empty() && (path[0] == "VC" || path[0] == "RC")) {
    // The batch starts at the colon after the prefix word.
    std::size_t colon = path.size() > 1 ? text.find(':', text.find_first_not_of(" \t:") + 1) : text.npos;
    RunCoupledQuery(path[0] == "VC", colon == text.npos ? std::string_view() : text.substr(colon));
  } else {
    RunBatch(text);
    RecordBatch(text, taken);
  }
  mListener = nullptr;
  return FinishFrame(delayMs);
}

bool SimCommandProcessor::Step(long long done, long long total, int waitMs) {
  if (mListener) return mListener->Step(done, total, waitMs);
  if (waitMs > 0) std::this_thread::sleep_for(std::chrono::milliseconds(waitMs));
  return true;
}

void SimCommandProcessor::Disconnect(int connection) {
  std::erase_if(mHandles, [connection](const auto& entry) { return entry.second.GetOwner() == connection; });
  // A phantom lock goes with the test that set it up, so a crashed test cannot wedge the server.
  bool phantomGone = mLockHolder == kPhantom && mPhantomArmer == connection;
  if (mLockHolder == connection || phantomGone) mLockHolder = kNobody;
  mSessions.erase(connection);
  mQueriesPassLock.erase(connection);
}

void SimCommandProcessor::MarkAllDirty() {
  for (auto& [name, handle] : mHandles) handle.Dirty().MarkAll();
}

void SimCommandProcessor::ResetFrame(int connection) {
  mConnection = connection;
  mHandle.clear();
  mTarget = &mSessions[connection].Errors();
  mErrors = 0;
  mReplies.clear();
  mBareHeaders.clear();
  mAction = SimReplyAction::Send;
  mBatchValues.clear();
  mBatchLimits.clear();
  mBatchHandles.clear();
}

SimReply SimCommandProcessor::FinishFrame(int delayMs) {
  SimReply reply{mReplies.size() == 1 ? std::move(mReplies.front()) : mReplies.Join(";"), mErrors, mAction, delayMs};
  SimSession& session = mSessions[mConnection];
  for (const Dstring& header : mBareHeaders) {
    if (session.TakeMalformed(header, reply.text)) break;
  }
  return reply;
}

// Queries that make or open something: under another client's lock they are writes.
bool SimCommandProcessor::ChangesTheInstrument(const SimCommand& cmd) const {
  static const char* const kChangingQueries[] = {":EDIT:SEGM:CRE?", ":EDIT:SEGM:OPEN?"};
  const Dstring bare = BareHeader(cmd);
  for (const char* header : kChangingQueries) {
    if (bare == header) return true;
  }
  return false;
}

bool SimCommandProcessor::IsRefused(std::string_view text) const {
  if (mLockHolder == kNobody || mLockHolder == mConnection) return false;
  const bool queriesPass = mQueriesPassLock.contains(mConnection);
  if (!mTestControl && !queriesPass) return true;
  // Test control stays usable under a lock so that a test can always undo what it set up.
  std::vector<std::string_view> parts;
  ConditionList ignored;
  if (ParserExpression::SplitJoined(text, parts, ignored) != 0) return true;
  for (std::string_view part : parts) {
    SimCommand cmd(part);
    if (cmd.GetPath().empty()) continue;
    const bool passes =
        (mTestControl && cmd.GetPath()[0] == "TEST") || (queriesPass && cmd.IsQuery() && !ChangesTheInstrument(cmd));
    if (!passes) return true;
  }
  return false;
}

void SimCommandProcessor::RunBatch(std::string_view text) {
  std::vector<std::string_view> parts;
  ConditionList ignored;
  if (ParserExpression::SplitJoined(text, parts, ignored) != 0) {
    UseFrameTarget(text);
    Error(-100);
    return;
  }
  for (std::string_view part : parts) {
    if (part.find_first_not_of(" \t\r\n") == std::string_view::npos) continue;
    RunCommand(SimCommand(part));
    if (mAction != SimReplyAction::Send) return;
  }
}

// The first handle takes the text over when it may; the others copy what it keeps.
void SimCommandProcessor::RecordBatch(std::string_view text, std::string* taken) {
  for (const Dstring& name : mBatchHandles) {
    auto it = mHandles.find(name);
    if (it == mHandles.end()) continue;
    std::vector<std::size_t> values(mBatchValues.begin(), mBatchValues.end());
    std::vector<std::size_t> limits(mBatchLimits.begin(), mBatchLimits.end());
    if (taken == nullptr) {
      it->second.SetLastBatch(text, std::move(values), std::move(limits));
      continue;
    }
    it->second.TakeLastBatch(*taken, std::move(values), std::move(limits));
    text = it->second.GetLastBatch();
    taken = nullptr;
  }
}

// Errors that belong to no single command go where the client will look for them: the queue
// of the handle it names the way the client finds it.
void SimCommandProcessor::UseFrameTarget(std::string_view text) {
  SimCommand cmd(text);
  const DstringList& path = cmd.GetPath();
  std::size_t at = !path.empty() && IsOneOf(kPrefixWords, path[0]) ? 1 : 0;
  if (at < path.size()) UseHandle(path[at]);
}

void SimCommandProcessor::RunCommand(const SimCommand& cmd) {
  mHandle.clear();
  mTarget = &mSessions[mConnection].Errors();
  const DstringList& path = cmd.GetPath();
  if (path.empty()) return Error(-100);
  mBareHeaders.push_back(BareHeader(cmd));
  if (RunHandleCommand(cmd) || RunGlobalCommand(cmd)) return;
  if (path[0] == "SR") return SearchParam(cmd);
  if (path[0] == "L") return ListParams(cmd);
  // A handle nobody holds: its queue is the connection's, where its errors went.
  if (cmd.IsQuery() && cmd.PathFrom(1) == ":SYST:ERR") return QueryError(cmd);
  Error(-113);
}

Dstring SimCommandProcessor::BareHeader(const SimCommand& cmd) const {
  const DstringList& path = cmd.GetPath();
  Dstring bare = cmd.PathFrom(0);
  if (mHandles.contains(path[0])) bare = cmd.PathFrom(1);
  if (IsOneOf(kPrefixWords, path[0])) bare = ":" + path[0] + cmd.PathFrom(2);
  return cmd.IsQuery() ? bare + "?" : bare;
}

bool SimCommandProcessor::RunHandleCommand(const SimCommand& cmd) {
  if (!UseHandle(cmd.GetPath()[0])) return false;
  Dstring rest = cmd.PathFrom(1);
  for (const Entry& e : kHandleCommands) {
    if (rest == e.path) {
      RunEntry(e, cmd);
      return true;
    }
  }
  for (auto& module : mModules) {
    if (!mDryRun && module->RunHandleCommand(rest, cmd, *this)) return true;
  }
  std::size_t index = 0;
  if (mParams.Find(rest, index)) {
    RunParam(index, cmd);
  } else if (rest.EndsWith(":ATTR") && mParams.Find(rest.substr(0, rest.size() - 5), index)) {
    RunAttr(index, cmd);
  } else {
    Error(-113);
  }
  return true;
}

bool SimCommandProcessor::RunGlobalCommand(const SimCommand& cmd) {
  Dstring full = cmd.PathFrom(0);
  for (const Entry& e : kGlobalCommands) {
    if (full == e.path && (mTestControl || !e.testControl)) {
      RunEntry(e, cmd);
      return true;
    }
  }
  return false;
}

void SimCommandProcessor::RunEntry(const Entry& entry, const SimCommand& cmd) {
  Handler handler = cmd.IsQuery() ? entry.query : entry.write;
  if (handler == nullptr) return Error(cmd.IsQuery() ? -113 : -200);
  (this->*handler)(cmd);
}

void SimCommandProcessor::RunParam(std::size_t index, const SimCommand& cmd) {
  const SimParam& param = mParams.At(index);
  if (cmd.IsQuery()) return cmd.HasArgs() ? QueryLimit(index, cmd) : Reply(param.FormatValue());
  if (param.IsReadOnly()) return Error(-200);
  if (!cmd.HasArgs()) return Error(-109);
  if (int rc = mParams.Write(index, cmd.GetArgs()); rc != 0) return Error(rc);
  // A write names its parameter to VC even when the value stayed, so the writer re-reads it.
  mBatchValues.insert(index);
  NoteParamChanges(mHandle);
}

void SimCommandProcessor::QueryLimit(std::size_t index, const SimCommand& cmd) {
  const SimParam& param = mParams.At(index);
  const Dstring word = Dstring(cmd.GetArgs()).ToUpper();
  if (word == "CLAS") return Reply(mParams.IsClashing(index) ? "1" : "0");
  for (const LimitWord& limit : kLimitWords) {
    if (word == limit.word && param.IsNumeric()) return Reply(param.FormatNumber((param.*limit.get)()));
  }
  Error(-224);
}

void SimCommandProcessor::RunAttr(std::size_t index, const SimCommand& cmd) {
  const SimParam& param = mParams.At(index);
  if (!param.IsNumeric()) return Error(-113);
  if (cmd.IsQuery()) return Reply(param.GetAttr().Format());
  if (!cmd.HasArgs()) return Error(-109);
  if (int rc = mParams.WriteAttr(index, cmd.GetArgs()); rc != 0) return Error(rc);
  // The writer too: a client applies a new attribute only when the change set reports it.
  MarkDirty(param.GetHeader() + ":ATTR", "");
}

bool SimCommandProcessor::UseHandle(const Dstring& name) {
  auto it = mHandles.find(name);
  if (it == mHandles.end()) return false;
  mHandle = name;
  mTarget = &it->second.Errors();
  mBatchHandles.insert(name);
  return true;
}

Dstring SimCommandProcessor::QuotedHeaders(const std::vector<std::size_t>& indices) const {
  DstringList quoted;
  for (std::size_t i : indices) {
    quoted.push_back(Dstring::Format("\":%s%s\"", mHandle.c_str(), mParams.At(i).GetHeader().c_str()));
  }
  return quoted.Join(",");
}

void SimCommandProcessor::RunCoupledQuery(bool values, std::string_view batch) {
  SimCommand first(batch);
  mBareHeaders.push_back(Dstring(values ? ":VC" : ":RC") + first.PathFrom(1) + (first.IsQuery() ? "?" : ""));
  if (first.GetPath().empty() || !UseHandle(first.GetPath()[0])) return Error(-113);
  const SimHandle& handle = mHandles.at(mHandle);
  if (handle.GetLastBatch() == batch) {
    return Reply(QuotedHeaders(values ? handle.GetLastValues() : handle.GetLastLimits()));
  }
  // Not what this handle ran last: say what the batch would change, on a copy of everything.
  SimCommandProcessor dry(*this);
  dry.mDryRun = true;
  dry.ResetFrame(mConnection);
  dry.RunBatch(batch);
  const std::set<std::size_t>& changed = values ? dry.mBatchValues : dry.mBatchLimits;
  Reply(QuotedHeaders({changed.begin(), changed.end()}));
}

void SimCommandProcessor::SearchParam(const SimCommand& cmd) {
  const DstringList& path = cmd.GetPath();
  if (path.size() < 3 || !UseHandle(path[1])) return Error(-113);
  unsigned long number = mParams.Search(cmd.PathFrom(2));
  if (number == 0) return Error(-113);
  Reply(Dstring::Format("%lu", number));
}

void SimCommandProcessor::ListParams(const SimCommand& cmd) {
  const DstringList& path = cmd.GetPath();
  if (path.size() < 2 || !UseHandle(path[1])) return Error(-113);
  Reply(QuotedHeaders(mParams.WithPrefix(cmd.PathFrom(2))));
}

void SimCommandProcessor::QueryError(const SimCommand&) {
  Reply(mTarget->Pop());
}

void SimCommandProcessor::QueryVersion(const SimCommand&) { Reply("\"qensim " QENGUI_VERSION "\""); }

void SimCommandProcessor::QueryDirty(const SimCommand&) {
  Reply(mHandles.at(mHandle).Dirty().TakeReply(mHandle));
}

void SimCommandProcessor::QueryLock(const SimCommand&) {
  Reply(mLockHolder == mConnection ? "ON" : "OFF");
}

void SimCommandProcessor::WriteLock(const SimCommand& cmd) {
  bool on = false;
  if (!ReadSwitch(cmd, on)) return;
  if (on) mLockHolder = mConnection;
  if (!on && mLockHolder == mConnection) mLockHolder = kNobody;
}

void SimCommandProcessor::QueryRunning(const SimCommand&) {
  Reply(mGlobal.IsRunning() ? "ON" : "OFF");
}

void SimCommandProcessor::WriteRunning(const SimCommand& cmd) {
  bool on = false;
  if (ReadSwitch(cmd, on)) NoteStates(mGlobal.SetRunning(on, mClock.NowMs()), SimGlobalState::kContHeader);
}

void SimCommandProcessor::QuerySystem(const SimCommand&) {
  Reply(mGlobal.GetSystemWord());
}

void SimCommandProcessor::QueryPll(const SimCommand&) {
  Reply(mGlobal.GetPllWord());
}

void SimCommandProcessor::QueryConnected(const SimCommand&) {
  Reply(mGlobal.IsConnected() ? "ON" : "OFF");
}

void SimCommandProcessor::WriteConnected(const SimCommand& cmd) {
  bool on = false;
  if (ReadSwitch(cmd, on)) NoteStates(mGlobal.SetConnected(on), SimGlobalState::kConnHeader);
}

void SimCommandProcessor::ForceSequence(const SimCommand&) {
  NoteStates(mGlobal.ForceSequence(mClock.NowMs()));
}

void SimCommandProcessor::CreateHandle(const SimCommand& cmd) {
  DataParcel items;
  if (!ReadArgs(cmd, items, 3, 3)) return;
  if (!items[0].IsText() || !items[1].IsText() || !items[2].IsText()) return Error(-104);
  Dstring proposal = Dstring(items[0].GetText()).ToUpper();
  if (!IsHandleName(proposal) || Dstring(items[1].GetText()).ToUpper() != "PSX") return Error(-224);
  Dstring name = FreeHandleName(proposal);
  mHandles.emplace(name, SimHandle(mConnection));
  Reply(name);
}

Dstring SimCommandProcessor::FreeHandleName(const Dstring& proposal) const {
  auto taken = [this](const Dstring& name) {
    return mHandles.contains(name) || IsOneOf(kReservedWords, name);
  };
  if (!taken(proposal)) return proposal;
  // Letters, never digits: a handle ending in a digit would read as part of a header.
  for (unsigned long n = 0;; ++n) {
    Dstring candidate = proposal + Letters(n);
    if (!taken(candidate)) return candidate;
  }
}

void SimCommandProcessor::DestroyHandle(const SimCommand& cmd) {
  if (!cmd.HasArgs()) return Error(-109);
  if (mHandles.erase(Dstring(cmd.GetArgs()).ToUpper()) == 0) Error(-224);
}

void SimCommandProcessor::TestLock(const SimCommand& cmd) {
  bool on = false;
  if (!ReadSwitch(cmd, on)) return;
  if (on) mPhantomArmer = mConnection;
  if (on) mLockHolder = kPhantom;
  if (!on && mLockHolder == kPhantom) mLockHolder = kNobody;
}

void SimCommandProcessor::TestDelay(const SimCommand& cmd) {
  DataParcel items;
  long ms = 0, count = 1;
  if (!ReadArgs(cmd, items, 1, 3)) return;
  if (!items[0].GetLong(ms) || (items.size() >= 2 && !items[1].GetLong(count))) return Error(-104);
  // ALL: every connection open now is slowed, so that a client without test commands of its
  // own (a host, a script) can be seen waiting.
  const bool all = items.size() == 3;
  if (all && Dstring(items[2].GetText()).ToUpper() != "ALL") return Error(-224);
  if (ms < 0 || ms > kMaxDelayMs || count < 1 || count > INT_MAX) return Error(-222);
  if (!all) return mSessions[mConnection].ArmDelay(static_cast<int>(ms), static_cast<int>(count));
  for (auto& [connection, session] : mSessions) {
    if (connection != mConnection) session.ArmDelay(static_cast<int>(ms), static_cast<int>(count));
  }
}

void SimCommandProcessor::TestDrop(const SimCommand&) {
  mAction = SimReplyAction::Drop;
}

void SimCommandProcessor::TestDie(const SimCommand&) {
  mAction = SimReplyAction::Die;
}

void SimCommandProcessor::TestErr(const SimCommand& cmd) {
  DataParcel items;
  long code = 0;
  if (!ReadArgs(cmd, items, 3, 3)) return;
  if (!items[0].IsText() || !items[1].GetLong(code) || items[2].GetType() != DataItemType::String)
    return Error(-104);
  if (code < INT_MIN || code > INT_MAX) return Error(-222);
  auto it = mHandles.find(Dstring(items[0].GetText()).ToUpper());
  if (it == mHandles.end()) return Error(-224);
  // Planted, not caused by this command: the status of this frame stays 0.
  it->second.Errors().Push(static_cast<int>(code), Dstring(items[2].GetText()));
}

void SimCommandProcessor::TestMalformed(const SimCommand& cmd) {
  DataParcel items;
  long count = 1;
  if (!ReadArgs(cmd, items, 2, 3)) return;
  if (!items[0].IsText() || !items[1].IsText() || (items.size() == 3 && !items[2].GetLong(count))) {
    return Error(-104);
  }
  if (count < 0 || count > INT_MAX) return Error(-222);
  mSessions[mConnection].ArmMalformed(Dstring(items[0].GetText()).ToUpper(), Dstring(items[1].GetText()),
                                      static_cast<int>(count));
}

void SimCommandProcessor::TestBig(const SimCommand& cmd) {
  DataParcel items;
  long bytes = 0;
  if (!ReadArgs(cmd, items, 1, 1)) return;
  if (!items[0].GetLong(bytes)) return Error(-104);
  if (bytes < 0 || bytes > kMaxBigBytes) return Error(-222);
  Reply(Pattern(static_cast<std::size_t>(bytes)));
}

void SimCommandProcessor::TestEcho(const SimCommand& cmd) { Reply(Dstring(cmd.GetArgs())); }

void SimCommandProcessor::TestSet(const SimCommand& cmd) {
  std::size_t comma = cmd.GetArgs().find(',');
  if (comma == Dstring::npos) return Error(-109);
  std::size_t index = 0;
  if (!mParams.Find(Dstring(cmd.GetArgs().substr(0, comma)).Trimmed(), index)) return Error(-113);
  if (int rc = mParams.Write(index, Dstring(cmd.GetArgs().substr(comma + 1)).Trimmed()); rc != 0)
    return Error(rc);
  NoteParamChanges("");
}

void SimCommandProcessor::TestStat(const SimCommand& cmd) {
  DataParcel items;
  std::vector<Dstring> changed;
  if (!ReadArgs(cmd, items, 2, 2)) return;
  if (!items[0].IsText() || !items[1].IsText()) return Error(-104);
  Dstring which = Dstring(items[0].GetText()).ToUpper();
  if (!mGlobal.ForceWord(which, Dstring(items[1].GetText()).ToUpper(), changed)) return Error(-224);
  NoteStates(changed);
}

bool SimCommandProcessor::ReadSwitch(const SimCommand& cmd, bool& on) {
  if (!cmd.HasArgs()) {
    Error(-109);
    return false;
  }
  const Dstring word = Dstring(cmd.GetArgs()).ToUpper();
  for (const SwitchWord& s : kSwitchWords) {
    if (word == s.word) {
      on = s.on;
      return true;
    }
  }
  Error(-224);
  return false;
}

bool SimCommandProcessor::ReadArgs(const SimCommand& cmd, DataParcel& items, std::size_t min,
                                   std::size_t max) {
  ConditionList ignored;
  if (!cmd.HasArgs()) {
    Error(-109);
    return false;
  }
  if (ParserExpression::Parse(cmd.GetArgs(), items, ignored) != 0 || items.size() > max) {
    Error(-104);
    return false;
  }
  if (items.size() < min) {
    Error(-109);
    return false;
  }
  return true;
}

void SimCommandProcessor::Error(int code) {
  mTarget->Push(code, TextOf(code));
  ++mErrors;
}

void SimCommandProcessor::Error(int code, const Dstring& detail) {
  // A quote of the detail is doubled, so that the entry stays one quoted string.
  Dstring text = Dstring(TextOf(code)) + "; ";
  for (char c : detail) {
    text += c;
    if (c == '"') text += c;
  }
  mTarget->Push(code, text);
  ++mErrors;
}

void SimCommandProcessor::MarkDirty(const Dstring& header, const Dstring& except) {
  for (auto& [name, handle] : mHandles) {
    if (name != except) handle.Dirty().Add(header);
  }
}

void SimCommandProcessor::NoteStates(const std::vector<Dstring>& headers, const char* written) {
  for (const Dstring& header : headers) MarkDirty(header, written != nullptr && header == written ? mHandle : Dstring());
}

void SimCommandProcessor::NoteParamChanges(const Dstring& except) {
  bool relock = false;
  for (std::size_t i : mParams.TakeValueChanges()) {
    mBatchValues.insert(i);
    MarkDirty(mParams.At(i).GetHeader(), except);
    relock = relock || mParams.At(i).IsRelock();
  }
  for (std::size_t i : mParams.TakeLimitChanges()) mBatchLimits.insert(i);
  if (relock) NoteStates(mGlobal.ClockChanged(mClock.NowMs()));
}
