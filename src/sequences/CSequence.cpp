#include "sequences/CSequence.h"

#include <algorithm>
#include <cctype>
#include <cmath>
#include <set>

#include "data/DirtyFlagDs.h"
#include "instrument/CommandText.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "sequences/CLoop.h"
#include "sequences/CSequenceAnalyzer.h"
#include "sequences/CSequenceBlock.h"
#include "sequences/CSequenceObserver.h"
#include "sequences/CSequenceReader.h"
#include "sequences/CSequenceStructure.h"
#include "sequences/CSequenceWriter.h"
#include "sequences/SequenceSegmentSync.h"
#include "sequences/SequenceSegmentUse.h"
#include "support/ConditionListLoader.h"
#include "support/FWBlocker.h"
#include "support/LgsDebug.h"
#include "support/LispList.h"
#include "support/ParserExpression.h"

std::unique_ptr<CSequence::CSequenceBlock> CSequence::mClipboard;

namespace {

// Texts in conditions are cut here: a whole sequence would drown the message.
constexpr std::size_t kShownText = 160;

Dstring Shown(const Dstring& text) {
  return text.size() <= kShownText ? text : Dstring(text.substr(0, kShownText) + "...");
}

Dstring Number(unsigned long n) {
  return Dstring::Format("%lu", n);
}

int Refuse(ConditionList& cond, std::string_view key, std::initializer_list<Dstring> args) {
  ConditionListLoader::ConditionToken(cond, key, args, CSequence::kStatusError);
  return CSequence::kStatusError;
}

Dstring Command(const char* format) {
  return Dstring::Format(format, QenGuiInst::GetAppHandle().c_str());
}

}  // namespace

// --- Life and wiring -------------------------------------------------------------------------

CSequence::CSequence() = default;

CSequence::~CSequence() {
  DetachDirtyFlag();
}

void CSequence::AddObserver(CSequenceObserver* observer) {
  if (std::find(mObservers.begin(), mObservers.end(), observer) == mObservers.end())
    mObservers.push_back(observer);
}

void CSequence::RemoveObserver(CSequenceObserver* observer) {
  std::erase(mObservers, observer);
}

void CSequence::AttachDirtyFlag(DirtyFlagDs* dirtyFlag) {
  DetachDirtyFlag();
  mDirtyFlag = dirtyFlag;
  if (mDirtyFlag) mDirtyFlag->RegisterProc(&CSequence::DirtyFlagProc, &CSequence::DirtyFlagMatch, this);
}

void CSequence::DetachDirtyFlag() {
  if (mDirtyFlag) mDirtyFlag->UnregisterProc(&CSequence::DirtyFlagProc, &CSequence::DirtyFlagMatch, this);
  mDirtyFlag = nullptr;
}

SequencePorts CSequence::Ports(SequencePorts::Ask ask) const {
  SequencePorts ports;
  ConditionList dropped;
  if (mPortSource) mPortSource(ask, ports, dropped);
  return ports;
}

// --- Reading ---------------------------------------------------------------------------------

const CSequence::CSequenceBlock* CSequence::GetBlock(unsigned long block) const {
  return MutableBlock(block);
}

CSequence::CSequenceBlock* CSequence::MutableBlock(unsigned long block) const {
  return block >= 1 && block <= mContent.blocks.size() ? mContent.blocks[block - 1].get() : nullptr;
}

Dstring CSequence::GetSegment(unsigned long block, unsigned long port) const {
  const CSequenceBlock* b = GetBlock(block);
  if (b == nullptr || port == 0 || port > b->GetSegments().size()) return {};
  return Dstring(b->GetSegments()[port - 1].GetText());
}

CSequence::SeqSegType CSequence::GetType(unsigned long block, unsigned long port) const {
  const CSequenceBlock* b = GetBlock(block);
  if (b == nullptr || port == 0 || port > b->GetSegments().size()) return SEG_NAMED;
  return CSequenceBlock::TypeOf(b->GetSegments()[port - 1]);
}

unsigned long CSequence::GetBlockLength(unsigned long block) const {
  const CSequenceBlock* b = GetBlock(block);
  return b ? b->GetLength() : 0;
}

Dstring CSequence::GetLabel(unsigned long block) const {
  const CSequenceBlock* b = GetBlock(block);
  return b ? b->GetLabel() : Dstring();
}

unsigned long CSequence::GetBlockTrigger(unsigned long block) const {
  const CSequenceBlock* b = GetBlock(block);
  return b ? b->GetTrigger() : 0;
}

unsigned long CSequence::GetBlockMeasurementStart(unsigned long block) const {
  const CSequenceBlock* b = GetBlock(block);
  return b ? b->GetMeasurementStart() : 0;
}

unsigned CSequence::GetBlockSync(unsigned long block) const {
  const CSequenceBlock* b = GetBlock(block);
  return b ? b->GetSync() : 0;
}

