#pragma once

#include "support/Dstring.h"

// What the server does with a command frame once it has run.
enum class SimReplyAction { Send, Drop, Die };

// The outcome of one command frame: the reply payload, the frame status (the number of
// errors queued, or -19 when refused), and how and when to answer.
struct SimReply {
  Dstring text;
  int status = 0;
  SimReplyAction action = SimReplyAction::Send;
  int delayMs = 0;
};
