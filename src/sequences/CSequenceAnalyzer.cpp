#include "sequences/CSequenceAnalyzer.h"

#include <algorithm>
#include <cstdint>
#include <utility>

#include "sequences/CLoop.h"
#include "sequences/CSequenceBlock.h"
#include "sequences/CSequenceObserver.h"
#include "sequences/CSequenceStructure.h"

namespace {

using Block = SequenceTypes::CSequenceBlock;
using Loop = SequenceTypes::CLoop;
constexpr unsigned long kGone = static_cast<unsigned long>(-1);

}  // namespace

template <typename Tell>
int CSequenceAnalyzer::TellAll(Tell tell) {
  const std::vector<CSequenceObserver*> copy = mObservers;
  for (CSequenceObserver* observer : copy) {
    if (std::find(mObservers.begin(), mObservers.end(), observer) == mObservers.end()) continue;
    if (int status = tell(*observer)) return status;
  }
  return 0;
}

int CSequenceAnalyzer::Refresh() {
  return TellAll([&](CSequenceObserver& o) { return o.NfySequence(mCond); });
}

int CSequenceAnalyzer::Analyze(const SequenceTypes::Content& old, const SequenceTypes::Content& now) {
  if (old.blocks.empty() || old.numPorts != now.numPorts) return Refresh();
  std::vector<Op> ops;
  if (!Script(old, now, ops)) return Refresh();
  if (int status = ReportBlocks(old, now, ops)) return status;
  return ReportLoops(old, now, ops);
}

bool CSequenceAnalyzer::Script(const SequenceTypes::Content& old, const SequenceTypes::Content& now,
                               std::vector<Op>& ops) const {
  const auto same = [&](std::size_t i, std::size_t j) { return old.blocks[i]->SameContent(*now.blocks[j]); };
  const std::size_t m = old.blocks.size(), n = now.blocks.size();
  std::size_t head = 0;
  while (head < m && head < n && same(head, head)) ++head;
  std::size_t tail = 0;
  while (tail < m - head && tail < n - head && same(m - 1 - tail, n - 1 - tail)) ++tail;
  const std::size_t mm = m - head - tail, nn = n - head - tail;
  if ((mm + 1) * (nn + 1) > kMaxCells) return false;

  // lcs[i][j]: the longest common run of old[head + i ..] and new[head + j ..] in the middle.
  std::vector<std::uint32_t> lcs((mm + 1) * (nn + 1), 0);
  const auto at = [&](std::size_t i, std::size_t j) -> std::uint32_t& { return lcs[i * (nn + 1) + j]; };
  for (std::size_t i = mm; i-- > 0;) {
    for (std::size_t j = nn; j-- > 0;) {
      at(i, j) = same(head + i, head + j) ? at(i + 1, j + 1) + 1 : std::max(at(i + 1, j), at(i, j + 1));
    }
  }

  std::vector<unsigned long> gone, added;
  const auto flush = [&]() {
    const std::size_t paired = std::min(gone.size(), added.size());
    for (std::size_t k = 0; k < paired; ++k) ops.push_back({Op::Changed, gone[k], added[k]});
    for (std::size_t k = paired; k < gone.size(); ++k) ops.push_back({Op::Deleted, gone[k], kGone});
    for (std::size_t k = paired; k < added.size(); ++k) ops.push_back({Op::Inserted, kGone, added[k]});
    gone.clear();
    added.clear();
  };
  for (std::size_t k = 0; k < head; ++k) ops.push_back({Op::Same, k, k});
  std::size_t i = 0, j = 0;
  while (i < mm || j < nn) {
    if (i < mm && j < nn && same(head + i, head + j)) {
      flush();
      ops.push_back({Op::Same, head + i++, head + j++});
    } else if (j == nn || (i < mm && at(i + 1, j) >= at(i, j + 1))) {
      gone.push_back(head + i++);
    } else {
      added.push_back(head + j++);
    }
  }
  flush();
  for (std::size_t k = 0; k < tail; ++k) ops.push_back({Op::Same, m - tail + k, n - tail + k});
  return true;
}

int CSequenceAnalyzer::ReportBlocks(const SequenceTypes::Content& old, const SequenceTypes::Content& now,
                                    const std::vector<Op>& ops) {
  unsigned long position = 0;  // blocks of the view before the one the next report is about
  for (const Op& op : ops) {
    int status = 0;
    switch (op.kind) {
      case Op::Same:
        ++position;
        break;
      case Op::Changed:
        ++position;
        status =
            ReportBlockChange(*old.blocks[op.oldIndex], *now.blocks[op.newIndex], position, now.numPorts);
        break;
      case Op::Deleted:
        status = TellAll([&](CSequenceObserver& o) { return o.NfyBlockDeleted(position + 1, mCond); });
        break;
      case Op::Inserted:
        ++position;
        status = TellAll([&](CSequenceObserver& o) { return o.NfyBlockInserted(position, mCond); });
        break;
    }
    if (status) return status;
  }
  return 0;
}

