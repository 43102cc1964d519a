#pragma once

#include "sequences/InstanceInfo.h"

// The sequence editor: there is one sequence, so any two of these are equal.
class SequenceInstanceInfo : public InstanceInfo {
 public:
  SequenceInstanceInfo() = default;
  explicit SequenceInstanceInfo(const LispList& list) : InstanceInfo(list) {}

  const char* IsA() const override { return "SequenceInstanceInfo"; }
  bool isEqual(const InstanceInfo* other) const override { return SameClass(other); }
  std::unique_ptr<InstanceInfo> Clone() const override {
    return std::make_unique<SequenceInstanceInfo>(*this);
  }
};
