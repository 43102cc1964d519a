#pragma once

#include <cctype>
#include <functional>
#include <map>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "common/ScriptedInstrument.h"
#include "support/ConditionList.h"

// One row of a subsystem's wire table: an operation and the texts it sends, to the byte and in
// order.
struct WireRow {
  const char* operation;
  std::function<int(ConditionList&)> run;
  std::vector<Dstring> sent;
};

inline void PrintTo(const WireRow& row, std::ostream* os) { *os << row.operation; }

struct WireReply {
  Dstring text;
  int status = 0;
};

// Answers from a table of replies by command; an empty reply and status 0 for any other.
inline ScriptedInstrument::Handler AnswerFrom(const std::map<Dstring, WireReply>& replies) {
  return [&replies](const Dstring& cmd, Dstring& reply) {
    auto it = replies.find(cmd);
    reply = it == replies.end() ? Dstring() : it->second.text;
    return it == replies.end() ? 0 : it->second.status;
  };
}

// Runs the row against `inst` (answering as it has been told to); checks its status and what
// it sent.
inline void CheckWireRow(const WireRow& row, ScriptedInstrument& inst, ConditionList& list) {
  const std::size_t from = inst.Sent().size();
  EXPECT_EQ(row.run(list), 0) << row.operation << ": " << list.ToText();
  // One text a line, so that a difference shows as text.
  std::string sent, expected;
  for (auto it = inst.Sent().begin() + static_cast<std::ptrdiff_t>(from); it != inst.Sent().end(); ++it) {
    sent += *it + "\n";
  }
  for (const Dstring& text : row.sent) expected += text + "\n";
  EXPECT_EQ(sent, expected) << row.operation;
}

inline void CheckWireRow(const WireRow& row, ScriptedInstrument& inst, const std::map<Dstring, WireReply>& replies,
                         ConditionList& list) {
  inst.SetHandler(AnswerFrom(replies));
  CheckWireRow(row, inst, list);
}

inline std::string WireRowName(const testing::TestParamInfo<WireRow>& info) {
  std::string name;
  for (const char* c = info.param.operation; *c; ++c) {
    if (std::isalnum(static_cast<unsigned char>(*c))) name += *c;
  }
  return name;
}
