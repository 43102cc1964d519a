#pragma once

#include "instrument/CallProgress.h"
#include "instrument/CallWaiter.h"
#include "support/Dstring.h"
#include "support/DstringList.h"

// A connection to the instrument server. Call sends one command text and returns one
// reply text; the result is a status (QenStatus.h), never an exception.
class QenInstrument {
 public:
  virtual ~QenInstrument() = default;

  virtual int Connect(const Dstring& host, unsigned short port) = 0;
  virtual int Disconnect() = 0;
  virtual bool IsConnected() const = 0;
  virtual int Call(const Dstring& cmd, Dstring& reply) = 0;
  // The follower of the calls from now on; null for none. Not owned. A connection that
  // cannot report progress ignores it.
  virtual void SetCallProgress(CallProgress*) {}
  // Told while a call without a follower waits for its reply; null for none. Not owned.
  virtual void SetCallWaiter(CallWaiter*) {}

  // Time-out replies of a connection, and the time-out used by new connections: from
  // QEN_REPLY_TIMEOUT (seconds) or the command line, 30 s otherwise.
  static int GetDefaultReplyTimeoutMs();
  static void SetDefaultReplyTimeoutMs(int ms);
  // Remembers the command that has just run out of time, so that the text of that time-out
  // (the next GetErrMessage of kTimeOut) names it.
  static void NoteTimeOut(const Dstring& cmd, int timeoutMs);

  // The text of a client status as an error-queue entry: code,"text".
  static Dstring GetErrMessage(int status);
};
