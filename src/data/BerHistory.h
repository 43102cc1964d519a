#pragma once

#include <cstddef>
#include <deque>
#include <vector>

#include "data/BerSvr.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

// The ratio of every analyser port over time, as the bit error rate window charts it: a
// sample each time the counts change, the oldest dropped beyond kMaxSamples (an hour at one a
// second). A change of the port list (another configuration) starts it afresh. Also the CSV
// forms of the table and of the history.
class BerHistory {
 public:
  static constexpr std::size_t kMaxSamples = 3600;

  struct Sample {
    double seconds = 0;  // since the first sample
    std::vector<double> ratios;
  };

  // `seconds` is any steady clock reading; samples are kept relative to the first.
  void Add(double seconds, const std::vector<BerSvr::PortResult>& results);
  void Clear();
  const std::deque<Sample>& Samples() const { return mSamples; }
  const std::vector<Dstring>& Ports() const { return mPorts; }

  // "port,compared,errors,ratio", a line per port.
  static Dstring TableCsv(const std::vector<BerSvr::PortResult>& results);
  // "seconds,<port>,...", a line per sample.
  Dstring HistoryCsv() const;

 private:
  std::vector<Dstring> mPorts;
  std::deque<Sample> mSamples;
  double mStart = 0;
};
