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

// The header of an IEEE 488.2 definite-length block: "#", the count of length digits (at
// least 5), the length.
inline Dstring SimBlockHeader(std::size_t bytes) {
  Dstring digits = Dstring::Format("%05zu", bytes);
  return Dstring::Format("#%zu", digits.size()) + digits;
}
