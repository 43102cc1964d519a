#pragma once

#include "instrument/CallProgress.h"
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

  // The text of a client status as an error-queue entry: code,"text".
  static Dstring GetErrMessage(int status);
};