bool CSequence::HasBlockSync() const {
  return std::any_of(mContent.blocks.begin(), mContent.blocks.end(),
                     [](const auto& b) { return b->GetSync() != 0; });
}

Dstring CSequence::GetBlockVXITrigger(unsigned long block) const {
  const CSequenceBlock* b = GetBlock(block);
  return b ? b->GetVXITrigger() : Dstring();
}

unsigned long CSequence::GetBlockNumBranches(unsigned long block) const {
  const CSequenceBlock* b = GetBlock(block);
  return b ? b->GetReactions().size() : 0;
}

namespace {

const CSequence::CSequenceBlock::Reaction* ReactionOf(const CSequence::CSequenceBlock* b, unsigned long n) {
  return b && n < b->GetReactions().size() ? &b->GetReactions()[n] : nullptr;
}

}  // namespace

Dstring CSequence::GetReactIf(unsigned long block, unsigned long n) const {
  const auto* r = ReactionOf(GetBlock(block), n);
  return r ? r->ifCondition : Dstring();
}

Dstring CSequence::GetReactGoto(unsigned long block, unsigned long n) const {
  const auto* r = ReactionOf(GetBlock(block), n);
  return r ? r->gotoTarget : Dstring();
}

unsigned long CSequence::GetReactTrig(unsigned long block, unsigned long n) const {
  const auto* r = ReactionOf(GetBlock(block), n);
  return r ? r->trigger : 0;
}

Dstring CSequence::GetReactVxi(unsigned long block, unsigned long n) const {
  const auto* r = ReactionOf(GetBlock(block), n);
  return r ? r->vxiTrigger : Dstring();
}

CSequence::CLoop* CSequence::LoopAt(unsigned long block, unsigned long level) const {
  const CSequenceBlock* b = GetBlock(block);
  return b ? b->GetLoop(level) : nullptr;
}

unsigned long CSequence::GetLoopStart(unsigned long block, unsigned long level) const {
  const CLoop* loop = LoopAt(block, level);
  return loop ? loop->GetStart() : 0;
}

unsigned long CSequence::GetLoopEnd(unsigned long block, unsigned long level) const {
  const CLoop* loop = LoopAt(block, level);
  return loop ? loop->GetEnd() : 0;
}

unsigned long CSequence::GetLoopLength(unsigned long block, unsigned long level) const {
  const CLoop* loop = LoopAt(block, level);
  return loop ? loop->GetLength() : 0;
}

unsigned long CSequence::GetNumIterations(unsigned long block, unsigned long level) const {
  const CLoop* loop = LoopAt(block, level);
  return loop ? loop->GetNumIterations() : 1;
}

unsigned long CSequence::GetLoopTrigger(unsigned long block, unsigned long level) const {
  const CLoop* loop = LoopAt(block, level);
  return loop ? loop->GetTrigger() : 0;
}

Dstring CSequence::GetLoopVXITrigger(unsigned long block, unsigned long level) const {
  const CLoop* loop = LoopAt(block, level);
  return loop ? loop->GetVXITrigger() : Dstring();
}

CSequence::LOOP_STATUS CSequence::GetLoopStatus(unsigned long block, unsigned long level) const {
  return CSequenceStructure::LoopStatus(mContent, block, level);
}

bool CSequence::IsBlockInLoop(unsigned long block, unsigned long level) const {
  if (block > GetNumBlocks()) return false;
  for (unsigned long h = 1; h <= level; ++h) {
    if (GetLoopStatus(block, h) != LOOP_NONE) return true;
  }
  return false;
}

unsigned long CSequence::GetHighestLoopLevel(unsigned long block, unsigned long level) const {
  for (unsigned long h = level; h >= 1; --h) {
    if (GetLoopStatus(block, h) != LOOP_NONE) return h;
  }
  return 0;
}

void CSequence::SetNumLoopLevels(unsigned long levels) {
  mNumLoopLevels = std::min(levels, kMaxLoopLevels);
  mIsNumLoopLevelsInitialized = true;
}

void CSequence::ClearClipboard() {
  mClipboard.reset();
}

// --- Editing ---------------------------------------------------------------------------------

int CSequence::OpenEdit(FWBlocker& guard, ConditionList& cond) const {
  if (int status = guard.Block()) return status;
  // The model is being replaced or compared: an edit from a view being told would work on
  // blocks that are about to go.
  if (mReading || mAnalysing) {
    ConditionListLoader::ConditionToken(cond, "GUI_OPERATION_BUSY", {Dstring("CSequence::AnalyzeChanges")},
                                        FWBlocker::kBusy);
    return FWBlocker::kBusy;
  }
  return 0;
}

