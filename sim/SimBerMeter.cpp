#include "SimBerMeter.h"

#include <cmath>

#include "SimCabling.h"
#include "SimPlace.h"

namespace {

constexpr std::string_view kSuffix = ":BER";
constexpr std::string_view kReset = ":BER:RES";
constexpr std::string_view kInject = ":BER:INJ";

}  // namespace

double SimBerMeter::RatioOf(const Dstring& header) {
  const long connector = NumberAfter(header, ":CONN");
  const long module = NumberAfter(header, ":MOD");
  return 1e-7 * std::pow(10.0, -(connector - 1)) * (1.0 + 0.25 * static_cast<double>(module % 4));
}

double SimBerMeter::ClockOf(const Dstring& header, SimContext& context) {
  std::size_t index = 0;
  const Dstring freq = Dstring::Format(":CGR%ld:FREQ", NumberAfter(header, ":CGR"));
  return context.Params().Find(freq, index) ? context.Params().At(index).GetNumber() : 0.0;
}

double SimBerMeter::RatioFor(const Dstring& port) const {
  const Dstring header = port + Dstring(kSuffix);
  auto it = mCounts.find(header);
  return it != mCounts.end() && it->second.injected > 0 ? it->second.injected : RatioOf(header);
}

double SimBerMeter::ErrorsOf(const Dstring& port, unsigned long& epoch) const {
  auto it = mCounts.find(port + Dstring(kSuffix));
  epoch = it != mCounts.end() ? it->second.epoch : 0;
  return it != mCounts.end() ? std::floor(it->second.errors) : 0.0;
}

bool SimBerMeter::IsPort(const Dstring& port, SimContext& context) {
  std::size_t index = 0;
  return context.Params().Find(port + Dstring(kSuffix), index);
}

void SimBerMeter::Advance(SimContext& context) {
  const long long now = context.NowMs();
  const bool running = context.Global().IsRunning();
  if (mCounts.empty()) {
    for (std::size_t i : context.Params().WithPrefix("")) {
      if (context.Params().At(i).GetHeader().EndsWith(kSuffix)) mCounts[context.Params().At(i).GetHeader()];
    }
  }
  if (running && !mWasRunning) {
    for (auto& [header, count] : mCounts) count.Restart();
  }
  if (running && mWasRunning && mLastMs >= 0) {
    const double seconds = static_cast<double>(now - mLastMs) / 1000.0;
    for (auto& [header, count] : mCounts) {
      if (mConnections->DriverOf(Dstring(header.substr(0, header.size() - kSuffix.size()))).empty()) continue;
      const double bits = ClockOf(header, context) * seconds;
      count.compared += bits;
      count.errors += bits * (count.injected > 0 ? count.injected : RatioOf(header));
    }
  }
  mWasRunning = running;
  mLastMs = now;
}

bool SimBerMeter::PortOf(const Dstring& rest, std::string_view suffix, SimContext& context, Dstring& header) {
  if (!rest.EndsWith(suffix)) return false;
  std::size_t index = 0;
  if (!context.Params().Find(Dstring(rest.substr(0, rest.size() - suffix.size() + kSuffix.size())), index)) return false;
  header = context.Params().At(index).GetHeader();
  return true;
}

bool SimBerMeter::RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) {
  Dstring header;
  if (PortOf(rest, kReset, context, header)) {
    if (cmd.IsQuery()) {
      context.Error(-113);
    } else {
      mCounts[header].Restart();
    }
    return true;
  }
  if (context.TestControl() && PortOf(rest, kInject, context, header)) {
    char* end = nullptr;
    const Dstring args(cmd.GetArgs());
    const double ratio = std::strtod(args.c_str(), &end);
    if (cmd.IsQuery() || end == args.c_str() || *end != '\0' || !(ratio >= 0 && ratio <= 0.5)) {
      context.Error(cmd.IsQuery() ? -113 : -222);
    } else {
      mCounts[header].injected = ratio;
    }
    return true;
  }
  if (!PortOf(rest, kSuffix, context, header)) return false;
  if (!cmd.IsQuery()) {
    context.Error(-200);
    return true;
  }
  const Count& count = mCounts[header];
  const double compared = std::floor(count.compared);
  const double errors = std::floor(count.errors);
  context.Reply(Dstring::Format("%.0f,%.0f,%.12E", compared, errors, compared > 0 ? errors / compared : 0.0));
  return true;
}
