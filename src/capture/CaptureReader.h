#pragma once

#include "capture/CaptureData.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

// Reads an analyser port's last capture (":CGR1:MOD3:CONN1") from the instrument in blocks of
// at most kMaxBlockBytes, straight into the capture it is held in, with its clock group's
// period. A reply that is not what was asked leaves the capture empty and says so.
class CaptureReader {
 public:
  static constexpr long kMaxBlockBytes = 8L << 20;

  static int Read(const Dstring& port, CaptureData& out, ConditionList& list);
  // Vectors per block for a capture of `width` traces: a multiple of 64.
  static long BlockVectors(long width);

 private:
  static int Ask(const Dstring& what, Dstring& reply, ConditionList& list);
  static int BadReply(const Dstring& what, const Dstring& reply, ConditionList& list);
};
