// Arbitrary text into the readers of the sequence subsystem: the sequence expression, the
// event expression, the configuration reply and the stored instance records.
//  - A sequence either fails with one condition and leaves an empty model, or is read into a
//    model the writer can write; that text reads back to a model that writes the same text.
//  - The input cut at its first line break is two sequences: the change analysis from the
//    first to the second, applied report by report to a copy of the first's blocks, must give
//    the second's blocks.
//  - Events that read build a text that reads back to the same table.
//  - A configuration either reads or leaves what was known; a record rebuilt by the factory
//    writes the list it was rebuilt from, apart from what its class does not read.
#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "sequences/CPortInfo.h"
#include "sequences/CSequence.h"
#include "sequences/CSequenceBlock.h"
#include "sequences/CSequenceEvents.h"
#include "sequences/CSequenceObserver.h"
#include "sequences/InstanceInfoFactory.h"
#include "support/ParserExpression.h"

namespace {

using Block = CSequence::CSequenceBlock;

void Check(bool ok) {
  if (!ok) __builtin_trap();
}

void CheckSequence(const Dstring& text) {
  CSequence seq;
  ConditionList list;
  if (seq.fromExpression(text, list) != 0) {
    Check(list.Size() == 1 && seq.GetNumBlocks() == 0 && seq.GetNumPorts() == 0 && seq.GetLoops().empty());
    return;
  }
  Check(list.IsEmpty() && seq.GetNumBlocks() >= 1 && !seq.IsReading());
  Dstring written;
  Check(seq.asExpression(written, list) == 0);
  CSequence again;
  Check(again.fromExpression(written, list) == 0);
  Dstring rewritten;
  Check(again.asExpression(rewritten, list) == 0);
  Check(rewritten == written);
  Check(again.GetNumBlocks() == seq.GetNumBlocks() && again.GetLoops().size() == seq.GetLoops().size());
  for (unsigned long b = 1; b <= seq.GetNumBlocks(); ++b) {
    Check(seq.GetBlock(b)->SameContent(*again.GetBlock(b)));
    for (unsigned long level = 1; level <= CSequence::kMaxLoopLevels; ++level) {
      Check(seq.GetLoopStatus(b, level) == again.GetLoopStatus(b, level));
    }
  }
}

// A view that keeps copies of the blocks and follows the block reports.
class MirrorView : public CSequenceObserver {
 public:
  MirrorView(const CSequence& old, const CSequence& now) : mNow(now) {
    for (unsigned long b = 1; b <= old.GetNumBlocks(); ++b)
      mBlocks.push_back(old.GetBlock(b)->CloneContent());
  }
  int NfyBlockInserted(unsigned long b, ConditionList&) override {
    Check(b >= 1 && b <= mBlocks.size() + 1);
    mBlocks.insert(mBlocks.begin() + static_cast<std::ptrdiff_t>(b - 1), mNow.GetBlock(b)->CloneContent());
    return 0;
  }
  int NfyBlockDeleted(unsigned long b, ConditionList&) override {
    Check(b >= 1 && b <= mBlocks.size());
    mBlocks.erase(mBlocks.begin() + static_cast<std::ptrdiff_t>(b - 1));
    return 0;
  }
  int NfyBlockLabelChanged(unsigned long b, ConditionList&) override { return Take(b); }
  int NfyBlockLengthChanged(unsigned long b, ConditionList&) override { return Take(b); }
  int NfyBlockMeasureChanged(unsigned long b, ConditionList&) override { return Take(b); }
  int NfyBlockSyncChanged(unsigned long b, ConditionList&) override { return Take(b); }
  int NfyBlockTriggerChanged(unsigned long b, ConditionList&) override { return Take(b); }
  int NfyBlockVXITriggerChanged(unsigned long b, ConditionList&) override { return Take(b); }
  int NfyBlockReactionsChanged(unsigned long b, ConditionList&) override { return Take(b); }
  int NfySegmentChanged(unsigned long b, unsigned long p, ConditionList&) override {
    Check(p >= 1 && p <= mNow.GetNumPorts());
    return Take(b);
  }
  int NfySequence(ConditionList&) override {
    mBlocks.clear();
    for (unsigned long b = 1; b <= mNow.GetNumBlocks(); ++b)
      mBlocks.push_back(mNow.GetBlock(b)->CloneContent());
    return 0;
  }

  bool Matches() const {
    if (mBlocks.size() != mNow.GetNumBlocks()) return false;
    for (unsigned long b = 1; b <= mBlocks.size(); ++b) {
      if (!mBlocks[b - 1]->SameContent(*mNow.GetBlock(b))) return false;
    }
    return true;
  }

 private:
  int Take(unsigned long b) {
    Check(b >= 1 && b <= mBlocks.size());
    mBlocks[b - 1] = mNow.GetBlock(b)->CloneContent();
    return 0;
  }

  const CSequence& mNow;
  std::vector<std::unique_ptr<Block>> mBlocks;
};

void CheckAnalysis(std::string_view text) {
  const std::size_t cut = text.find('\n');
  if (cut == std::string_view::npos) return;
  CSequence old, now;
  ConditionList list;
  if (old.fromExpression(Dstring(text.substr(0, cut)), list) != 0) return;
  if (now.fromExpression(Dstring(text.substr(cut + 1)), list) != 0) return;
  MirrorView view(old, now);
  now.AddObserver(&view);
  Check(now.AnalyzeChanges(old.GetContent(), list) == 0);
  Check(view.Matches());
}

void CheckEvents(const Dstring& text) {
  CSequenceEvents events;
  ConditionList list;
  if (events.FromExpression(text, list) != 0) {
    Check(list.Size() == 1 && events == CSequenceEvents());
    return;
  }
  const Dstring built = events.BuildExpression();
  CSequenceEvents again;
  Check(again.FromExpression(built, list) == 0);
  Check(again == events);
  Check(again.BuildExpression() == built);
}

void CheckConfiguration(const Dstring& text) {
  ConditionList list;
  CPortInfo::Invalidate();
  if (CPortInfo::SetConfiguration(text, list) != 0) {
    Check(!CPortInfo::IsKnown() && list.Size() == 1);
    return;
  }
  unsigned long data = 0;
  for (const CPortInfo::Port& port : CPortInfo::GetPorts()) data += port.portClass == "PDAT";
  Check(CPortInfo::GetNumPorts("PDAT") == data);
  CPortInfo::Invalidate();
}

void CheckRecord(const Dstring& text) {
  LispList list;
  ConditionList conditions;
  if (ParserExpression::Parse(text, list, conditions) != 0) return;
  std::unique_ptr<InstanceInfo> record = NDTools::InstanceInfoFactory(&list);
  if (!record) return;
  Check(record->isEqual(record->Clone().get()));
  LispList written;
  record->asLispList(written);
  std::unique_ptr<InstanceInfo> again = NDTools::InstanceInfoFactory(&written);
  Check(again != nullptr && again->isEqual(record.get()));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view bytes(reinterpret_cast<const char*>(data), size);
  const Dstring text(bytes);
  CSequence::SetNumLoopLevels(size % 5);
  CheckSequence(text);
  CheckAnalysis(bytes);
  CheckEvents(text);
  CheckConfiguration(text);
  CheckRecord(text);
  return 0;
}
