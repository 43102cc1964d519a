#pragma once

#include <string>
#include <string_view>

#include "support/Dstring.h"

// A whole segment as lines of the text form, every line as long as the others, kept on this
// side so that unsaved work can still be written out when the server is gone.
class SegmentCopy {
 public:
  // `columns` characters a line, `length` lines, all blank until set.
  SegmentCopy(Dstring coding, long width, long length, long columns);

  const Dstring& GetCoding() const { return mCoding; }
  long GetWidth() const { return mWidth; }
  long GetLength() const { return mLength; }
  // Replaces line `vector`; a line outside the copy or of another length is ignored.
  void SetLine(long vector, std::string_view line);
  // The lines, each ended by a newline.
  const std::string& GetBody() const { return mBody; }

 private:
  Dstring mCoding;
  long mWidth;
  long mLength;
  long mColumns;
  std::string mBody;
};
