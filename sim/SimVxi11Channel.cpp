#include "SimVxi11Channel.h"

#include <algorithm>
#include <cctype>

namespace {

// ONC RPC message words.
constexpr std::uint32_t kCall = 0;
constexpr std::uint32_t kReply = 1;
constexpr std::uint32_t kRpcVersion = 2;
constexpr std::uint32_t kAccepted = 0;
constexpr std::uint32_t kDenied = 1;
constexpr std::uint32_t kRpcMismatch = 0;
constexpr std::uint32_t kAuthNull = 0;
constexpr std::size_t kMaxAuth = 400;
enum AcceptStat : std::uint32_t { kSuccess = 0, kProgUnavail = 1, kProgMismatch = 2, kProcUnavail = 3, kGarbageArgs = 4 };

// Port mapper procedures and protocol.
constexpr std::uint32_t kPmapNull = 0;
constexpr std::uint32_t kPmapGetPort = 3;
constexpr std::uint32_t kPmapDump = 4;
constexpr std::uint32_t kTcp = 6;

// Device core procedures.
enum : std::uint32_t {
  kCreateLink = 10,
  kDeviceWrite = 11,
  kDeviceRead = 12,
  kDeviceReadStb = 13,
  kDeviceTrigger = 14,
  kDeviceClear = 15,
  kDeviceRemote = 16,
  kDeviceLocal = 17,
  kDeviceLock = 18,
  kDeviceUnlock = 19,
  kDeviceEnableSrq = 20,
  kDeviceDocmd = 22,
  kDestroyLink = 23,
  kCreateIntrChan = 25,
  kDestroyIntrChan = 26,
};

// Device errors.
constexpr std::int32_t kNoError = 0;
constexpr std::int32_t kDeviceNotAccessible = 3;
constexpr std::int32_t kInvalidLink = 4;
constexpr std::int32_t kOperationNotSupported = 8;
constexpr std::int32_t kIoTimeout = 15;

// Operation flags and read reasons.
constexpr std::uint32_t kFlagEnd = 8;
constexpr std::uint32_t kFlagTermChar = 128;
constexpr std::uint32_t kReasonRequestCount = 1;
constexpr std::uint32_t kReasonChar = 2;
constexpr std::uint32_t kReasonEnd = 4;

// The status byte's message available bit: a response waits to be read.
constexpr std::uint8_t kMav = 0x10;

// The device name of a link: "inst" and a number, as "inst0".
bool IsDeviceName(std::string_view name) {
  std::string lower(name);
  std::transform(lower.begin(), lower.end(), lower.begin(), [](unsigned char c) { return std::tolower(c); });
  if (!lower.starts_with("inst") || lower.size() == 4) return false;
  return std::all_of(lower.begin() + 4, lower.end(), [](unsigned char c) { return std::isdigit(c) != 0; });
}

}  // namespace

bool SimVxi11Channel::Serve(long long nowMs, std::string& out) {
  mNowMs = nowMs;
  std::string record;
  for (;;) {
    const SimRpcRecordReader::Result result = mRecords.Next(record);
    if (result == SimRpcRecordReader::Result::None) return true;
    if (result == SimRpcRecordReader::Result::TooLarge) return false;
    std::string reply;
    if (!Answer(record, reply)) return false;
    if (!reply.empty()) out += SimRpcRecordReader::Mark(reply);
  }
}

bool SimVxi11Channel::Answer(const std::string& record, std::string& reply) {
  SimXdrReader call(record);
  const std::uint32_t xid = call.Uint();
  if (call.Uint() != kCall || call.Failed()) return false;
  SimXdrWriter out;
  out.Uint(xid).Uint(kReply);
  if (call.Uint() != kRpcVersion) {
    reply = out.Uint(kDenied).Uint(kRpcMismatch).Uint(kRpcVersion).Uint(kRpcVersion).Bytes();
    return true;
  }
  const std::uint32_t program = call.Uint();
  const std::uint32_t version = call.Uint();
  const std::uint32_t procedure = call.Uint();
  for (int auth = 0; auth < 2; ++auth) {
    call.Uint();
    call.Opaque(kMaxAuth);
  }
  out.Uint(kAccepted).Uint(kAuthNull).Opaque({});
  const bool mapper = mProgram == Program::PortMapper;
  const std::uint32_t ownProgram = mapper ? kPortMapperProgram : kDeviceCoreProgram;
  const std::uint32_t ownVersion = mapper ? kPortMapperVersion : kDeviceCoreVersion;
  SimXdrWriter results;
  if (call.Failed()) {
    out.Uint(kGarbageArgs);
  } else if (program != ownProgram) {
    out.Uint(kProgUnavail);
  } else if (version != ownVersion) {
    out.Uint(kProgMismatch).Uint(ownVersion).Uint(ownVersion);
  } else if (!(mapper ? PortMapper(procedure, call, results) : DeviceCore(procedure, call, results))) {
    out.Uint(kProcUnavail);
  } else if (call.Failed()) {
    out.Uint(kGarbageArgs);
  } else {
    out.Uint(kSuccess);
  }
  reply = out.Bytes();
  if (mDeferred) {
    mDeferred = false;
    mPendingRead->head = std::move(reply);
    reply.clear();
    return true;
  }
  if (!call.Failed()) reply += results.Bytes();
  return true;
}

