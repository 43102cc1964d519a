#pragma once

#include <vector>

#include "data/QenDs.h"
#include "support/Dstring.h"

// The bit error rate service: the compared-bit count, error count and ratio of every analyser
// port, read from the instrument while it runs and kept in this data source for the views.
// Init finds the analyser ports (their ":BER" settings, listed with the "L" prefix) and reads
// what they counted so far; UpdateFromFW(1, …) reads all of them in one joined query and tells the views when anything
// changed. While a view wants the error state by channel (WantChannels), the same query also
// asks each port's "<port>:CHAN?", so the error state costs no round trip of its own. The
// initialised flag is what the poll tests before setting the service up again
// after the instrument was held by another client.
class BerSvr : public QenDs {
 public:
  struct PortResult {
    Dstring port;  // the setting after the handle, as ":CGR1:MOD3:CONN1:BER"
    unsigned long long compared = 0;
    unsigned long long errors = 0;
    double ratio = 0.0;
    std::vector<unsigned long long> channels;  // errors per channel, when asked for
    bool operator==(const PortResult&) const = default;
  };

  static constexpr unsigned kReadResults = 1;

  int Init(ConditionList& list);
  void End();
  bool IsInitialized() const { return mInitialized; }
  int UpdateFromFW(unsigned what, ConditionList& list);
  // Starts the counts of every port afresh ("<port>:RES", one frame), then reads them.
  int Reset(ConditionList& list);
  const std::vector<PortResult>& GetResults() const { return mResults; }
  // Counts the views that want the channels; the last one to stop wanting them drops them.
  void WantChannels(bool want);
  bool HasChannels() const { return mChannelViews > 0; }

 private:
  // One command per port, the port's setting followed by `suffix` (and then another followed
  // by `second`, when given), joined into one frame.
  static Dstring Joined(const std::vector<PortResult>& ports, const char* suffix, const char* second = nullptr);
  // Reads the counts of `results` (and their channels, when wanted) in one frame; on failure
  // `results` is left as it was.
  int ReadCounts(std::vector<PortResult>& results, ConditionList& list) const;

  bool mInitialized = false;
  int mChannelViews = 0;
  std::vector<PortResult> mResults;
};
