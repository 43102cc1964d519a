#pragma once

#include "sequences/PortInstanceInfo.h"

// A window that shows an analyser port on one of its displays; the display does not count for
// equality, which is PortInstanceInfo's (the class name is compared first).
class AnalyzerPortInstanceInfo : public PortInstanceInfo {
 public:
  AnalyzerPortInstanceInfo() = default;
  AnalyzerPortInstanceInfo(const Dstring& portClass, unsigned long portNum, unsigned long display)
      : PortInstanceInfo(portClass, portNum), mDisplay(display) {}
  // As PortInstanceInfo; 4: display.
  explicit AnalyzerPortInstanceInfo(const LispList& list);

  const char* IsA() const override { return "AnalyzerPortInstanceInfo"; }
  std::unique_ptr<InstanceInfo> Clone() const override {
    return std::make_unique<AnalyzerPortInstanceInfo>(*this);
  }
  void asLispList(LispList& list) const override;

  unsigned long GetDisplay() const { return mDisplay; }
  void SetDisplay(unsigned long display) { mDisplay = display; }

 private:
  unsigned long mDisplay = 0;
};