// Guard, change in memory, write (which reads back). `change(write)` returns a status and may
// clear `write` when there turned out to be nothing to send.
template <typename Change>
int CSequence::Edit(const char* name, ConditionList& cond, Change change) {
  FWBlocker guard(name, cond);
  if (int status = OpenEdit(guard, cond)) return status;
  bool write = true;
  if (int status = change(write)) return status;
  return write ? WriteSequence(cond) : 0;
}

int CSequence::CheckBlock(unsigned long block, ConditionList& cond) const {
  if (block >= 1 && block <= GetNumBlocks()) return 0;
  return Refuse(cond, "GUI_SEQUENCE_NO_BLOCK", {Number(block), Number(GetNumBlocks())});
}

int CSequence::CheckPort(unsigned long port, ConditionList& cond) const {
  if (port >= 1 && port <= GetNumPorts()) return 0;
  return Refuse(cond, "GUI_SEQUENCE_NO_PORT", {Number(port), Number(GetNumPorts())});
}

int CSequence::CheckLevel(unsigned long level, ConditionList& cond) const {
  if (level >= 1 && level <= GetNumLoopLevels()) return 0;
  return Refuse(cond, "GUI_SEQUENCE_NO_LOOP_LEVEL", {Number(level), Number(GetNumLoopLevels())});
}

int CSequence::CheckLoop(unsigned long block, unsigned long level, ConditionList& cond) const {
  if (int status = CheckBlock(block, cond)) return status;
  if (LoopAt(block, level)) return 0;
  return Refuse(cond, "GUI_SEQUENCE_NO_LOOP", {Number(block), Number(level)});
}

int CSequence::CheckReact(unsigned long block, unsigned long n, ConditionList& cond) const {
  if (int status = CheckBlock(block, cond)) return status;
  const unsigned long count = GetBlockNumBranches(block);
  if (n < count) return 0;
  return Refuse(cond, "GUI_SEQUENCE_NO_REACTION", {Number(block), Number(n), Number(count)});
}

unsigned long CSequence::IterationsFor(unsigned long level, unsigned long requested) {
  // The top level always loops for ever; below it, "no count" means the smallest real loop.
  if (mNumLoopLevels != 0 && level >= mNumLoopLevels) return 0;
  return requested == 0 ? 2 : requested;
}

void CSequence::InsertBlock(unsigned long block, bool after, std::unique_ptr<CSequenceBlock> newBlock) {
  // An empty model takes its ports from the block given, else from the configuration known.
  const SequencePorts ports = Ports(SequencePorts::Ask::Known);
  if (mContent.blocks.empty() && mContent.numPorts == 0) {
    mContent.numPorts = newBlock ? newBlock->GetSegments().size() : ports.dataPortTypes.size();
  }
  if (!newBlock) {
    newBlock = std::make_unique<CSequenceBlock>();
    newBlock->SetLength(kDefaultBlockLength);
  }
  newBlock->FitPorts(mContent.numPorts, ports);
  CSequenceStructure::Insert(mContent, block, !after, std::move(newBlock));
}

std::unique_ptr<CSequence::CSequenceBlock> CSequence::ClipboardCopy() const {
  std::unique_ptr<CSequenceBlock> copy = mClipboard->CloneContent();
  // A label names one position: a pasted block keeps it only while no other block has it.
  const Dstring& label = copy->GetLabel();
  const bool taken = !label.empty() && std::any_of(mContent.blocks.begin(), mContent.blocks.end(),
                                                   [&](const auto& b) { return b->GetLabel() == label; });
  if (taken) copy->SetLabel("");
  return copy;
}

int CSequence::AddBlockBefore(unsigned long block, ConditionList& cond,
                              std::unique_ptr<CSequenceBlock> newBlock) {
  return Edit("CSequence::AddBlockBefore", cond, [&](bool&) {
    if (!(GetNumBlocks() == 0 && block == 1)) {
      if (int status = CheckBlock(block, cond)) return status;
    }
    InsertBlock(block, false, std::move(newBlock));
    return 0;
  });
}

int CSequence::AddBlockAfter(unsigned long block, ConditionList& cond,
                             std::unique_ptr<CSequenceBlock> newBlock) {
  return Edit("CSequence::AddBlockAfter", cond, [&](bool&) {
    if (block != 0) {
      if (int status = CheckBlock(block, cond)) return status;
    }
    InsertBlock(block, true, std::move(newBlock));
    return 0;
  });
}

int CSequence::DeleteBlock(unsigned long block, ConditionList& cond) {
  return Edit("CSequence::DeleteBlock", cond, [&](bool&) {
    if (int status = CheckBlock(block, cond)) return status;
    CSequenceStructure::Remove(mContent, block);
    // Never empty once edited; one write carries both changes.
    if (mContent.blocks.empty()) InsertBlock(0, true, nullptr);
    return 0;
  });
}

