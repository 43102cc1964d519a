#include "sequences/CSequenceBlock.h"

#include <algorithm>

#include "sequences/SequenceSegmentSync.h"
#include "support/ConditionListLoader.h"
#include "support/FWBlocker.h"

namespace {

// The keywords of the built-in segment kinds, in the order of SeqSegType from 1.
constexpr const char* kKeywords[] = {"PAUSE",     "PAUSE0",    "PAUSE1",  "ACQUIRE",
                                     "EXPECTED0", "EXPECTED1", "DONTCARE"};
constexpr unsigned long kNumKeywords = sizeof kKeywords / sizeof kKeywords[0];

// The default kind of a data port: an analyser port pauses at 0;
// any other port acquires while the system captures, and pauses otherwise.
SequenceTypes::SeqSegType DefaultKind(const Dstring& portType, bool capturing) {
  if (portType == "INPUT_PORT") return SequenceTypes::SEG_PAUSE0;
  return capturing ? SequenceTypes::SEG_ACQUIRE : SequenceTypes::SEG_PAUSE;
}

}  // namespace

std::unique_ptr<SequenceTypes::CSequenceBlock> SequenceTypes::CSequenceBlock::CloneContent() const {
  auto copy = std::make_unique<CSequenceBlock>(*this);
  copy->mLoops.clear();
  return copy;
}

bool SequenceTypes::CSequenceBlock::SameContent(const CSequenceBlock& other) const {
  return mSegments == other.mSegments && mLength == other.mLength && mTrigger == other.mTrigger &&
         mMeasurementStart == other.mMeasurementStart && mVxi == other.mVxi && mLabel == other.mLabel &&
         mSync == other.mSync && mReactions == other.mReactions;
}

void SequenceTypes::CSequenceBlock::FitPorts(unsigned long numPorts, const SequencePorts& ports) {
  if (mSegments.size() > numPorts) mSegments.resize(numPorts);
  while (mSegments.size() < numPorts) mSegments.push_back(DefaultItem(mSegments.size() + 1, ports));
}

SequenceTypes::SeqSegType SequenceTypes::CSequenceBlock::TypeOf(const DataItem& item) {
  if (item.GetType() == DataItemType::String) return SEG_NAMED;
  for (unsigned long i = 0; i < kNumKeywords; ++i) {
    if (item.GetText() == kKeywords[i]) return static_cast<SeqSegType>(i + 1);
  }
  return SEG_NAMED;
}

const char* SequenceTypes::CSequenceBlock::KeywordOf(SeqSegType type) {
  return type >= 1 && static_cast<unsigned long>(type) <= kNumKeywords ? kKeywords[type - 1] : nullptr;
}

DataItem SequenceTypes::CSequenceBlock::ItemOf(SeqSegType type, const Dstring& name) {
  const char* keyword = KeywordOf(type);
  return keyword ? DataItem::MakeWord(keyword) : DataItem::MakeString(name);
}

void SequenceTypes::CSequenceBlock::SetLoop(unsigned long level, CLoop* loop) {
  if (level == 0) return;
  if (mLoops.size() < level) {
    if (loop == nullptr) return;
    // Room for every level at once: a read sets the levels of a block from the innermost out.
    mLoops.reserve(std::max(level, GetNumLoopLevels()));
    mLoops.resize(level, nullptr);
  }
  mLoops[level - 1] = loop;
}

int SequenceTypes::CSequenceBlock::SyncSegments(SequenceSegmentSync& sync, std::set<Dstring>& done,
                                                ConditionList& cond) const {
  FWBlocker guard("CSequence::CSequenceBlock::SyncSegments", cond);
  if (int status = guard.Block()) return status;
  for (const DataItem& item : mSegments) {
    if (item.GetType() != DataItemType::String) continue;
    Dstring name(item.GetText());
    if (!done.insert(name).second) continue;
    if (int status = sync.SyncSegment(name, cond)) return status;
  }
  return 0;
}

int SequenceTypes::CSequenceBlock::SetDefaultSegment(unsigned long port, SequencePorts::Source source,
                                                     ConditionList& cond) {
  FWBlocker guard("CSequence::CSequenceBlock::SetDefaultSegment", cond);
  if (int status = guard.Block()) return status;
  // Asked afresh: the port's type and the measurement mode may have changed since last known.
  SequencePorts ports;
  if (source) {
    if (int status = source(SequencePorts::Ask::Server, ports, cond)) return status;
  }
  const Dstring* type = ports.DataPortType(port);
  if (type == nullptr) {
    ConditionListLoader::ConditionToken(cond, "GUI_PORTINFO_NO_PORT",
                                        {Dstring("PDAT"), Dstring::Format("%lu", port)}, kStatusError);
    return kStatusError;
  }
  if (port > mSegments.size()) return kStatusError;
  mSegments[port - 1] = ItemOf(DefaultKind(*type, ports.capture), "");
  return 0;
}

DataItem SequenceTypes::CSequenceBlock::DefaultItem(unsigned long port, const SequencePorts& ports) {
  const Dstring* type = ports.known ? ports.DataPortType(port) : nullptr;
  return ItemOf(type ? DefaultKind(*type, ports.capture) : SEG_PAUSE, "");
}
