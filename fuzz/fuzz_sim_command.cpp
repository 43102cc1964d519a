// Arbitrary bytes as the command text of one frame on qensim's command processor, on a
// connection that holds the handle "_H". The first byte chooses the form: the text as it is,
// or with ":_H:" before it, so both the global commands and a handle's are reached. A crash,
// a hang (-timeout) or unbounded memory (-rss_limit_mb) is the finding; a frame is always
// answered, with a status that counts errors (the frame may have read them itself).
//
// The instrument is made anew every kRenew inputs (and the connection at every input), so
// state carries over a little, which reaches deeper, but memory cannot pile up: segments stay
// in memory while qensim runs.
#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>

#include "SimClock.h"
#include "SimCommandProcessor.h"
#include "SimConfigLoader.h"

extern const char* const kSimDefaultConfigText;

namespace {

constexpr int kRenew = 64;

void Check(bool ok) {
  if (!ok) __builtin_trap();
}

class FixedClock : public SimClock {
 public:
  long long NowMs() const override { return 1000; }
};

const SimParamTable& Configured() {
  static const SimParamTable table = [] {
    SimParamTable t;
    ConditionList list;
    Check(SimConfigLoader::Load(kSimDefaultConfigText, t, list) == 0);
    return t;
  }();
  return table;
}

SimCommandProcessor& Instrument() {
  static const FixedClock clock;
  static std::unique_ptr<SimCommandProcessor> sim;
  static int runs = 0;
  if (runs++ % kRenew == 0) sim = std::make_unique<SimCommandProcessor>(Configured(), clock, false);
  sim->Disconnect(1);
  return *sim;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  SimCommandProcessor& sim = Instrument();
  Check(sim.Execute(1, ":QEN:INST:HAND:CRE? _H,\"PSX\",\"FUZZ\"").text == "_H");
  std::string text(reinterpret_cast<const char*>(data) + 1, size - 1);
  if (data[0] & 1) text = ":_H:" + text;
  SimReply reply = sim.Execute(1, text);
  Check(reply.status >= 0 && reply.action == SimReplyAction::Send);
  return 0;
}