int CSequence::CutBlock(unsigned long block, ConditionList& cond) {
  return Edit("CSequence::CutBlock", cond, [&](bool&) {
    if (int status = CheckBlock(block, cond)) return status;
    mClipboard = CSequenceStructure::Remove(mContent, block);
    if (mContent.blocks.empty()) InsertBlock(0, true, nullptr);
    return 0;
  });
}

int CSequence::CopyBlock(unsigned long block, ConditionList& cond) {
  return Edit("CSequence::CopyBlock", cond, [&](bool& write) {
    write = false;
    if (int status = CheckBlock(block, cond)) return status;
    mClipboard = GetBlock(block)->CloneContent();
    return 0;
  });
}

int CSequence::PasteBlockBefore(unsigned long block, ConditionList& cond) {
  return Edit("CSequence::PasteBlockBefore", cond, [&](bool&) {
    if (!mClipboard) return Refuse(cond, "GUI_SEQUENCE_CLIPBOARD_EMPTY", {});
    if (!(GetNumBlocks() == 0 && block == 1)) {
      if (int status = CheckBlock(block, cond)) return status;
    }
    InsertBlock(block, false, ClipboardCopy());
    return 0;
  });
}

int CSequence::PasteBlockAfter(unsigned long block, ConditionList& cond) {
  return Edit("CSequence::PasteBlockAfter", cond, [&](bool&) {
    if (!mClipboard) return Refuse(cond, "GUI_SEQUENCE_CLIPBOARD_EMPTY", {});
    if (block != 0) {
      if (int status = CheckBlock(block, cond)) return status;
    }
    InsertBlock(block, true, ClipboardCopy());
    return 0;
  });
}

int CSequence::MoveBlock(unsigned long block, long distance, ConditionList& cond) {
  return Edit("CSequence::MoveBlock", cond, [&](bool& write) {
    if (int status = CheckBlock(block, cond)) return status;
    const long target = static_cast<long>(block) + distance;
    if (target < 1 || target > static_cast<long>(GetNumBlocks())) {
      return Refuse(cond, "GUI_SEQUENCE_BAD_MOVE",
                    {Number(block), Dstring::Format("%ld", distance), Number(GetNumBlocks())});
    }
    if (distance == 0) {
      write = false;
      return 0;
    }
    // Out as DeleteBlock takes it, in as AddBlockAfter (down) or AddBlockBefore (up) puts it.
    std::unique_ptr<CSequenceBlock> moved = CSequenceStructure::Remove(mContent, block);
    const unsigned long at = static_cast<unsigned long>(target);
    if (distance > 0) {
      CSequenceStructure::Insert(mContent, at - 1, false, std::move(moved));
    } else {
      CSequenceStructure::Insert(mContent, at, true, std::move(moved));
    }
    return 0;
  });
}

int CSequence::SetSegment(unsigned long block, unsigned long port, const Dstring& name, ConditionList& cond,
                          SeqSegType type) {
  return Edit("CSequence::SetSegment", cond, [&](bool&) {
    if (int status = CheckBlock(block, cond)) return status;
    if (int status = CheckPort(port, cond)) return status;
    if (type < SEG_NAMED || type > SEG_DONTCARE || (type == SEG_NAMED && name.empty())) {
      return Refuse(cond, "GUI_SEQUENCE_BAD_SEGMENT", {name, Dstring::Format("%d", static_cast<int>(type))});
    }
    if (type == SEG_NAMED) {
      if (int status = CommandText::CheckArgument(name, cond)) return status;
    }
    MutableBlock(block)->Segments()[port - 1] = CSequenceBlock::ItemOf(type, name);
    return 0;
  });
}

int CSequence::SetDefaultSegment(unsigned long block, unsigned long port, ConditionList& cond) {
  return Edit("CSequence::SetDefaultSegment", cond, [&](bool&) {
    if (int status = CheckBlock(block, cond)) return status;
    if (int status = CheckPort(port, cond)) return status;
    return MutableBlock(block)->SetDefaultSegment(port, mPortSource, cond);
  });
}

int CSequence::SetBlockLength(unsigned long block, unsigned long length, ConditionList& cond) {
  return Edit("CSequence::SetBlockLength", cond, [&](bool&) {
    if (int status = CheckBlock(block, cond)) return status;
    MutableBlock(block)->SetLength(length);
    return 0;
  });
}

int CSequence::SetLabel(unsigned long block, const Dstring& label, ConditionList& cond) {
  return Edit("CSequence::SetLabel", cond, [&](bool&) {
    if (int status = CheckBlock(block, cond)) return status;
    if (int status = CommandText::CheckArgument(label, cond)) return status;
    MutableBlock(block)->SetLabel(label);
    return 0;
  });
}

int CSequence::SetBlockTrigger(unsigned long block, unsigned long trigger, ConditionList& cond) {
  return Edit("CSequence::SetBlockTrigger", cond, [&](bool&) {
    if (int status = CheckBlock(block, cond)) return status;
    MutableBlock(block)->SetTrigger(trigger);
    return 0;
  });
}

