#pragma once

#include <string>

#include "support/ConditionList.h"

// Connects the one call path to a server and creates the application handle from the
// resource name; every failure is a condition.
class HostConnection {
 public:
  static int Open(const std::string& host, unsigned short port, const std::string& resource, ConditionList& list);
};
