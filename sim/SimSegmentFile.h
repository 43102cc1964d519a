#pragma once

#include <string>

#include "SimSegment.h"

// The file of a segment: a text head, then the pattern memory as it is packed.
//
//   QENSIM-SEGMENT 1
//   type MEM
//   coding "01"
//   width 64
//   param "_Polynom" ("2^7-1")        (one line per generator parameter)
//   data 16777216,134217728           (vectors, then bytes: width rows padded to bytes)
//   <the rows, trace 0 first>
class SimSegmentFile {
 public:
  // Writes through a temporary file renamed over the old one, so that a failed save leaves
  // the last good file; false when it could not be written.
  static bool Save(const SimSegment& segment, const std::string& path);
  // Reads the file into `segment` (its name is kept): 0, -256 when there is no such file, or
  // -200 when it cannot be read as a segment (the segment is then unchanged).
  static int Load(const std::string& path, SimSegment& segment);
};