int CSequence::SetBlockMeasurementStart(unsigned long block, unsigned long start, ConditionList& cond) {
  return Edit("CSequence::SetBlockMeasurementStart", cond, [&](bool&) {
    if (int status = CheckBlock(block, cond)) return status;
    MutableBlock(block)->SetMeasurementStart(start);
    return 0;
  });
}

int CSequence::SetBlockSync(unsigned long block, unsigned sync, ConditionList& cond) {
  return Edit("CSequence::SetBlockSync", cond, [&](bool&) {
    if (int status = CheckBlock(block, cond)) return status;
    MutableBlock(block)->SetSync(sync ? 1 : 0);
    return 0;
  });
}

int CSequence::SetBlockVXITrigger(unsigned long block, const Dstring& vxi, ConditionList& cond) {
  return Edit("CSequence::SetBlockVXITrigger", cond, [&](bool&) {
    if (int status = CheckBlock(block, cond)) return status;
    if (int status = CommandText::CheckArgument(vxi, cond)) return status;
    MutableBlock(block)->SetVXITrigger(vxi);
    return 0;
  });
}

int CSequence::SetLoop(unsigned long block, unsigned long level, ConditionList& cond, unsigned long length,
                       unsigned long iterations, unsigned long trigger, const Dstring& vxi) {
  return Edit("CSequence::SetLoop", cond, [&](bool& write) {
    if (int status = CheckBlock(block, cond)) return status;
    if (int status = CheckLevel(level, cond)) return status;
    if (length == 0 || length > GetNumBlocks() - block + 1) {
      return Refuse(cond, "GUI_SEQUENCE_BAD_LOOP_RANGE",
                    {Number(block), Number(length), Number(GetNumBlocks())});
    }
    if (int status = CommandText::CheckArgument(vxi, cond)) return status;
    // A range that already holds a loop on this level is left alone, deliberately silently.
    for (unsigned long b = block; b < block + length; ++b) {
      if (LoopAt(b, level)) {
        write = false;
        return 0;
      }
    }
    CLoop* loop = CSequenceStructure::AddLoop(mContent, this, block, length, level);
    loop->SetNumIterations(IterationsFor(level, iterations));
    loop->SetTrigger(trigger);
    loop->SetVXITrigger(vxi);
    return 0;
  });
}

int CSequence::DeleteLoop(unsigned long block, unsigned long level, ConditionList& cond) {
  return Edit("CSequence::DeleteLoop", cond, [&](bool&) {
    if (int status = CheckLoop(block, level, cond)) return status;
    CSequenceStructure::RemoveLoop(mContent, LoopAt(block, level));
    return 0;
  });
}

int CSequence::SetNumIterations(unsigned long block, unsigned long level, unsigned long iterations,
                                ConditionList& cond) {
  return Edit("CSequence::SetNumIterations", cond, [&](bool&) {
    if (int status = CheckLoop(block, level, cond)) return status;
    LoopAt(block, level)->SetNumIterations(IterationsFor(level, iterations));
    return 0;
  });
}

int CSequence::SetLoopTrigger(unsigned long block, unsigned long level, unsigned long trigger,
                              ConditionList& cond) {
  return Edit("CSequence::SetLoopTrigger", cond, [&](bool&) {
    if (int status = CheckLoop(block, level, cond)) return status;
    LoopAt(block, level)->SetTrigger(trigger);
    return 0;
  });
}

int CSequence::SetLoopVXITrigger(unsigned long block, unsigned long level, const Dstring& vxi,
                                 ConditionList& cond) {
  return Edit("CSequence::SetLoopVXITrigger", cond, [&](bool&) {
    if (int status = CheckLoop(block, level, cond)) return status;
    if (int status = CommandText::CheckArgument(vxi, cond)) return status;
    LoopAt(block, level)->SetVXITrigger(vxi);
    return 0;
  });
}

int CSequence::NewReact(unsigned long block, ConditionList& cond) {
  return Edit("CSequence::NewReact", cond, [&](bool&) {
    if (int status = CheckBlock(block, cond)) return status;
    MutableBlock(block)->Reactions().emplace_back();
    return 0;
  });
}

int CSequence::DeleteReact(unsigned long block, unsigned long n, ConditionList& cond) {
  return Edit("CSequence::DeleteReact", cond, [&](bool&) {
    if (int status = CheckReact(block, n, cond)) return status;
    auto& reactions = MutableBlock(block)->Reactions();
    reactions.erase(reactions.begin() + static_cast<std::ptrdiff_t>(n));
    return 0;
  });
}

namespace {

template <typename Set>
int SetReactText(CSequence::CSequenceBlock* block, unsigned long n, const Dstring& value, ConditionList& cond,
                 Set set) {
  if (int status = CommandText::CheckArgument(value, cond)) return status;
  set(block->Reactions()[n]);
  return 0;
}

}  // namespace

