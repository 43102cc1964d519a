#include "SimCapture.h"

#include <algorithm>

#include "SimBerMeter.h"
#include "SimCapturePlan.h"
#include "SimCabling.h"
#include "SimReply.h"
#include "SimSegment.h"
#include "SimSegmentRows.h"
#include "SimSegmentStore.h"
#include "SimSequence.h"
#include "support/DataParcel.h"
#include "support/ParserExpression.h"

namespace {

constexpr long kDefaultDepth = 65536;
constexpr std::string_view kStem = ":CAPT:";

void SetBit(std::string& row, long vector) {
  row[static_cast<std::size_t>(vector >> 3)] =
      static_cast<char>(static_cast<unsigned char>(row[static_cast<std::size_t>(vector >> 3)]) | (0x80u >> (vector & 7)));
}

bool BitAt(const std::string& row, long vector) {
  return (static_cast<unsigned char>(row[static_cast<std::size_t>(vector >> 3)]) & (0x80u >> (vector & 7))) != 0;
}

}  // namespace

std::map<Dstring, long> SimCapture::Sources() const {
  std::map<Dstring, long> slots;  // of every data port
  std::vector<Dstring> analysers;
  for (const SimSequenceConfig::Port& port : mSequence->GetConfig().GetPorts()) {
    if (port.portClass != "PDAT") continue;
    const Dstring path = port.path.ToUpper();
    slots.emplace(path, static_cast<long>(slots.size()));
    if (port.type == "INPUT_PORT") analysers.push_back(path);
  }
  std::map<Dstring, long> sources;
  for (const Dstring& path : analysers) {
    auto driver = slots.find(mConnections->DriverOf(path));
    sources[path] = driver == slots.end() ? -1 : driver->second;
  }
  return sources;
}

int SimCapture::StartRefusal(SimContext& context) const { return context.Global().IsRunning() ? 0 : -221; }

std::size_t SimCapture::Begin(SimContext& context) {
  std::size_t index = 0;
  long depth = kDefaultDepth;
  if (context.Params().Find(":MEAS:CAPT:DEPT", index)) depth = static_cast<long>(context.Params().At(index).GetNumber());
  mPending.clear();
  std::map<long, Record> sent;
  for (const auto& [path, generator] : Sources()) {
    if (!sent.contains(generator)) sent[generator] = Sent(generator, depth);
    Record record = sent[generator];
    InjectErrors(record, mBer->RatioFor(path));
    mPending[path] = std::move(record);
  }
  return mPending.size();
}

void SimCapture::ItemDone(std::size_t item, SimContext&) {
  if (item + 1 == mPending.size()) mRecords = std::move(mPending);
}

long SimCapture::ReceivedWidth(const Dstring& port) const {
  const std::map<Dstring, long> sources = Sources();
  auto found = sources.find(port);
  long width = 1;
  if (found == sources.end() || found->second < 0) return width;
  for (const SimCapturePlan::Run& run : SimCapturePlan::Runs(mSequence->GetSequence(), static_cast<std::size_t>(found->second), kDefaultDepth)) {
    if (!run.named) continue;
    if (std::shared_ptr<const SimSegment> segment = mSegments->Find(run.segment)) width = std::max(width, segment->GetWidth());
  }
  return width;
}

SimCapture::Record SimCapture::Sent(long generator, long vectors) {
  std::vector<SimCapturePlan::Run> runs;
  if (generator >= 0) {
    runs = SimCapturePlan::Runs(mSequence->GetSequence(), static_cast<std::size_t>(generator),
                                static_cast<unsigned long>(vectors));
  }
  std::map<Dstring, Bits> cache;
  Record record;
  record.width = 1;
  record.length = vectors;
  for (const SimCapturePlan::Run& run : runs) {
    if (run.named) record.width = std::max(record.width, BitsOf(run.segment, vectors, cache).width);
  }
  const std::size_t rowBytes = SimSegmentRows::RowBytes(vectors, 1);
  record.rows.assign(static_cast<std::size_t>(record.width), std::string(rowBytes, '\0'));
  record.errors = record.rows;
  long at = 0;
  for (const SimCapturePlan::Run& run : runs) {
    const long end = std::min(vectors, at + static_cast<long>(run.length));
    if (run.named) {
      const Bits& bits = BitsOf(run.segment, vectors, cache);
      for (long t = 0; t < bits.width && bits.length > 0; ++t) {
        const std::vector<bool>& trace = bits.traces[static_cast<std::size_t>(t)];
        for (long v = at; v < end; ++v) {
          if (trace[static_cast<std::size_t>((v - at) % bits.length)]) SetBit(record.rows[static_cast<std::size_t>(t)], v);
        }
      }
    } else if (run.segment == "PAUSE1") {
      for (std::string& row : record.rows) {
        for (long v = at; v < end; ++v) SetBit(row, v);
      }
    }
    at = end;
  }
  return record;
}

