#pragma once

#include "SimGlobalState.h"
#include "SimParamTable.h"
#include "support/Dstring.h"

// What a command module may do within the frame being run.
class SimContext {
 public:
  virtual ~SimContext() = default;

  // Taken over: a data block is not copied again.
  virtual void Reply(Dstring text) = 0;
  // Queues the SCPI error on the queue the client reads for this command.
  virtual void Error(int code) = 0;
  // The same with what went wrong after the standard text ("Settings conflict; ...").
  virtual void Error(int code, const Dstring& detail) = 0;
  // The handle of the command being run (upper case).
  virtual const Dstring& GetHandle() const = 0;
  virtual long long NowMs() const = 0;
  virtual SimParamTable& Params() = 0;
  virtual const SimGlobalState& Global() const = 0;
  // Every handle but the one running the command hears that the setting changed.
  virtual void MarkChanged(const Dstring& header) = 0;
  // After parameters were written: their value and limit changes reach the other handles
  // and the coupled queries.
  virtual void NoteParamChanges() = 0;
  // The same for changes the instrument made itself: every handle hears them, the one
  // running the command too.
  virtual void NoteInstrumentChanges() = 0;
  // Every handle hears that everything changed.
  virtual void MarkAllDirty() = 0;
  // Whether the fault injection commands are on (--test-control).
  virtual bool TestControl() const = 0;
  // Long work reports a step (done of total) that took `waitMs`; false when the client
  // cancelled: the work puts back what it changed and ends with kCancelled.
  virtual bool Step(long long done, long long total, int waitMs) = 0;
  // Whether a client follows the command, so that it can be cancelled at all.
  virtual bool IsFollowed() const = 0;
  // The error a cancelled command ends with.
  static constexpr int kCancelled = 301;
};