int CSequence::SetReactIf(unsigned long block, unsigned long n, const Dstring& value, ConditionList& cond) {
  return Edit("CSequence::SetReactIf", cond, [&](bool&) {
    if (int status = CheckReact(block, n, cond)) return status;
    return SetReactText(MutableBlock(block), n, value, cond, [&](auto& r) { r.ifCondition = value; });
  });
}

int CSequence::SetReactGoto(unsigned long block, unsigned long n, const Dstring& value, ConditionList& cond) {
  return Edit("CSequence::SetReactGoto", cond, [&](bool&) {
    if (int status = CheckReact(block, n, cond)) return status;
    return SetReactText(MutableBlock(block), n, value, cond, [&](auto& r) { r.gotoTarget = value; });
  });
}

int CSequence::SetReactTrig(unsigned long block, unsigned long n, unsigned long value, ConditionList& cond) {
  return Edit("CSequence::SetReactTrig", cond, [&](bool&) {
    if (int status = CheckReact(block, n, cond)) return status;
    MutableBlock(block)->Reactions()[n].trigger = value;
    return 0;
  });
}

int CSequence::SetReactVxi(unsigned long block, unsigned long n, const Dstring& value, ConditionList& cond) {
  return Edit("CSequence::SetReactVxi", cond, [&](bool&) {
    if (int status = CheckReact(block, n, cond)) return status;
    return SetReactText(MutableBlock(block), n, value, cond, [&](auto& r) { r.vxiTrigger = value; });
  });
}

int CSequence::ClearBranchTable(unsigned long block, ConditionList& cond) {
  return Edit("CSequence::ClearBranchTable", cond, [&](bool& write) {
    if (int status = CheckBlock(block, cond)) return status;
    write = !MutableBlock(block)->GetReactions().empty();
    MutableBlock(block)->Reactions().clear();
    return 0;
  });
}

int CSequence::SetEvent(std::size_t index, const CSequenceEvents::Event& event, ConditionList& cond) {
  const CSequenceEvents before = mEvents;
  const int status = Edit("CSequence::SetEvent", cond, [&](bool&) {
    if (!HasCentral()) return Refuse(cond, "GUI_SEQUENCE_NO_EVENTS", {});
    if (index >= CSequenceEvents::kNumEvents) {
      return Refuse(cond, "GUI_SEQUENCE_NO_EVENT", {Number(index + 1), Number(CSequenceEvents::kNumEvents)});
    }
    if (int rc = CommandText::CheckArgument(event.name, cond)) return rc;
    // Item texts travel in single quotes (a quote doubled), the last one bare.
    for (const CSequenceEvents::Item& item : event.items) {
      for (const Dstring* text : {&item.first, &item.second, &item.third}) {
        if (int rc = CommandText::CheckArgument(*text, cond)) return rc;
      }
      const bool word = !item.bare.empty() && std::all_of(item.bare.begin(), item.bare.end(), [](char c) {
        return std::isalnum(static_cast<unsigned char>(c)) || c == '_' || c == '.' || c == '-' || c == '+';
      });
      if (!word) return Refuse(cond, "GUI_SEQUENCE_BAD_EVENT_TEXT", {item.bare});
    }
    mEvents.SetEvent(index, event);
    return 0;
  });
  if (status != 0) mEvents = before;
  return status;
}

int CSequence::ClearExistingStartLabel(ConditionList& cond) {
  return Edit("CSequence::ClearExistingStartLabel", cond, [&](bool& write) {
    write = GetNumBlocks() > 0 && !GetLabel(1).empty();
    if (write) MutableBlock(1)->SetLabel("");
    return 0;
  });
}

// A segment the instrument does not have would start a run that plays nothing there: the run
// is refused before anything is written, naming every such segment and its blocks.
int CSequence::SyncSegments(ConditionList& cond) {
  FWBlocker guard("CSequence::SyncSegments", cond);
  if (int status = guard.Block()) return status;
  if (mSegmentSync == nullptr) return 0;
  std::vector<Dstring> missing;
  if (int status = mSegmentSync->FindMissing(SequenceSegmentUse::NamedSegments(*this), missing, cond))
    return status;
  if (!missing.empty()) {
    return Refuse(cond,
                  missing.size() == 1 ? "GUI_SEQUENCE_MISSING_SEGMENT" : "GUI_SEQUENCE_MISSING_SEGMENTS",
                  {SequenceSegmentUse::SegmentsText(*this, missing)});
  }
  std::set<Dstring> done;
  for (const auto& block : mContent.blocks) {
    if (int status = block->SyncSegments(*mSegmentSync, done, cond)) return status;
  }
  return 0;
}

// --- Server exchange -------------------------------------------------------------------------

