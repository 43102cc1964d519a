#include "SimDirtySet.h"

#include "support/DstringList.h"

void SimDirtySet::Add(const Dstring& header) {
  if (mAll || !mSeen.insert(header).second) return;
  mOrder.push_back(header);
  if (mOrder.size() > kMaxNames) MarkAll();
}

void SimDirtySet::MarkAll() {
  mAll = true;
  mOrder.clear();
  mSeen.clear();
}

Dstring SimDirtySet::TakeReply(const Dstring& handle) {
  DstringList quoted;
  if (mAll) quoted.push_back("\"ALL\"");
  for (const Dstring& header : mOrder)
    quoted.push_back(Dstring::Format("\":%s%s\"", handle.c_str(), header.c_str()));
  mAll = false;
  mOrder.clear();
  mSeen.clear();
  return quoted.Join(",");
}
