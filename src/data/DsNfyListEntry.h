#pragma once

#include <cstdint>

#include "support/ConditionList.h"
#include "support/Dstring.h"

class QenDs;
class QenDsView;

using QenDsProc = int (*)(QenDs* source, void* client, ConditionList& list);
using QenDsMatchProc = int (*)(QenDs* source, void* client, const Dstring& name);

// One registration on a data source: a view, or a procedure with its match procedure and client.
class DsNfyListEntry {
 public:
  explicit DsNfyListEntry(QenDsView* view) : mView(view) {}
  DsNfyListEntry(QenDsProc proc, QenDsMatchProc matchProc, void* client)
      : mProc(proc), mMatchProc(matchProc), mClient(client) {}

  QenDsView* GetView() const { return mView; }
  QenDsProc GetProc() const { return mProc; }
  QenDsMatchProc GetMatchProc() const { return mMatchProc; }
  void* GetClient() const { return mClient; }

  // Equal registrations have equal fields; the serial does not count.
  bool isEqual(const DsNfyListEntry& other) const {
    return mView == other.mView && mProc == other.mProc && mMatchProc == other.mMatchProc &&
           mClient == other.mClient;
  }

  // Order of registration on its source, increasing; set by the source.
  std::uint64_t GetSerial() const { return mSerial; }
  void SetSerial(std::uint64_t serial) { mSerial = serial; }

 private:
  QenDsView* mView = nullptr;
  QenDsProc mProc = nullptr;
  QenDsMatchProc mMatchProc = nullptr;
  void* mClient = nullptr;
  std::uint64_t mSerial = 0;
};