int CSequence::InitNumLoopLevels(ConditionList& cond) {
  Dstring reply;
  int status = QenGuiInst::Call(Command(":%s:SGEN:GLOB:SEQ:LLEV?"), reply, cond);
  unsigned long levels = 0;
  if (status == 0 && (!reply.ToULong(levels) || levels > kMaxLoopLevels)) {
    status = Refuse(cond, "GUI_SEQUENCE_BAD_LOOP_LEVELS", {Shown(reply), Number(kMaxLoopLevels)});
  }
  if (status == 0) mNumLoopLevels = levels;
  mIsNumLoopLevelsInitialized = true;
  return status;
}

void CSequence::EndNumLoopLevels() {
  mNumLoopLevels = 0;
  mIsNumLoopLevelsInitialized = false;
}

int CSequence::ReadEvents(ConditionList& cond) {
  if (!HasCentral()) {
    mEvents.Reset();
    return 0;
  }
  Dstring reply;
  if (int status = QenGuiInst::Call(Command(":%s:SGEN:GLOB:SEQ:EVEN?"), reply, cond)) return status;
  return mEvents.FromExpression(reply.Trimmed(), cond);
}

int CSequence::WriteEvents(ConditionList& cond) {
  if (!HasCentral()) return 0;
  Dstring reply;
  return QenGuiInst::Call(Command(":%s:SGEN:GLOB:SEQ:EVEN ") + mEvents.BuildExpression(), reply, cond);
}

int CSequence::ReadSequence(ConditionList& cond, unsigned force) { return Read(cond, force, nullptr); }

int CSequence::Read(ConditionList& cond, unsigned force, const Dstring* written) {
  LgsDebug trace("CSequence::ReadSequence", "sequence");
  FWBlocker guard("CSequence::ReadSequence", cond);
  if (int status = guard.Block()) return status;
  const CSequenceEvents eventsBefore = mEvents;
  if (int status = ReadEvents(cond)) return status;
  const bool eventsChanged = !(mEvents == eventsBefore);
  Dstring reply;
  if (int status = QenGuiInst::Call(Command(":%s:SGEN:GLOB:SEQ?"), reply, cond)) return status;
  reply.Trim();
  const bool same = reply == mLastExpression;
  if (same && !force) return eventsChanged ? ReportEvents(cond) : 0;
  if (written != nullptr && !same && reply == *written) {
    const int status = TakeWritten(reply, cond);
    return status == 0 && eventsChanged ? ReportEvents(cond) : status;
  }

  // The old content is what the views show: the last expression read, not local edits.
  if (!mLastExpression.empty()) {
    ConditionList ignored;
    fromExpression(mLastExpression, ignored);
  }
  Content old = std::move(mContent);
  mContent = Content();
  if (int status = fromExpression(reply, cond)) {
    mContent = std::move(old);
    return status;
  }
  int status = 0;
  if (same) {
    mAnalysing = 1;
    status = CSequenceAnalyzer(mObservers, cond).Refresh();
    mAnalysing = 0;
  } else {
    status = AnalyzeChanges(old, cond);
  }
  if (status != 0) {
    mContent = std::move(old);
    return status;
  }
  trace.Printf(" read %zu blocks\n", mContent.blocks.size());
  mLastExpression = reply;
  return eventsChanged ? ReportEvents(cond) : 0;
}

int CSequence::ReportEvents(ConditionList& cond) {
  // An observer may leave while another is told.
  const std::vector<CSequenceObserver*> observers = mObservers;
  for (CSequenceObserver* observer : observers) {
    if (std::find(mObservers.begin(), mObservers.end(), observer) == mObservers.end()) continue;
    if (int status = observer->NfyEventsChanged(cond)) return status;
  }
  return 0;
}

// The server holds the text just written from the model: the model is what it holds, and only
// what the views show, the last expression read, is rebuilt to tell them what changed. An
// edit thus costs one parse, not two.
int CSequence::TakeWritten(const Dstring& reply, ConditionList& cond) {
  Content edited = std::move(mContent);
  mContent = Content();
  ConditionList ignored;
  if (mLastExpression.empty() || fromExpression(mLastExpression, ignored) != 0) {
    mContent = std::move(edited);
    return Read(cond, 0, nullptr);
  }
  Content old = std::move(mContent);
  mContent = std::move(edited);
  // What the text does not carry: a synchronisation block is written without its reactions.
  for (const auto& block : mContent.blocks) {
    if (block->GetSync() != 0) block->Reactions().clear();
  }
  if (int status = AnalyzeChanges(old, cond)) {
    mContent = std::move(old);
    return status;
  }
  mLastExpression = reply;
  return 0;
}

void CSequence::RestoreLastExpression() {
  if (mLastExpression.empty()) return;
  ConditionList ignored;
  fromExpression(mLastExpression, ignored);
}

