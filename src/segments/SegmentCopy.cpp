#include "segments/SegmentCopy.h"

#include <utility>

SegmentCopy::SegmentCopy(Dstring coding, long width, long length, long columns)
    : mCoding(std::move(coding)), mWidth(width), mLength(length), mColumns(columns) {
  for (long v = 0; v < mLength; ++v) mBody.append(static_cast<std::size_t>(mColumns), ' ').push_back('\n');
}

void SegmentCopy::SetLine(long vector, std::string_view line) {
  if (vector < 0 || vector >= mLength || static_cast<long>(line.size()) != mColumns) return;
  mBody.replace(static_cast<std::size_t>(vector * (mColumns + 1)), line.size(), line);
}
