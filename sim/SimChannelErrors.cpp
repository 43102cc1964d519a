#include "SimChannelErrors.h"

#include <algorithm>
#include <cmath>

#include "SimBerMeter.h"
#include "SimCapture.h"

namespace {

constexpr std::string_view kQuery = ":BER:CHAN";
// Beyond this many new errors at once the share is spread evenly, the remainder at random.
constexpr double kPickedOneByOne = 4096;

}  // namespace

SimChannelErrors::Port& SimChannelErrors::CatchUp(const Dstring& port) {
  Port& state = mPorts[port];
  unsigned long epoch = 0;
  const double errors = mBer->ErrorsOf(port, epoch);
  if (epoch != state.epoch || errors < state.shared || state.channels.empty()) {
    state.shared = 0;
    state.epoch = epoch;
    state.channels.assign(static_cast<std::size_t>(std::max(1L, mCapture->ReceivedWidth(port))), 0.0);
  }
  double fresh = errors - state.shared;
  const auto width = static_cast<double>(state.channels.size());
  if (fresh > kPickedOneByOne) {
    const double each = std::floor(fresh / width);
    for (double& channel : state.channels) channel += each;
    fresh -= each * width;
  }
  std::uniform_int_distribution<std::size_t> pick(0, state.channels.size() - 1);
  for (; fresh >= 1; fresh -= 1) state.channels[pick(mRandom)] += 1;
  state.shared = errors;
  return state;
}

void SimChannelErrors::Advance(SimContext&) {
  for (auto& [port, state] : mPorts) CatchUp(port);
}

bool SimChannelErrors::RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) {
  if (!rest.EndsWith(kQuery) || !rest.StartsWith(":CGR")) return false;
  const Dstring port(rest.substr(0, rest.size() - kQuery.size()));
  if (!SimBerMeter::IsPort(port, context)) return false;
  if (!cmd.IsQuery()) {
    context.Error(-200);
    return true;
  }
  Dstring reply;
  for (double count : CatchUp(port).channels) reply += Dstring::Format(reply.empty() ? "%.0f" : ",%.0f", count);
  context.Reply(reply);
  return true;
}
