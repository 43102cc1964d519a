#include "sequences/SequenceContent.h"

#include "sequences/CLoop.h"
#include "sequences/CSequenceBlock.h"

SequenceTypes::Content::Content() {
  blocks.reserve(64);
  loops.reserve(64);
}
SequenceTypes::Content::~Content() = default;
SequenceTypes::Content::Content(Content&&) noexcept = default;
SequenceTypes::Content& SequenceTypes::Content::operator=(Content&&) noexcept = default;

void SequenceTypes::Content::Clear() {
  blocks.clear();
  loops.clear();
  numPorts = 0;
}
