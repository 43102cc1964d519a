#pragma once

#include "sequences/InstanceInfo.h"

// A window that shows one port: its class ("PDAT") and number. The instance name does not
// count for equality.
class PortInstanceInfo : public InstanceInfo {
 public:
  PortInstanceInfo() = default;
  PortInstanceInfo(const Dstring& portClass, unsigned long portNum)
      : mPortClass(portClass), mPortNum(portNum) {}
  // As InstanceInfo; 2: port class; 3: port number.
  explicit PortInstanceInfo(const LispList& list);

  const char* IsA() const override { return "PortInstanceInfo"; }
  bool isEqual(const InstanceInfo* other) const override;
  std::unique_ptr<InstanceInfo> Clone() const override { return std::make_unique<PortInstanceInfo>(*this); }
  void asLispList(LispList& list) const override;

  const Dstring& GetPortClass() const { return mPortClass; }
  unsigned long GetPortNum() const { return mPortNum; }
  void SetPortNum(unsigned long n) { mPortNum = n; }

 protected:
  bool SamePort(const PortInstanceInfo& other) const {
    return mPortClass == other.mPortClass && mPortNum == other.mPortNum;
  }

 private:
  Dstring mPortClass;
  unsigned long mPortNum = 0;
};
