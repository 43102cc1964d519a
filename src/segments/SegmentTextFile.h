#pragma once

#include <functional>
#include <istream>
#include <ostream>

#include "segments/DataFormat.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

class QenSegmentDs;
class SegmentBuffer;

// A segment as text, one vector per line, vector 0 first. A segment of the coding "01" is
// written in digits of the data format, the most significant first, as the editor shows it;
// a segment of any other coding one coding character per trace, the highest trace first. Lines starting with '#' are comments; blanks and '_' inside a line are ignored.
//
// An import is read and checked whole before anything is sent: a line of the wrong width, a
// character outside the format or the coding, or a file without vectors is refused with the
// line it was found on, and the segment stays as it was. A good file replaces the segment's
// contents and sets its length to the number of lines.
class SegmentTextFile {
 public:
  static int Export(QenSegmentDs& ds, DataFormat format, const Dstring& path, ConditionList& list);
  static int Import(QenSegmentDs& ds, DataFormat format, const Dstring& path, ConditionList& list);
  static int Write(QenSegmentDs& ds, DataFormat format, std::ostream& out, ConditionList& list);
  static int Read(QenSegmentDs& ds, DataFormat format, std::istream& in, const Dstring& source, ConditionList& list);

  // Runs `visit(buffer, from, to)` over the segment in slices of one data block each, on a
  // buffer of its own that is let go at the end; writes each slice back after `visit` when
  // `write` is set. Stops at the first failure.
  using Visit = std::function<int(SegmentBuffer* buffer, long from, long to, ConditionList& list)>;
  static int ForEachBlock(QenSegmentDs& ds, bool write, const Visit& visit, ConditionList& list);
};
