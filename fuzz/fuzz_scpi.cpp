// Arbitrary bytes into qensim's raw SCPI socket, without the socket: the line and block
// reader, fed in pieces whose sizes the first byte chooses, and every message it cuts run by
// a SCPI session on a fresh instrument.
//  - The messages do not depend on how the bytes were cut into pieces.
//  - A message never holds a line feed outside a block, never exceeds the limit, and the
//    messages with their terminators never add up to more than the input.
//  - A session answers every message without crashing, hanging or growing without bound, and
//    after any of them (long forms, unit suffixes, indefinite and short blocks, status
//    commands, waits) it still answers *IDN?.
// The kept inputs in fuzz/regressions/fuzz_scpi/ seed those forms.
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "FuzzInstrument.h"
#include "SimScpiReader.h"
#include "SimScpiSession.h"

using fuzzinstrument::Check;

namespace {

// The messages ("\x01" marks an overrun, "\x02" a short block) of the bytes fed `piece` at a time.
std::vector<std::string> Cut(const std::string& bytes, std::size_t piece) {
  SimScpiReader reader;
  std::vector<std::string> out;
  std::string message;
  for (std::size_t at = 0; at < bytes.size(); at += piece) {
    reader.Feed(bytes.data() + at, std::min(piece, bytes.size() - at));
    for (SimScpiReader::Result r; (r = reader.Next(message)) != SimScpiReader::Result::None;) {
      out.push_back(r == SimScpiReader::Result::Overrun      ? std::string("\x01")
                    : r == SimScpiReader::Result::ShortBlock ? std::string("\x02")
                                                             : message);
    }
  }
  return out;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  const std::string bytes(reinterpret_cast<const char*>(data) + 1, size - 1);
  const std::vector<std::string> whole = Cut(bytes, bytes.size() + 1);
  Check(Cut(bytes, 1 + data[0] % 16) == whole);
  std::size_t total = 0;
  for (const std::string& m : whole) {
    Check(m.size() <= SimScpiReader::kMaxMessage);
    total += m.size() + 1;
  }
  Check(total <= bytes.size() + whole.size());

  SimScpiSession session(fuzzinstrument::Instrument(), 1);
  for (const std::string& m : whole) {
    Dstring reply;
    if (m == "\x01") {
      session.Overrun();
    } else if (m == "\x02") {
      session.ShortBlock();
    } else if (SimScpiSession::IsDeviceClear(m)) {
      session.DeviceClear();
    } else if (session.Execute(m, reply) == SimScpiSession::Outcome::Waiting) {
      // The fuzzer's clock does not move on: a wait is ended the way a client would end it.
      session.DeviceClear();
    }
  }
  // Whatever ran, the connection is usable, and the queue reads out oldest first and ends in
  // "No error".
  Dstring reply;
  Check(session.Execute("*IDN?", reply) == SimScpiSession::Outcome::Answered && reply.StartsWith("Corvane,"));
  for (std::size_t i = 0; i <= SimErrorQueue::kCapacity; ++i) session.Execute("SYST:ERR?", reply);
  Check(session.Execute("SYST:ERR?", reply) == SimScpiSession::Outcome::Answered && reply == "0,\"No error\"");
  return 0;
}
