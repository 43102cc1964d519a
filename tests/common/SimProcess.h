#pragma once

#include <string>
#include <vector>

#include "instrument/QenSimProcess.h"

// The qensim of this build on an ephemeral loopback port, for one test.
// Port() is 0 when it did not start.
class SimProcess : public QenSimProcess {
 public:
  explicit SimProcess(const std::vector<std::string>& args = {"--test-control"}) {
    std::vector<std::string> all = {"--quiet"};
    all.insert(all.end(), args.begin(), args.end());
    Start(QENSIM_PATH, all);
  }
};
