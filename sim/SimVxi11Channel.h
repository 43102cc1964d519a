#pragma once

#include <cstdint>
#include <deque>
#include <map>
#include <memory>
#include <optional>
#include <string>

#include "SimCommandProcessor.h"
#include "SimRpcRecordReader.h"
#include "SimScpiReader.h"
#include "SimScpiSession.h"
#include "SimXdrReader.h"
#include "SimXdrWriter.h"

// One TCP connection of ONC RPC: either the port mapper (program 100000, version 2), which
// answers GETPORT with the VXI-11 port, or the VXI-11 core channel (program 0x0607AF,
// version 1), whose links carry the same SCPI session as the raw SCPI socket. A message
// written in pieces runs when the piece with END arrives; its response waits for device_read.
// Nothing blocks: a read with no response pending answers io_timeout at once, unless the session
// is parked at *WAI or *OPC?; then the read is answered from Tick when the response comes or its
// io_timeout has passed. The links of one connection share its session.
class SimVxi11Channel {
 public:
  enum class Program { PortMapper, DeviceCore };

  static constexpr std::uint32_t kPortMapperProgram = 100000;
  static constexpr std::uint32_t kPortMapperVersion = 2;
  static constexpr std::uint32_t kDeviceCoreProgram = 0x0607AF;
  static constexpr std::uint32_t kDeviceCoreVersion = 1;
  // The largest write the device takes in one call. Clients split longer messages and mark only
  // the last piece with END; some do so only when the pieces are this size.
  static constexpr std::uint32_t kMaxRecvSize = 1024;
  // The responses a link keeps for device_read: room for the largest block a query answers,
  // twice, in at most kMaxResponses. Beyond either the oldest go, each with -410 on the error
  // queue.
  static constexpr std::size_t kMaxWaiting = 2 * SimScpiReader::kMaxMessage;
  static constexpr std::size_t kMaxResponses = 1024;

  // `vxi11Port` is what GETPORT answers for the device core program over TCP.
  SimVxi11Channel(Program program, SimCommandProcessor& processor, int connection, unsigned short vxi11Port)
      : mProgram(program), mProcessor(processor), mConnection(connection), mVxi11Port(vxi11Port) {}

  void Feed(const char* data, std::size_t size) { mRecords.Feed(data, size); }
  // Answers every complete call that arrived, appending the marked replies to `out`; false
  // when the stream cannot be read any further and the connection should end. `nowMs` is the
  // server's clock, for the io_timeout of a read that waits.
  bool Serve(long long nowMs, std::string& out);
  // A parked session goes on, and a waiting read is answered when it can be.
  void Tick(long long nowMs, std::string& out);
  bool NeedsTicks() const { return mPendingRead.has_value() || (mSession && mSession->NeedsTicks()); }

 private:
  // A link reads its messages as the raw SCPI socket does (END ends one too); each response
  // waits whole until device_read has taken all of it.
  struct Link {
    SimScpiReader reader;
    std::deque<std::string> responses;
    std::size_t waiting = 0;  // their bytes
  };

  // A read that waits for the parked session's response: its reply's head and its arguments.
  struct PendingRead {
    std::string head;
    std::int32_t link = 0;
    std::uint32_t requestSize = 0;
    std::uint32_t flags = 0;
    std::uint32_t termChar = 0;
    long long deadlineMs = 0;
  };

  // The reply to one call record, empty when it is answered later; false when the record is not
  // a call at all.
  bool Answer(const std::string& record, std::string& reply);
  // Runs the messages a link holds, as long as the session does not wait.
  void RunMessages(Link& link);
  void Respond(Link& link, const Dstring& reply);
  std::int32_t LinkId(const Link& link) const;
  // Answers the waiting read from what its link holds now (io_timeout when nothing).
  void AnswerPendingRead(std::string& out);
  // The results of a procedure, or false when its arguments could not be read.
  bool PortMapper(std::uint32_t procedure, SimXdrReader& args, SimXdrWriter& results);
  bool DeviceCore(std::uint32_t procedure, SimXdrReader& args, SimXdrWriter& results);
  void CreateLink(SimXdrReader& args, SimXdrWriter& results);
  void Write(Link& link, std::uint32_t flags, std::string_view data);
  void Read(Link& link, std::uint32_t requestSize, std::uint32_t flags, std::uint32_t termChar, SimXdrWriter& results);

  Program mProgram;
  SimCommandProcessor& mProcessor;
  int mConnection;
  unsigned short mVxi11Port;
  SimRpcRecordReader mRecords;
  std::unique_ptr<SimScpiSession> mSession;
  std::map<std::int32_t, Link> mLinks;
  std::int32_t mNextLink = 1;
  long long mNowMs = 0;
  bool mDeferred = false;
  std::int32_t mParkedLink = 0;
  std::optional<PendingRead> mPendingRead;
};
