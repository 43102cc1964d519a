#pragma once

#include "segments/SegmentEnums.h"
#include "support/Dstring.h"

// What creation, QenSegmentDs::GetProperties and SetProperties exchange. The pseudo-random
// fields matter for the PRBS, PRWS and SFI5 types; the SFI5 fields are the expansion header
// and the framing bytes, both written as digits of `sfi5Base`.
struct SegmentProperties {
  Dstring name;
  SegmentType type = SegmentType::kMemory;
  Dstring coding = "01";
  long width = 0;
  long length = 0;
  Dstring polynomial;
  PRxSLogic logic = PRxSLogic::kNormal;
  PRxSSubType subType = PRxSSubType::kPure;
  long errorCount = 0;
  PRxSDensity density = PRxSDensity::k1of2;
  long extensionNumber = 0;
  Dstring sfi5ExpansionHeader;
  Dstring sfi5FramingBytes;
  long sfi5Base = 16;
};
