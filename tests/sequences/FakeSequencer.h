#pragma once

#include <deque>
#include <utility>

#include "common/ScriptedInstrument.h"
#include "support/Dstring.h"
#include "support/DstringList.h"

// The sequence commands of a server with the handle "_H", for unit tests: keeps the sequence
// and the events it is sent, answers the loop levels and the configuration, and can refuse
// writes the way a server does (status 1 and an error on the queue).
class FakeSequencer {
 public:
  // Two data ports: a generator port and an analyser port; no central module.
  static constexpr const char* kConfiguration =
      "\"PATT\",\"\",(\":CGR1:MOD1:CONN1\",\"PDAT\",\"OUTPUT_PORT\",\"K2268A\"),"
      "(\":CGR1:MOD1:CONN3\",\"PCLK\",\"OUTPUT_PORT\",\"K2268A\"),"
      "(\":CGR1:MOD2:CONN1\",\"PDAT\",\"INPUT_PORT\",\"K2270A\")";

  Dstring sequence = "(3.0,\"\",(BLOCK,0,512,0,\"\",(),PAUSE,0,0,PAUSE0,0,0))";
  Dstring events =
      "(3.0,(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),"
      "(\"\",0,()),(\"\",0,()),(\"\",0,()))";
  Dstring configuration = kConfiguration;
  Dstring levels = "3";
  // The next reply to "_H:DFL?", then empty.
  Dstring dirty;
  // Nonzero: every sequence write is refused with this status and an error queued.
  int refuse = 0;
  // True: sequence writes are taken without error but change nothing.
  bool ignore = false;
  // True: every command is refused as the instrument being held by another client.
  bool locked = false;
  // Every command received.
  DstringList received;

  void Install(ScriptedInstrument& inst) {
    inst.SetHandler([this](const Dstring& cmd, Dstring& reply) { return Handle(cmd, reply); });
  }

  // The sequence writes received, without the header.
  DstringList Writes() const {
    DstringList out;
    for (const Dstring& cmd : received) {
      if (cmd.StartsWith(kWrite)) out.push_back(Dstring(cmd.substr(kWrite.size())));
    }
    return out;
  }

  int Handle(const Dstring& cmd, Dstring& reply) {
    received.push_back(cmd);
    reply.clear();
    if (locked) return -19;
    if (cmd == ":_H:SGEN:GLOB:SEQ?") return reply = sequence, 0;
    if (cmd == ":_H:SGEN:GLOB:SEQ:EVEN?") return reply = events, 0;
    if (cmd == ":_H:SGEN:GLOB:SEQ:LLEV?") return reply = levels, 0;
    if (cmd == "_H:SGEN:GLOB:CONF?") return reply = configuration, 0;
    if (cmd == "_H:DFL?") return reply = std::exchange(dirty, Dstring()), 0;
    if (cmd == ":_H:SYST:ERR?") {
      if (mErrors.empty()) return reply = "0,\"No error\"", 0;
      reply = mErrors.front();
      mErrors.pop_front();
      return 0;
    }
    if (cmd.StartsWith(":_H:SGEN:GLOB:SEQ:EVEN ")) return events = Dstring(cmd.substr(23)), 0;
    if (cmd.StartsWith(kWrite)) {
      if (refuse != 0) {
        mErrors.push_back("-224,\"Illegal parameter value\"");
        return refuse;
      }
      if (!ignore) sequence = Dstring(cmd.substr(kWrite.size()));
      return 0;
    }
    return -113;
  }

 private:
  static constexpr std::string_view kWrite = ":_H:SGEN:GLOB:SEQ ";
  std::deque<Dstring> mErrors;
};