bool SimVxi11Channel::PortMapper(std::uint32_t procedure, SimXdrReader& args, SimXdrWriter& results) {
  switch (procedure) {
    case kPmapNull: return true;
    case kPmapGetPort: {
      const std::uint32_t program = args.Uint();
      const std::uint32_t version = args.Uint();
      const std::uint32_t protocol = args.Uint();
      args.Uint();
      const bool core = program == kDeviceCoreProgram && version == kDeviceCoreVersion && protocol == kTcp;
      results.Uint(core ? mVxi11Port : 0);
      return true;
    }
    case kPmapDump:
      results.Uint(1).Uint(kDeviceCoreProgram).Uint(kDeviceCoreVersion).Uint(kTcp).Uint(mVxi11Port).Uint(0);
      return true;
    default: return false;
  }
}

bool SimVxi11Channel::DeviceCore(std::uint32_t procedure, SimXdrReader& args, SimXdrWriter& results) {
  if (procedure == kCreateLink) {
    CreateLink(args, results);
    return true;
  }
  if (procedure < kCreateLink || procedure > kDestroyIntrChan || procedure == 21 || procedure == 24) return false;
  // Every other procedure but the interrupt channel's starts with the link.
  const bool hasLink = procedure != kCreateIntrChan && procedure != kDestroyIntrChan;
  const std::int32_t id = hasLink ? args.Int() : 0;
  auto link = mLinks.find(id);
  if (hasLink && link == mLinks.end()) {
    results.Int(kInvalidLink);
    if (procedure == kDeviceWrite || procedure == kDeviceReadStb) results.Uint(0);
    if (procedure == kDeviceRead) results.Uint(0).Opaque({});
    if (procedure == kDeviceDocmd) results.Opaque({});
    return true;
  }
  switch (procedure) {
    case kDeviceWrite: {
      args.Uint();  // io_timeout: nothing here waits
      args.Uint();  // lock_timeout
      const std::uint32_t flags = args.Uint();
      const std::string_view data = args.Opaque(SimRpcRecordReader::kMaxRecord);
      if (!args.Failed()) Write(link->second, flags, data);
      results.Int(kNoError).Uint(static_cast<std::uint32_t>(data.size()));
      return true;
    }
    case kDeviceRead: {
      const std::uint32_t requestSize = args.Uint();
      const std::uint32_t ioTimeout = args.Uint();
      args.Uint();
      const std::uint32_t flags = args.Uint();
      const std::uint32_t termChar = args.Uint();
      if (!args.Failed() && link->second.responses.empty() && mSession->IsWaiting() && !mPendingRead) {
        mPendingRead = PendingRead{{}, id, requestSize, flags, termChar, mNowMs + ioTimeout};
        mDeferred = true;
        return true;
      }
      Read(link->second, requestSize, flags, termChar, results);
      return true;
    }
    case kDeviceReadStb: {
      const std::uint8_t mav = link->second.responses.empty() ? 0 : kMav;
      results.Int(kNoError).Uint(mSession->StatusByte() | mav);
      return true;
    }
    case kDeviceClear:
      // The device clear of IEEE 488.2: input and output go, the status stays.
      link->second = Link{};
      results.Int(kNoError);
      return true;
    case kDestroyLink:
      mLinks.erase(link);
      results.Int(kNoError);
      return true;
    case kDeviceDocmd:
      results.Int(kOperationNotSupported).Opaque({});
      return true;
    default:
      // Trigger, remote, local, lock, unlock, service requests and the interrupt channel.
      results.Int(kOperationNotSupported);
      return true;
  }
}