int CSequence::WriteSequence(ConditionList& cond) {
  if (mReading) return 0;
  FWBlocker guard("CSequence::WriteSequence", cond);
  if (int status = OpenEdit(guard, cond)) return status;
  Dstring expression;
  int status = asExpression(expression, cond);
  if (status == 0) status = CommandText::CheckValue(expression, cond);
  if (status == 0) {
    Dstring reply;
    status = QenGuiInst::Call(Command(":%s:SGEN:GLOB:SEQ ") + expression, reply, cond);
  }
  if (status == 0) status = WriteEvents(cond);
  const Dstring previous = mLastExpression;
  if (status == 0) status = Read(cond, 0, &expression);
  if (status == 0) {
    // The server kept its text (it took nothing, or normalised the edit away): the model
    // follows the server, not the edit.
    if (mLastExpression == previous) RestoreLastExpression();
    return 0;
  }

  // The edit did not reach the server: undo it before any view has seen it, and, unless the
  // instrument is held by another client, take what the server has.
  RestoreLastExpression();
  if (status != QenStatus::kLocked) {
    mLastExpression.clear();
    ConditionList again;
    if (ReadSequence(again, 0) != 0) cond.Append(again);
  }
  return status;
}

int CSequence::asExpression(Dstring& out, ConditionList& cond) const {
  return CSequenceWriter::Write(mContent, CSequenceStructure::Levels(mContent), out, cond);
}

int CSequence::fromExpression(const Dstring& text, ConditionList& cond) {
  if (mAnalysing) {
    ConditionListLoader::ConditionToken(cond, "GUI_OPERATION_BUSY", {Dstring("CSequence::AnalyzeChanges")},
                                        FWBlocker::kBusy);
    return FWBlocker::kBusy;
  }
  mReading = 1;
  mContent.Clear();
  const int status = Parse(text, cond);
  if (status != 0) mContent.Clear();
  mReading = 0;
  return status;
}

int CSequence::Parse(const Dstring& text, ConditionList& cond) {
  ConditionList parse;
  LispList top;
  double version = 0.0;
  CSequenceReader::Stream stream(this, mContent);
  if (ParserExpression::Parse(text, top, parse, stream) != 0 || top.Size() < 3 || !top[0].IsItem() ||
      !top[0].GetItem().GetDouble(version) || std::isnan(version)) {
    return Refuse(cond, "GUI_SEQUENCE_SYNTAX", {Shown(text)});
  }
  if (version > 3.0) return Refuse(cond, "GUI_SEQUENCE_WRONG_VERSION", {Dstring(top[0].GetItem().GetText())});
  const LispList& body = top[2];
  const bool empty =
      body.IsItem() && body.GetItem().GetType() == DataItemType::Word && body.GetItem().GetText().empty();
  Dstring label;
  if (!CSequenceReader::Label(top[1], label) || (!empty && !body.IsList())) {
    return Refuse(cond, "GUI_SEQUENCE_SYNTAX", {Shown(text)});
  }
  if (!empty) {
    const bool read = stream.Streamed()
                          ? stream.Ok()
                          : CSequenceReader::Read(body, CSequenceReader::GenerationOf(version), this, mContent);
    if (!read) return Refuse(cond, "GUI_SEQUENCE_SYNTAX", {Shown(text)});
  }
  if (!label.empty() && !mContent.blocks.empty()) mContent.blocks.front()->SetLabel(label);
  // Never empty once read; the block added here is the same as AddBlockAfter(0) adds.
  if (mContent.blocks.empty()) InsertBlock(0, true, nullptr);
  return 0;
}

int CSequence::AnalyzeChanges(const Content& old, ConditionList& cond) {
  FWBlocker guard("CSequence::AnalyzeChanges", cond);
  if (int status = guard.Block()) return status;
  mAnalysing = 1;
  const int status = CSequenceAnalyzer(mObservers, cond).Analyze(old, mContent);
  mAnalysing = 0;
  return status;
}

bool CSequence::NfyMatchDirtyFlag(const Dstring& cmd) const {
  const Dstring handle = QenGuiInst::GetAppHandle();
  return cmd == "ALL" || cmd == Dstring::Format(":%s:SGEN:GLOB:SEQ:EVEN", handle.c_str()) ||
         cmd == Dstring::Format(":%s:SGEN:GLOB:SEQ", handle.c_str());
}

int CSequence::NfyViewDataUpdatedDirtyFlag(ConditionList& cond) {
  return ReadSequence(cond, 0);
}

int CSequence::NfyPortInfo(ConditionList& cond) {
  return ReadSequence(cond, 1);
}

int CSequence::DirtyFlagProc(QenDs*, void* client, ConditionList& cond) {
  return static_cast<CSequence*>(client)->NfyViewDataUpdatedDirtyFlag(cond);
}

int CSequence::DirtyFlagMatch(QenDs*, void* client, const Dstring& name) {
  return static_cast<CSequence*>(client)->NfyMatchDirtyFlag(name) ? 1 : 0;
}
