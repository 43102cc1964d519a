#include "data/BerHistory.h"

void BerHistory::Add(double seconds, const std::vector<BerSvr::PortResult>& results) {
  std::vector<Dstring> ports;
  ports.reserve(results.size());
  for (const auto& r : results) ports.push_back(r.port);
  if (ports != mPorts) {
    mPorts = std::move(ports);
    mSamples.clear();
  }
  if (mSamples.empty()) mStart = seconds;
  Sample sample{seconds - mStart, {}};
  sample.ratios.reserve(results.size());
  for (const auto& r : results) sample.ratios.push_back(r.ratio);
  mSamples.push_back(std::move(sample));
  if (mSamples.size() > kMaxSamples) mSamples.pop_front();
}

void BerHistory::Clear() {
  mSamples.clear();
}

Dstring BerHistory::TableCsv(const std::vector<BerSvr::PortResult>& results) {
  Dstring out = "port,compared,errors,ratio\n";
  for (const auto& r : results) {
    out += Dstring::Format("%s,%llu,%llu,%.6E\n", r.port.c_str(), r.compared, r.errors, r.ratio);
  }
  return out;
}

Dstring BerHistory::HistoryCsv() const {
  Dstring out = "seconds";
  for (const Dstring& port : mPorts) out += "," + port;
  out += '\n';
  for (const Sample& s : mSamples) {
    out += Dstring::Format("%.3f", s.seconds);
    for (double ratio : s.ratios) out += Dstring::Format(",%.6E", ratio);
    out += '\n';
  }
  return out;
}
