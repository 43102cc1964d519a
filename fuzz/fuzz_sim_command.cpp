// Arbitrary bytes as the command text of one frame on qensim's command processor, on a
// connection that holds the handle "_H". The first byte chooses the form: the text as it is,
// or with ":_H:" before it, so both the global commands and a handle's are reached. A crash,
// a hang (-timeout) or unbounded memory (-rss_limit_mb) is the finding; a frame is always
// answered, with a status that counts errors (the frame may have read them itself).

#include <cstddef>
#include <cstdint>
#include <string>

#include "FuzzInstrument.h"

using fuzzinstrument::Check;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  SimCommandProcessor& sim = fuzzinstrument::Instrument();
  Check(sim.Execute(1, ":QEN:INST:HAND:CRE? _H,\"PSX\",\"FUZZ\"").text == "_H");
  std::string text(reinterpret_cast<const char*>(data) + 1, size - 1);
  if (data[0] & 1) text = ":_H:" + text;
  SimReply reply = sim.Execute(1, text);
  Check(reply.status >= 0 && reply.action == SimReplyAction::Send);
  return 0;
}
