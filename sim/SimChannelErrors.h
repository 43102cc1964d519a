#pragma once

#include <map>
#include <memory>
#include <random>
#include <vector>

#include "SimCommandModule.h"

class SimBerMeter;
class SimCapture;

// The error state of every analyser data port by channel: the port's bit errors (SimBerMeter)
// shared out over the channels it receives, each new error on a channel picked at random, so
// that a port's channel counts always add up to its error count. The channels are the traces
// the port receives (SimCapture::ReceivedWidth), taken afresh whenever the counts start afresh.
//   "<port>:BER:CHAN?"  <errors on channel 0>,<on channel 1>,…
class SimChannelErrors : public SimCommandModule {
 public:
  SimChannelErrors(std::shared_ptr<const SimBerMeter> ber, std::shared_ptr<const SimCapture> capture)
      : mBer(std::move(ber)), mCapture(std::move(capture)) {}

  bool RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) override;
  void Advance(SimContext& context) override;

 private:
  struct Port {
    double shared = 0;  // the port's errors already given to a channel
    unsigned long epoch = 0;
    std::vector<double> channels;
  };

  // Brings a port's channels up to the meter's count now; a count that went down started afresh.
  Port& CatchUp(const Dstring& port);

  std::shared_ptr<const SimBerMeter> mBer;
  std::shared_ptr<const SimCapture> mCapture;
  std::map<Dstring, Port> mPorts;  // by port path, upper case
  std::mt19937_64 mRandom{71301};
};
