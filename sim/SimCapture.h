#pragma once

#include <map>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "SimTimedTask.h"

class SimBerMeter;
class SimCabling;
class SimSegment;
class SimSegmentStore;
class SimSequence;

// The capture of every analyser data port (":CAPT", see SimTimedTask; 250 ms per port): while
// the instrument runs, each analyser port records ":MEAS:CAPT:DEPT" vectors of what the
// generator port that drives it (SimCabling) sends under the sequence, with bit errors at
// the port's error ratio; one that nothing drives receives a low line.
// The last finished capture stays until the next one finishes; a cancelled one changes nothing.
//   "<port>:CAPT:SIZE?"              <vectors>,<traces> of the last capture ("0,0" before one)
//   "<port>:CAPT:DATA? START,COUNT"  the received bits, a block of one row per trace, packed
//                                    most significant bit first and padded to a byte
//   "<port>:CAPT:ERR? START,COUNT"   the bits in error, in the same layout
// A start while nothing runs is -221.
class SimCapture : public SimTimedTask {
 public:
  // At most this many bytes in one reply.
  static constexpr std::size_t kMaxReplyBytes = 8u << 20;

  SimCapture(std::shared_ptr<const SimSequence> sequence, std::shared_ptr<const SimSegmentStore> segments,
             std::shared_ptr<const SimBerMeter> ber, std::shared_ptr<const SimCabling> connections)
      : SimTimedTask(":CAPT", 0.25),
        mSequence(std::move(sequence)),
        mSegments(std::move(segments)),
        mBer(std::move(ber)),
        mConnections(std::move(connections)) {}

  bool RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) override;
  // The traces an analyser data port receives under the sequence now: the widest segment its
  // generator plays in a capture of the default depth; 1 when it receives nothing.
  long ReceivedWidth(const Dstring& port) const;

 protected:
  int StartRefusal(SimContext& context) const override;
  std::size_t Begin(SimContext& context) override;
  void ItemDone(std::size_t item, SimContext& context) override;
  void Aborted(std::size_t, SimContext&) override { mPending.clear(); }
  bool RunTaskCommand(const Dstring&, const SimCommand&, SimContext&) override { return false; }

 private:
  struct Record {
    long width = 0;
    long length = 0;
    std::vector<std::string> rows;    // received
    std::vector<std::string> errors;  // received XOR sent
  };
  // A segment's states as bits (the second state of its coding, and "1" and "H", are high).
  struct Bits {
    long width = 0;
    long length = 0;
    std::vector<std::vector<bool>> traces;
  };

  // What `generator` (a data port's place, or -1 for none) sends for `vectors` vectors.
  Record Sent(long generator, long vectors);
  const Bits& BitsOf(const Dstring& name, long vectors, std::map<Dstring, Bits>& cache) const;
  void InjectErrors(Record& record, double ratio);
  // The data port place (slot of a block) of the generator that drives each analyser data
  // port, -1 for none.
  std::map<Dstring, long> Sources() const;
  int ReplyBits(const Record& record, bool errors, const SimCommand& cmd, SimContext& context) const;

  std::shared_ptr<const SimSequence> mSequence;
  std::shared_ptr<const SimSegmentStore> mSegments;
  std::shared_ptr<const SimBerMeter> mBer;
  std::shared_ptr<const SimCabling> mConnections;
  std::map<Dstring, Record> mRecords;  // by port path, upper case
  std::map<Dstring, Record> mPending;
  std::mt19937_64 mRandom{71300};
};
