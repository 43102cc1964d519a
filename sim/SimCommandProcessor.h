#pragma once

#include <cstddef>
#include <map>
#include <set>
#include <string_view>
#include <vector>

#include <memory>
#include <utility>

#include "SimClock.h"
#include "SimCommand.h"
#include "SimCommandModule.h"
#include "SimContext.h"
#include "SimGlobalState.h"
#include "SimHandle.h"
#include "SimParamTable.h"
#include "SimReply.h"
#include "SimSession.h"
#include "SimWorkListener.h"
#include "support/DataParcel.h"

// The instrument's state and command language, without sockets: runs the command text of one
// frame for a connection and says what to answer. Connections are plain numbers (> 0) chosen
// by the caller. docs/simulator.md describes the command set.
class SimCommandProcessor : public SimContext {
 public:
  // `dataDir` is where the modules keep their files (segments, settings); empty for none.
  SimCommandProcessor(SimParamTable params, const SimClock& clock, bool testControl, Dstring dataDir = {});

  // `listener`: the client follows long work (progress, cancel); null when it does not.
  SimReply Execute(int connection, std::string_view text, SimWorkListener* listener = nullptr);
  // The same, and the handles keep the text itself as the batch they ran last, not a copy of
  // it: `text` is left with the room of an earlier batch, for the caller to fill again.
  SimReply ExecuteTaking(int connection, std::string& text, SimWorkListener* listener = nullptr);
  // The connection has gone: its handles die and its lock is released.
  void Disconnect(int connection);
  // Frames of only queries from this connection run while another one holds the lock (a
  // script reads, and is told why its writes fail, instead of waiting).
  void LetQueriesPassLock(int connection) { mQueriesPassLock.insert(connection); }
  // The parameters as the configuration made them: the values a new setting starts from.
  const SimParamTable& GetInitialParams() const { return mInitialParams; }
  // True once after the start: the first raw SCPI client sees the power-on event.
  bool TakePowerOn() { return std::exchange(mPowerOnUnseen, false); }

  // SimContext, for the command modules.
  void Reply(Dstring text) override { mReplies.push_back(std::move(text)); }
  void Error(int code) override;
  void Error(int code, const Dstring& detail) override;
  const Dstring& GetHandle() const override { return mHandle; }
  long long NowMs() const override { return mClock.NowMs(); }
  SimParamTable& Params() override { return mParams; }
  const SimGlobalState& Global() const override { return mGlobal; }
  void MarkChanged(const Dstring& header) override { MarkDirty(header, mHandle); }
  void NoteParamChanges() override { NoteParamChanges(mHandle); }
  void NoteInstrumentChanges() override { NoteParamChanges(""); }
  // Every handle is told that everything changed (after a whole setting is replaced).
  void MarkAllDirty() override;
  bool TestControl() const override { return mTestControl; }
  bool Step(long long done, long long total, int waitMs) override;
  bool IsFollowed() const override { return mListener != nullptr; }

 private:
  using Handler = void (SimCommandProcessor::*)(const SimCommand&);
  struct Entry {
    const char* path;
    Handler query;
    Handler write;
    bool testControl;
  };
  static const Entry kHandleCommands[];
  static const Entry kGlobalCommands[];
  static constexpr int kNobody = 0;
  static constexpr int kPhantom = -1;

  void ResetFrame(int connection);
  SimReply FinishFrame(int delayMs);
  bool IsRefused(std::string_view text) const;
  void RunBatch(std::string_view text);
  SimReply Run(int connection, std::string_view text, SimWorkListener* listener, std::string* taken);
  void RecordBatch(std::string_view text, std::string* taken);
  void RunCommand(const SimCommand& cmd);
  bool RunHandleCommand(const SimCommand& cmd);
  bool RunGlobalCommand(const SimCommand& cmd);
  void RunEntry(const Entry& entry, const SimCommand& cmd);
  void RunParam(std::size_t index, const SimCommand& cmd);
  void RunAttr(std::size_t index, const SimCommand& cmd);
  void QueryLimit(std::size_t index, const SimCommand& cmd);
  bool UseHandle(const Dstring& name);
  Dstring QuotedHeaders(const std::vector<std::size_t>& indices) const;

