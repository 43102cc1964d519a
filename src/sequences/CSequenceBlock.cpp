#include "sequences/CSequenceBlock.h"

#include <algorithm>

#include "instrument/QenGuiInst.h"
#include "sequences/CPortInfo.h"
#include "sequences/SequenceSegmentSync.h"
#include "support/FWBlocker.h"

namespace {

// The keywords of the built-in segment kinds, in the order of SeqSegType from 1.
constexpr const char* kKeywords[] = {"PAUSE",     "PAUSE0",    "PAUSE1",  "ACQUIRE",
                                     "EXPECTED0", "EXPECTED1", "DONTCARE"};
constexpr unsigned long kNumKeywords = sizeof kKeywords / sizeof kKeywords[0];

// The default kind of a data port: an analyser port pauses at 0;
// any other port acquires while the system captures, and pauses otherwise.
CSequence::SeqSegType DefaultKind(const Dstring& portType, bool capturing) {
  if (portType == "INPUT_PORT") return CSequence::SEG_PAUSE0;
  return capturing ? CSequence::SEG_ACQUIRE : CSequence::SEG_PAUSE;
}

}  // namespace

std::unique_ptr<CSequence::CSequenceBlock> CSequence::CSequenceBlock::CloneContent() const {
  auto copy = std::make_unique<CSequenceBlock>(*this);
  copy->mLoops.clear();
  return copy;
}

bool CSequence::CSequenceBlock::SameContent(const CSequenceBlock& other) const {
  return mSegments == other.mSegments && mLength == other.mLength && mTrigger == other.mTrigger &&
         mMeasurementStart == other.mMeasurementStart && mVxi == other.mVxi && mLabel == other.mLabel &&
         mSync == other.mSync && mReactions == other.mReactions;
}

void CSequence::CSequenceBlock::FitPorts(unsigned long numPorts) {
  if (mSegments.size() > numPorts) mSegments.resize(numPorts);
  while (mSegments.size() < numPorts) mSegments.push_back(DefaultItem(mSegments.size() + 1));
}

CSequence::SeqSegType CSequence::CSequenceBlock::TypeOf(const DataItem& item) {
  if (item.GetType() == DataItemType::String) return SEG_NAMED;
  for (unsigned long i = 0; i < kNumKeywords; ++i) {
    if (item.GetText() == kKeywords[i]) return static_cast<SeqSegType>(i + 1);
  }
  return SEG_NAMED;
}

const char* CSequence::CSequenceBlock::KeywordOf(SeqSegType type) {
  return type >= 1 && static_cast<unsigned long>(type) <= kNumKeywords ? kKeywords[type - 1] : nullptr;
}

DataItem CSequence::CSequenceBlock::ItemOf(SeqSegType type, const Dstring& name) {
  const char* keyword = KeywordOf(type);
  return keyword ? DataItem::MakeWord(keyword) : DataItem::MakeString(name);
}

void CSequence::CSequenceBlock::SetLoop(unsigned long level, CLoop* loop) {
  if (level == 0) return;
  if (mLoops.size() < level) {
    if (loop == nullptr) return;
    // Room for every level at once: a read sets the levels of a block from the innermost out.
    mLoops.reserve(std::max(level, GetNumLoopLevels()));
    mLoops.resize(level, nullptr);
  }
  mLoops[level - 1] = loop;
}

int CSequence::CSequenceBlock::SyncSegments(SequenceSegmentSync& sync, std::set<Dstring>& done,
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

int CSequence::CSequenceBlock::SetDefaultSegment(unsigned long port, ConditionList& cond) {
  FWBlocker guard("CSequence::CSequenceBlock::SetDefaultSegment", cond);
  if (int status = guard.Block()) return status;
  Dstring reply;
  const Dstring cmd = Dstring::Format("%s:SGEN:GLOB:CONF?", QenGuiInst::GetAppHandle().c_str());
  if (int status = QenGuiInst::Call(cmd, reply, cond)) return status;
  reply = reply.Trimmed();
  if (int status = CPortInfo::SetConfiguration(reply, cond)) return status;
  Dstring type;
  if (int status = CPortInfo::GetPortType("PDAT", port, type, cond)) return status;
  const SeqSegType kind = DefaultKind(type, reply.StartsWith("\"CAPT"));
  if (port == 0 || port > mSegments.size()) return CSequence::kStatusError;
  mSegments[port - 1] = ItemOf(kind, "");
  return 0;
}

DataItem CSequence::CSequenceBlock::DefaultItem(unsigned long port) {
  Dstring type;
  ConditionList ignored;
  const bool known = CPortInfo::IsKnown() && CPortInfo::GetPortType("PDAT", port, type, ignored) == 0;
  const SeqSegType kind = known ? DefaultKind(type, CPortInfo::GetMode().StartsWith("CAPT")) : SEG_PAUSE;
  return ItemOf(kind, "");
}
