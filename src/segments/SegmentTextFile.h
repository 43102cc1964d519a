#pragma once

#include <functional>
#include <istream>
#include <ostream>
#include <string>
#include <vector>

#include "segments/DataFormat.h"
#include "segments/StateRange.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

class QenSegmentDs;
class SegmentBuffer;

// A segment as text, one vector per line, vector 0 first. A segment of the coding "01" is
// written in digits of the data format, the most significant first, as the editor shows it;
// a segment of any other coding one coding character per trace, the highest trace first.
// Lines starting with '#' are comments; blanks and '_' inside a line are ignored. A column is
// a character of a line, column 0 the leftmost (the highest traces).
//
// Text read in is checked whole before anything is sent: a line of the wrong width, a
// character outside the format or the coding, or no vectors at all is refused with the line
// it was found on, and the segment stays as it was. An import replaces the segment's contents
// and sets its length to the number of lines; a paste overwrites the rectangle from a vector
// and column on.
class SegmentTextFile {
 public:
  static int Export(QenSegmentDs& ds, DataFormat format, const Dstring& path, ConditionList& list);
  static int Import(QenSegmentDs& ds, DataFormat format, const Dstring& path, ConditionList& list);
  static int Write(QenSegmentDs& ds, DataFormat format, std::ostream& out, ConditionList& list);
  static int Read(QenSegmentDs& ds, DataFormat format, std::istream& in, const Dstring& source, ConditionList& list);
  // The range as lines of text, for the system clipboard: the digits (or traces) it touches.
  static int RangeText(QenSegmentDs& ds, DataFormat format, const StateRange& range, Dstring& text, ConditionList& list);
  // Text put with the first character of each line at the digit (or trace) of `trace`, from
  // `vector` on.
  static int Paste(QenSegmentDs& ds, DataFormat format, const Dstring& text, long vector, long trace, ConditionList& list);

  // The comment line that opens an export: the segment's name, dimensions, coding and format.
  static Dstring Header(const Dstring& name, long length, long width, const Dstring& coding,
                        DataFormat format);
  // The comment line of a part: the vectors first .. last of such a segment.
  static Dstring PartHeader(const Dstring& name, long first, long last, long length, long width,
                            const Dstring& coding, DataFormat format);
  // One vector as a line of the text form (without its newline); `state(trace)` gives the
  // state of each trace. Needs no server: the rescue writes what this side holds with it.
  using StateAt = std::function<char(long trace)>;
  static Dstring Line(const StateAt& state, long width, const Dstring& coding, DataFormat format);

  // Told after each block of a transfer how many of its vectors are done; false stops it with
  // "GUI_TRANSFER_STOPPED". A scope installs one for the transfers run inside it (GUI thread).
  using Progress = std::function<bool(long done, long total)>;
  class ProgressScope {
   public:
    explicit ProgressScope(Progress progress);
    ~ProgressScope();
    ProgressScope(const ProgressScope&) = delete;
    ProgressScope& operator=(const ProgressScope&) = delete;

   private:
    Progress mOuter;
  };

  // Runs `visit(buffer, from, to)` over vectors [first, last] in slices of one data block each,
  // on a buffer of its own that is let go at the end; writes each slice back after `visit`
  // when `write` is set. Stops at the first failure. last < 0: to the end of the segment.
  using Visit = std::function<int(SegmentBuffer* buffer, long from, long to, ConditionList& list)>;
  static int ForEachBlock(QenSegmentDs& ds, bool write, long first, long last, const Visit& visit, ConditionList& list);
};
