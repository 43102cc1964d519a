#include "data/BerSvr.h"

#include <algorithm>
#include <string_view>

#include "instrument/QenGuiInst.h"
#include "support/ConditionListLoader.h"
#include "support/DataParcel.h"
#include "support/FWBlocker.h"
#include "support/ParserExpression.h"

namespace {

constexpr std::string_view kBerSuffix = ":BER";

// "compared,errors,ratio"
bool ReadResult(std::string_view text, BerSvr::PortResult& result) {
  DataParcel parcel;
  ConditionList ignored;
  if (ParserExpression::Parse(text, parcel, ignored) != 0 || parcel.size() != 3) return false;
  unsigned long compared = 0;
  unsigned long errors = 0;
  double ratio = 0;
  if (!parcel[0].GetULong(compared) || !parcel[1].GetULong(errors) || !parcel[2].GetDouble(ratio)) return false;
  result.compared = compared;
  result.errors = errors;
  result.ratio = ratio;
  return true;
}

// "errors on channel 0,errors on channel 1,…"
bool ReadChannels(std::string_view text, std::vector<unsigned long long>& channels) {
  DataParcel parcel;
  ConditionList ignored;
  if (ParserExpression::Parse(text, parcel, ignored) != 0 || parcel.size() == 0) return false;
  channels.assign(parcel.size(), 0);
  for (std::size_t i = 0; i < parcel.size(); ++i) {
    unsigned long count = 0;
    if (!parcel[i].GetULong(count)) return false;
    channels[i] = count;
  }
  return true;
}

}  // namespace

int BerSvr::Init(ConditionList& list) {
  FWBlocker guard("BerSvr::Init", list);
  if (int status = guard.Block()) return status;
  const Dstring handle = QenGuiInst::GetAppHandle();
  Dstring reply;
  if (int status = QenGuiInst::Call(Dstring::Format(":L:%s:CGR?", handle.c_str()), reply, list)) return status;
  std::vector<PortResult> ports;
  const Dstring prefix = ":" + handle.ToUpper();
  std::size_t pos = 0;
  while ((pos = reply.find('"', pos)) != Dstring::npos) {
    std::size_t end = reply.find('"', pos + 1);
    if (end == Dstring::npos) break;
    Dstring header(reply.substr(pos + 1, end - pos - 1));
    pos = end + 1;
    if (!header.EndsWith(kBerSuffix) || !header.ToUpper().StartsWith(prefix)) continue;
    ports.emplace_back().port = Dstring(header.substr(prefix.size()));
  }
  // The counts a run left are the instrument's until the next start: they are shown at once,
  // not only once the instrument runs again.
  mInitialized = true;
  int status = ReadCounts(ports, list);
  mResults = std::move(ports);
  if (int notified = Update(list, 0); status == 0) status = notified;
  return status;
}

void BerSvr::End() {
  mInitialized = false;
  mResults.clear();
}

int BerSvr::UpdateFromFW(unsigned what, ConditionList& list) {
  if (what != kReadResults || !mInitialized || mResults.empty()) return 0;
  std::vector<PortResult> next = mResults;
  if (int status = ReadCounts(next, list)) return status;
  if (next == mResults) return 0;
  mResults = std::move(next);
  return Update(list, 0);
}

int BerSvr::ReadCounts(std::vector<PortResult>& results, ConditionList& list) const {
  if (results.empty()) return 0;
  FWBlocker guard("BerSvr::UpdateFromFW", list);
  if (int status = guard.Block()) return status;
  const bool channels = HasChannels();
  const Dstring cmd = Joined(results, "?", channels ? ":CHAN?" : nullptr);
  Dstring reply;
  if (int status = QenGuiInst::Call(cmd, reply, list)) return status;
  std::vector<std::string_view> parts;
  const std::size_t each = channels ? 2 : 1;
  if (ParserExpression::SplitJoined(reply, parts, list) != 0 || parts.size() != each * results.size()) {
    ConditionListLoader::ConditionToken(list, "GUI_STATE_BAD_REPLY", {cmd, reply}, 1);
    return 1;
  }
  std::vector<PortResult> next = results;
  for (std::size_t i = 0; i < parts.size(); ++i) {
    PortResult& result = next[i / each];
    const bool read = i % each == 0 ? ReadResult(parts[i], result) : ReadChannels(parts[i], result.channels);
    if (!read) {
      ConditionListLoader::ConditionToken(list, "GUI_STATE_BAD_REPLY", {cmd, Dstring(parts[i])}, 1);
      return 1;
    }
    if (!channels) result.channels.clear();
  }
  results = std::move(next);
  return 0;
}

int BerSvr::Reset(ConditionList& list) {
  if (!mInitialized || mResults.empty()) return 0;
  {
    FWBlocker guard("BerSvr::Reset", list);
    if (int status = guard.Block()) return status;
    Dstring reply;
    if (int status = QenGuiInst::Call(Joined(mResults, ":RES"), reply, list)) return status;
  }
  return UpdateFromFW(kReadResults, list);
}

void BerSvr::WantChannels(bool want) {
  mChannelViews = want ? mChannelViews + 1 : std::max(0, mChannelViews - 1);
}

Dstring BerSvr::Joined(const std::vector<PortResult>& ports, const char* suffix, const char* second) {
  const Dstring handle = QenGuiInst::GetAppHandle();
  Dstring cmd;
  for (const auto& r : ports) {
    cmd += (cmd.empty() ? ":" : ";:") + handle + r.port + suffix;
    if (second != nullptr) cmd += ";:" + handle + r.port + second;
  }
  return cmd;
}
