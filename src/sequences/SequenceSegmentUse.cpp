#include "sequences/SequenceSegmentUse.h"

#include <algorithm>

#include "sequences/CSequenceBlock.h"

namespace {

// Whether an item of a block's segments names a segment of the pool.
bool IsNamed(const DataItem& item) {
  return item.GetType() == DataItemType::String;
}

}  // namespace

std::vector<unsigned long> SequenceSegmentUse::BlocksNaming(const CSequence& sequence,
                                                            const Dstring& segment) {
  std::vector<unsigned long> blocks;
  for (unsigned long b = 1; b <= sequence.GetNumBlocks(); ++b) {
    const DataParcel& items = sequence.GetBlock(b)->GetSegments();
    if (std::any_of(items.begin(), items.end(), [&](const DataItem& item) {
          return IsNamed(item) && Dstring(item.GetText()) == segment;
        })) {
      blocks.push_back(b);
    }
  }
  return blocks;
}

std::vector<Dstring> SequenceSegmentUse::NamedSegments(const CSequence& sequence) {
  std::vector<Dstring> names;
  for (unsigned long b = 1; b <= sequence.GetNumBlocks(); ++b) {
    for (const DataItem& item : sequence.GetBlock(b)->GetSegments()) {
      const Dstring name(item.GetText());
      if (IsNamed(item) && std::find(names.begin(), names.end(), name) == names.end()) names.push_back(name);
    }
  }
  return names;
}

Dstring SequenceSegmentUse::BlocksText(const std::vector<unsigned long>& blocks) {
  Dstring text = blocks.size() == 1 ? "block " : "blocks ";
  for (std::size_t i = 0; i < blocks.size(); ++i) {
    if (i > 0) text += i + 1 == blocks.size() ? " and " : ", ";
    text += Dstring::Format("%lu", blocks[i]);
  }
  return text;
}

Dstring SequenceSegmentUse::SegmentsText(const CSequence& sequence, const std::vector<Dstring>& segments) {
  Dstring text;
  for (const Dstring& segment : segments) {
    if (!text.empty()) text += ", ";
    text += "\"" + segment + "\" (" + BlocksText(BlocksNaming(sequence, segment)) + ")";
  }
  return text;
}
