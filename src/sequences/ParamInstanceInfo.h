#pragma once

#include "sequences/InstanceInfo.h"

// A parameter editor page: the command path it edits, its resource type and start page.
class ParamInstanceInfo : public InstanceInfo {
 public:
  ParamInstanceInfo() = default;
  ParamInstanceInfo(const Dstring& cmdPath, unsigned long resType, unsigned long startPage = 0)
      : mCmdPath(cmdPath), mResType(resType), mStartPage(startPage) {}
  // As InstanceInfo; 2: command path; 3: resource type. The start page is not read.
  explicit ParamInstanceInfo(const LispList& list);

  const char* IsA() const override { return "ParamInstanceInfo"; }
  bool isEqual(const InstanceInfo* other) const override;
  std::unique_ptr<InstanceInfo> Clone() const override { return std::make_unique<ParamInstanceInfo>(*this); }
  void asLispList(LispList& list) const override;

  const Dstring& GetCmdPath() const { return mCmdPath; }
  void SetCmdPath(const Dstring& path) { mCmdPath = path; }
  unsigned long GetResType() const { return mResType; }
  unsigned long GetStartPage() const { return mStartPage; }
  void SetStartPage(unsigned long page) { mStartPage = page; }

 private:
  Dstring mCmdPath;
  unsigned long mResType = 0;
  unsigned long mStartPage = 0;
};
