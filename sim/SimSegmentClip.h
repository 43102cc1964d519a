#pragma once

#include "SimSegmentRows.h"
#include "support/Dstring.h"

// The clipboard of the segment editors, one for the whole server: every client copies into it
// and pastes from it.
struct SimSegmentClip {
  bool filled = false;
  Dstring coding;
  SimSegmentRows rows;
};