void SimVxi11Channel::CreateLink(SimXdrReader& args, SimXdrWriter& results) {
  args.Int();  // the client's id
  const bool lockDevice = args.Uint() != 0;
  args.Uint();  // lock_timeout
  const std::string_view device = args.Opaque(kMaxAuth);
  if (args.Failed()) return;
  // Nothing holds the device; a link that asks to start holding it is refused.
  std::int32_t error = kNoError;
  if (!IsDeviceName(device)) error = kDeviceNotAccessible;
  if (lockDevice) error = kOperationNotSupported;
  if (error == kNoError && !mSession) mSession = std::make_unique<SimScpiSession>(mProcessor, mConnection);
  const std::int32_t id = error == kNoError ? mNextLink++ : 0;
  if (error == kNoError) mLinks.emplace(id, Link{});
  results.Int(error).Int(id).Uint(0).Uint(kMaxRecvSize);
}

void SimVxi11Channel::Write(Link& link, std::uint32_t flags, std::string_view data) {
  link.reader.Feed(data.data(), data.size());
  // END ends the message as a line feed would; after one it adds an empty message, which runs
  // nothing.
  if (flags & kFlagEnd) link.reader.Feed("\n", 1);
  RunMessages(link);
}

void SimVxi11Channel::RunMessages(Link& link) {
  std::string message;
  while (!mSession->IsWaiting()) {
    const SimScpiReader::Result result = link.reader.Next(message);
    if (result == SimScpiReader::Result::None) return;
    if (result == SimScpiReader::Result::Overrun) {
      mSession->Overrun();
      continue;
    }
    Dstring reply;
    const SimScpiSession::Outcome outcome = mSession->Execute(message, reply);
    if (outcome == SimScpiSession::Outcome::Waiting) {
      mParkedLink = LinkId(link);
      return;
    }
    if (outcome == SimScpiSession::Outcome::Silent) continue;
    Respond(link, reply);
  }
}

void SimVxi11Channel::Respond(Link& link, const Dstring& reply) {
  link.responses.push_back(reply + "\n");
  link.waiting += reply.size() + 1;
  while ((link.waiting > kMaxWaiting || link.responses.size() > kMaxResponses) && link.responses.size() > 1) {
    link.waiting -= link.responses.front().size();
    link.responses.pop_front();
    mSession->Interrupted();
  }
}

std::int32_t SimVxi11Channel::LinkId(const Link& link) const {
  for (const auto& [id, each] : mLinks) {
    if (&each == &link) return id;
  }
  return 0;
}

void SimVxi11Channel::Tick(long long nowMs, std::string& out) {
  mNowMs = nowMs;
  Dstring reply;
  if (mSession && mSession->NeedsTicks() && mSession->Tick(reply) == SimScpiSession::Outcome::Answered) {
    auto parked = mLinks.find(mParkedLink);
    if (parked != mLinks.end()) Respond(parked->second, reply);
  }
  // Once the session goes on, what every link holds runs, the parked link's first.
  if (mSession && !mSession->IsWaiting()) {
    if (auto parked = mLinks.find(mParkedLink); parked != mLinks.end()) RunMessages(parked->second);
    for (auto& [id, link] : mLinks) RunMessages(link);
  }
  if (!mPendingRead) return;
  auto link = mLinks.find(mPendingRead->link);
  const bool ready = link != mLinks.end() && !link->second.responses.empty();
  if (ready || link == mLinks.end() || nowMs >= mPendingRead->deadlineMs) AnswerPendingRead(out);
}

void SimVxi11Channel::AnswerPendingRead(std::string& out) {
  SimXdrWriter results;
  auto link = mLinks.find(mPendingRead->link);
  if (link == mLinks.end()) {
    results.Int(kInvalidLink).Uint(0).Opaque({});
  } else {
    Read(link->second, mPendingRead->requestSize, mPendingRead->flags, mPendingRead->termChar, results);
  }
  out += SimRpcRecordReader::Mark(mPendingRead->head + results.Bytes());
  mPendingRead.reset();
}

void SimVxi11Channel::Read(Link& link, std::uint32_t requestSize, std::uint32_t flags, std::uint32_t termChar,
                           SimXdrWriter& results) {
  if (link.responses.empty()) {
    results.Int(kIoTimeout).Uint(0).Opaque({});
    return;
  }
  std::string& response = link.responses.front();
  std::size_t take = std::min<std::size_t>(requestSize, response.size());
  std::uint32_t reason = 0;
  if (flags & kFlagTermChar) {
    const std::size_t at = response.find(static_cast<char>(termChar & 0xFF));
    if (at < take) {
      take = at + 1;
      reason |= kReasonChar;
    }
  }
  if (take == response.size()) reason |= kReasonEnd;
  if (reason == 0) reason = kReasonRequestCount;
  results.Int(kNoError).Uint(reason).Opaque(std::string_view(response).substr(0, take));
  response.erase(0, take);
  link.waiting -= take;
  if (response.empty()) link.responses.pop_front();
}