  // Prefixed requests: the handle is the second element.
  void RunCoupledQuery(bool values, std::string_view batch);
  void SearchParam(const SimCommand& cmd);
  void ListParams(const SimCommand& cmd);

  void QueryError(const SimCommand& cmd);
  void QueryDirty(const SimCommand& cmd);
  void QueryVersion(const SimCommand& cmd);
  void QueryLock(const SimCommand& cmd);
  void WriteLock(const SimCommand& cmd);
  void QueryRunning(const SimCommand& cmd);
  void WriteRunning(const SimCommand& cmd);
  void QuerySystem(const SimCommand& cmd);
  void QueryPll(const SimCommand& cmd);
  void QueryConnected(const SimCommand& cmd);
  void WriteConnected(const SimCommand& cmd);
  void ForceSequence(const SimCommand& cmd);
  void CreateHandle(const SimCommand& cmd);
  void DestroyHandle(const SimCommand& cmd);
  Dstring FreeHandleName(const Dstring& proposal) const;

  void TestLock(const SimCommand& cmd);
  void TestDelay(const SimCommand& cmd);
  void TestDrop(const SimCommand& cmd);
  void TestDie(const SimCommand& cmd);
  void TestErr(const SimCommand& cmd);
  void TestMalformed(const SimCommand& cmd);
  void TestBig(const SimCommand& cmd);
  void TestSet(const SimCommand& cmd);
  void TestStat(const SimCommand& cmd);
  void TestEcho(const SimCommand& cmd);

  // Reads ON/OFF (or 1/0) into `on`; queues -109 or -224 and returns false otherwise.
  bool ReadSwitch(const SimCommand& cmd, bool& on);
  // Parses the arguments into min..max items; queues -109 or -104 and returns false otherwise.
  bool ReadArgs(const SimCommand& cmd, DataParcel& items, std::size_t min, std::size_t max);
  void UseFrameTarget(std::string_view text);
  bool ChangesTheInstrument(const SimCommand& cmd) const;
  Dstring BareHeader(const SimCommand& cmd) const;
  // Tells every handle but `except` (a handle name, or empty for all) of changed headers.
  void MarkDirty(const Dstring& header, const Dstring& except);
  // Tells every handle of changed states, but the state this handle `written` itself: it knows
  // what it set. What follows from it (the system state after a start or stop, the PLL after a
  // clock change) it learns like everyone else, as no coupled query reports states.
  void NoteStates(const std::vector<Dstring>& headers, const char* written = nullptr);
  void NoteParamChanges(const Dstring& except);

  SimParamTable mParams;
  const SimParamTable mInitialParams;
  // Shared with the copies that dry-run a batch for VC and RC; a dry run leaves the modules
  // out, so that it cannot touch what they keep.
  std::vector<std::shared_ptr<SimCommandModule>> mModules;
  bool mDryRun = false;
  const SimClock& mClock;
  bool mTestControl;
  SimWorkListener* mListener = nullptr;
  SimGlobalState mGlobal;
  std::map<Dstring, SimHandle> mHandles;
  std::map<int, SimSession> mSessions;
  std::set<int> mQueriesPassLock;
  int mLockHolder = kNobody;
  bool mPowerOnUnseen = true;
  int mPhantomArmer = kNobody;  // the connection that set up the phantom lock

  // The frame being run.
  int mConnection = kNobody;
  Dstring mHandle;  // the handle of the command being run, empty when none
  SimErrorQueue* mTarget = nullptr;
  int mErrors = 0;
  DstringList mReplies;
  DstringList mBareHeaders;
  SimReplyAction mAction = SimReplyAction::Send;
  std::set<std::size_t> mBatchValues;
  std::set<std::size_t> mBatchLimits;
  std::set<Dstring> mBatchHandles;
};