const SimCapture::Bits& SimCapture::BitsOf(const Dstring& name, long vectors, std::map<Dstring, Bits>& cache) const {
  auto found = cache.find(name);
  if (found != cache.end()) return found->second;
  Bits& bits = cache[name];
  std::shared_ptr<const SimSegment> segment = mSegments->Find(name);
  if (segment == nullptr || segment->GetWidth() == 0 || segment->GetLength() == 0) return bits;
  bits.width = segment->GetWidth();
  bits.length = std::min(segment->GetLength(), vectors);
  const Dstring& coding = segment->GetCoding();
  std::string block;
  if (segment->ReadBlock(0, 0, bits.width - 1, bits.length - 1, block) != 0) {
    bits.width = 0;
    return bits;
  }
  const int stateWidth = SimSegment::StateWidthOf(coding);
  const std::size_t rowBytes = SimSegmentRows::RowBytes(bits.length, stateWidth);
  bits.traces.assign(static_cast<std::size_t>(bits.width), std::vector<bool>(static_cast<std::size_t>(bits.length)));
  for (long t = 0; t < bits.width; ++t) {
    const auto* row = reinterpret_cast<const unsigned char*>(block.data()) + static_cast<std::size_t>(t) * rowBytes;
    for (long v = 0; v < bits.length; ++v) {
      unsigned state = 0;
      for (int b = 0; b < stateWidth; ++b) {
        const long bit = v * stateWidth + b;
        state = (state << 1) | ((row[bit >> 3] >> (7 - (bit & 7))) & 1u);
      }
      const char c = state < coding.size() ? coding[state] : '0';
      bits.traces[static_cast<std::size_t>(t)][static_cast<std::size_t>(v)] = state == 1 || c == '1' || c == 'H';
    }
  }
  return bits;
}

// Errors come at random places, `ratio` of the bits on average.
void SimCapture::InjectErrors(Record& record, double ratio) {
  if (!(ratio > 0)) return;
  const long long bits = static_cast<long long>(record.width) * record.length;
  std::geometric_distribution<long long> gap(std::min(ratio, 1.0));
  for (long long at = gap(mRandom); at < bits; at += 1 + gap(mRandom)) {
    const auto trace = static_cast<std::size_t>(at % record.width);
    const long vector = static_cast<long>(at / record.width);
    std::string& row = record.rows[trace];
    row[static_cast<std::size_t>(vector >> 3)] ^= static_cast<char>(0x80u >> (vector & 7));
    SetBit(record.errors[trace], vector);
  }
}

int SimCapture::ReplyBits(const Record& record, bool errors, const SimCommand& cmd, SimContext& context) const {
  DataParcel items;
  ConditionList ignored;
  long start = 0, count = 0;
  if (ParserExpression::Parse(cmd.GetArgs(), items, ignored) != 0 || items.size() != 2 || !items[0].GetLong(start) ||
      !items[1].GetLong(count)) {
    return -104;
  }
  const std::size_t rowBytes = SimSegmentRows::RowBytes(count, 1);
  if (start < 0 || count < 1 || start > record.length - count ||
      rowBytes * static_cast<std::size_t>(record.width) > kMaxReplyBytes) {
    return -222;
  }
  std::string block(rowBytes * static_cast<std::size_t>(record.width), '\0');
  for (long t = 0; t < record.width; ++t) {
    const std::string& row = (errors ? record.errors : record.rows)[static_cast<std::size_t>(t)];
    std::string out(rowBytes, '\0');
    for (long v = 0; v < count; ++v) {
      if (BitAt(row, start + v)) SetBit(out, v);
    }
    block.replace(static_cast<std::size_t>(t) * rowBytes, rowBytes, out);
  }
  context.Reply(SimBlockHeader(block.size()) + block);
  return 0;
}

bool SimCapture::RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) {
  if (rest.StartsWith(kStem)) return SimTimedTask::RunHandleCommand(rest, cmd, context);
  const std::size_t at = rest.find(kStem);
  if (at == Dstring::npos || !rest.StartsWith(":CGR")) return false;
  const Dstring port(rest.substr(0, at));
  const Dstring what(rest.substr(at + kStem.size()));
  if (!Sources().contains(port)) return false;
  static const Record kNone;
  auto found = mRecords.find(port);
  const Record& record = found == mRecords.end() ? kNone : found->second;
  int rc = -113;
  if (what == "SIZE" && cmd.IsQuery()) {
    context.Reply(Dstring::Format("%ld,%ld", record.length, record.width));
    rc = 0;
  } else if ((what == "DATA" || what == "ERR") && cmd.IsQuery()) {
    rc = ReplyBits(record, what == "ERR", cmd, context);
  }
  if (rc != 0) context.Error(rc);
  return true;
}
