#pragma once

#include "sequences/PortInstanceInfo.h"

// A window that shows one segment on one port.
class SegmentPortInstanceInfo : public PortInstanceInfo {
 public:
  SegmentPortInstanceInfo() = default;
  SegmentPortInstanceInfo(const Dstring& portClass, unsigned long portNum, const Dstring& segmentName)
      : PortInstanceInfo(portClass, portNum), mSegmentName(segmentName) {}
  // As PortInstanceInfo; 4: segment name.
  explicit SegmentPortInstanceInfo(const LispList& list);

  const char* IsA() const override { return "SegmentPortInstanceInfo"; }
  bool isEqual(const InstanceInfo* other) const override;
  std::unique_ptr<InstanceInfo> Clone() const override {
    return std::make_unique<SegmentPortInstanceInfo>(*this);
  }
  void asLispList(LispList& list) const override;

  const Dstring& GetSegmentName() const { return mSegmentName; }
  void SetSegmentName(const Dstring& name) { mSegmentName = name; }

 protected:
  bool SameSegmentPort(const SegmentPortInstanceInfo& other) const {
    return SamePort(other) && mSegmentName == other.mSegmentName;
  }

 private:
  Dstring mSegmentName;
};