int CSequenceAnalyzer::ReportBlockChange(const Block& was, const Block& is, unsigned long block,
                                         unsigned long numPorts) {
  using Report = int (CSequenceObserver::*)(unsigned long, ConditionList&);
  const std::pair<bool, Report> changes[] = {
      {was.GetLabel() != is.GetLabel(), &CSequenceObserver::NfyBlockLabelChanged},
      {was.GetLength() != is.GetLength(), &CSequenceObserver::NfyBlockLengthChanged},
      {was.GetMeasurementStart() != is.GetMeasurementStart(), &CSequenceObserver::NfyBlockMeasureChanged},
      {was.GetSync() != is.GetSync(), &CSequenceObserver::NfyBlockSyncChanged},
      {was.GetTrigger() != is.GetTrigger(), &CSequenceObserver::NfyBlockTriggerChanged},
      {was.GetVXITrigger() != is.GetVXITrigger(), &CSequenceObserver::NfyBlockVXITriggerChanged},
      {was.GetReactions() != is.GetReactions(), &CSequenceObserver::NfyBlockReactionsChanged},
  };
  for (const auto& change : changes) {
    if (!change.first) continue;
    const Report report = change.second;
    if (int status = TellAll([&](CSequenceObserver& o) { return (o.*report)(block, mCond); })) return status;
  }
  for (unsigned long p = 0; p < numPorts; ++p) {
    if (was.GetSegments()[p] == is.GetSegments()[p]) continue;
    if (int status = TellAll([&](CSequenceObserver& o) { return o.NfySegmentChanged(block, p + 1, mCond); }))
      return status;
  }
  return 0;
}

int CSequenceAnalyzer::ReportLoops(const SequenceTypes::Content& old, const SequenceTypes::Content& now,
                                   const std::vector<Op>& ops) {
  // Where each old block went (1-based, 0 when it is gone).
  std::vector<unsigned long> newOf(old.blocks.size() + 1, 0);
  for (const Op& op : ops) {
    if (op.kind == Op::Same || op.kind == Op::Changed) newOf[op.oldIndex + 1] = op.newIndex + 1;
  }
  // A new loop is the one its first block points at on its level, so the new loop an old one
  // may have become is found through the block its first block became, with no search; each
  // is marked, by its first block and level, once an old loop is found in it.
  const unsigned long levels = CSequenceStructure::MaxLoopLevel(now);
  std::vector<char> kept(now.blocks.size() * levels, 0);
  const auto keptOf = [&](const Loop& loop) -> char& {
    return kept[(loop.GetStart() - 1) * levels + loop.GetLevel() - 1];
  };

  std::vector<std::pair<const Loop*, const Loop*>> stayed;
  std::vector<const Loop*> deleted;
  for (const auto& loop : old.loops) {
    const unsigned long start = newOf[loop->GetStart()], end = newOf[loop->GetEnd()];
    const Loop* found = start != 0 ? now.blocks[start - 1]->GetLoop(loop->GetLevel()) : nullptr;
    if (end && end - start + 1 == loop->GetLength() && found && found->GetStart() == start &&
        found->GetLength() == loop->GetLength() && found->GetLevel() == loop->GetLevel() && !keptOf(*found)) {
      keptOf(*found) = 1;
      stayed.emplace_back(loop.get(), found);
    } else {
      deleted.push_back(loop.get());
    }
  }
  using LoopReport = int (CSequenceObserver::*)(long, long, long, long, ConditionList&);
  const auto report = [&](LoopReport what, const Loop* loop) {
    const long level = static_cast<long>(loop->GetLevel()), start = static_cast<long>(loop->GetStart());
    const long length = static_cast<long>(loop->GetLength()),
               iterations = static_cast<long>(loop->GetNumIterations());
    return TellAll([&](CSequenceObserver& o) { return (o.*what)(level, start, length, iterations, mCond); });
  };
  for (const Loop* loop : deleted) {
    if (int status = report(&CSequenceObserver::NfyLoopDeleted, loop)) return status;
  }
  for (const auto& loop : now.loops) {
    if (keptOf(*loop)) continue;
    if (int status = report(&CSequenceObserver::NfyLoopInserted, loop.get())) return status;
  }
  for (const auto& [was, is] : stayed) {
    const std::pair<bool, LoopReport> changes[] = {
        {was->GetNumIterations() != is->GetNumIterations(), &CSequenceObserver::NfyLoopIterationsChanged},
        {was->GetTrigger() != is->GetTrigger(), &CSequenceObserver::NfyLoopTriggerChanged},
        {was->GetVXITrigger() != is->GetVXITrigger(), &CSequenceObserver::NfyLoopVXITriggerChanged},
    };
    for (const auto& change : changes) {
      if (!change.first) continue;
      if (int status = report(change.second, is)) return status;
    }
  }
  if (deleted.empty() && stayed.size() == now.loops.size()) return 0;
  return TellAll([&](CSequenceObserver& o) { return o.NfyUpdateLoops(mCond); });
}
