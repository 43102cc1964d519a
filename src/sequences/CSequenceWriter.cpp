#include "sequences/CSequenceWriter.h"

#include "sequences/CLoop.h"
#include "sequences/CSequenceBlock.h"
#include "support/ConditionListLoader.h"

namespace {

using Block = SequenceTypes::CSequenceBlock;
using Loop = SequenceTypes::CLoop;

class Writer {
 public:
  Writer(const SequenceTypes::Content& content, Dstring& out, ConditionList& cond)
      : mContent(content), mOut(out), mCond(cond) {}

  bool Element(unsigned long first, unsigned long last, unsigned long level);

 private:
  const Block& At(unsigned long block) const { return *mContent.blocks[block - 1]; }
  // The loop of the highest level 1 .. level that holds the block; null when none does.
  const Loop* Highest(unsigned long block, unsigned long level) const;
  bool Sequential(unsigned long first, unsigned long last, unsigned long level);
  // Checks that K lies within first .. last and that no block of it is in a loop of a level
  // above K's within 1 .. level, then writes it.
  bool LoopItem(const Loop& loop, unsigned long first, unsigned long last, unsigned long level);
  bool LoopElement(const Loop& loop);
  void BlockElement(const Block& block);
  bool Fail(unsigned long block, unsigned long level);

  const SequenceTypes::Content& mContent;
  Dstring& mOut;
  ConditionList& mCond;
};

const Loop* Writer::Highest(unsigned long block, unsigned long level) const {
  for (unsigned long h = level; h >= 1; --h) {
    if (const Loop* loop = At(block).GetLoop(h)) return loop;
  }
  return nullptr;
}

bool Writer::Element(unsigned long first, unsigned long last, unsigned long level) {
  if (const Loop* loop = Highest(first, level)) {
    if (loop->GetEnd() >= last) return LoopItem(*loop, first, last, level);
    return Sequential(first, last, level);
  }
  if (first == last) {
    BlockElement(At(first));
    return true;
  }
  return Sequential(first, last, level);
}

bool Writer::Sequential(unsigned long first, unsigned long last, unsigned long level) {
  mOut += "(SEQ";
  for (unsigned long b = first; b <= last;) {
    mOut += ',';
    if (b != first) {
      CSequenceWriter::AppendQuoted(mOut, At(b).GetLabel());
      mOut += ',';
    }
    const Loop* loop = Highest(b, level);
    if (loop == nullptr) {
      BlockElement(At(b));
      ++b;
      continue;
    }
    // A loop that began before this item overlaps the one the walk has just left.
    if (loop->GetStart() != b) return Fail(b, loop->GetLevel());
    if (!LoopItem(*loop, first, last, level)) return false;
    b = loop->GetEnd() + 1;
  }
  mOut += ')';
  return true;
}

bool Writer::LoopItem(const Loop& loop, unsigned long first, unsigned long last, unsigned long level) {
  const unsigned long h = loop.GetLevel();
  if (loop.GetLength() == 0 || loop.GetStart() < first || loop.GetEnd() > last)
    return Fail(loop.GetStart(), h);
  for (unsigned long b = loop.GetStart() + 1; b <= loop.GetEnd(); ++b) {
    const Loop* highest = Highest(b, level);
    if (highest == nullptr || highest->GetLevel() != h) return Fail(b, h);
  }
  return LoopElement(loop);
}

bool Writer::LoopElement(const Loop& loop) {
  if (loop.GetNumIterations() == 0) {
    mOut.AppendPrintf("(LOOP%lu,%lu,INF,", loop.GetLevel(), loop.GetTrigger());
  } else {
    mOut.AppendPrintf("(LOOP%lu,%lu,%lu,", loop.GetLevel(), loop.GetTrigger(), loop.GetNumIterations());
  }
  CSequenceWriter::AppendQuoted(mOut, loop.GetVXITrigger());
  mOut += ',';
  if (!Element(loop.GetStart(), loop.GetEnd(), loop.GetLevel() - 1)) return false;
  mOut += ')';
  return true;
}

void Writer::BlockElement(const Block& block) {
  mOut.AppendPrintf("(BLOCK,%lu,%lu,%lu,", block.GetTrigger(), block.GetLength(),
                    block.GetMeasurementStart());
  CSequenceWriter::AppendQuoted(mOut, block.GetVXITrigger());
  if (block.GetSync()) {
    mOut += ",SYNC";
  } else {
    mOut += ",(";
    bool firstReaction = true;
    for (const Block::Reaction& r : block.GetReactions()) {
      if (!firstReaction) mOut += ',';
      firstReaction = false;
      mOut += '(';
      CSequenceWriter::AppendQuoted(mOut, r.ifCondition);
      mOut += ',';
      CSequenceWriter::AppendQuoted(mOut, r.gotoTarget);
      mOut.AppendPrintf(",%lu,", r.trigger);
      CSequenceWriter::AppendQuoted(mOut, r.vxiTrigger);
      mOut += ')';
    }
    mOut += ')';
  }
  for (unsigned long p = 0; p < mContent.numPorts; ++p) {
    mOut += ',';
    const DataItem& item = block.GetSegments()[p];
    if (item.GetType() == DataItemType::String) {
      CSequenceWriter::AppendQuoted(mOut, item.GetText());
    } else {
      mOut += item.GetText();
    }
    mOut += ",0,0";
  }
  mOut += ')';
}

bool Writer::Fail(unsigned long block, unsigned long level) {
  ConditionListLoader::ConditionToken(mCond, "GUI_SEQUENCE_IMPOSSIBLE_NESTING_LOOPS",
                                      {Dstring::Format("%lu", block), Dstring::Format("%lu", level)},
                                      SequenceTypes::kStatusError);
  return false;
}

}  // namespace

int CSequenceWriter::Write(const SequenceTypes::Content& content, unsigned long levels, Dstring& out,
                           ConditionList& cond) {
  out.clear();
  if (content.blocks.empty()) {
    out = "(3.0,,)";
    return 0;
  }
  // Every block carries exactly numPorts items; the model keeps it so, this makes sure.
  for (const auto& block : content.blocks) {
    if (block->GetSegments().size() != content.numPorts) {
      ConditionListLoader::ConditionToken(cond, "GUI_SEQUENCE_SYNTAX", {Dstring("(ports)")},
                                          SequenceTypes::kStatusError);
      return SequenceTypes::kStatusError;
    }
  }
  out.reserve(64 + content.blocks.size() * (40 + 12 * content.numPorts));
  out += "(3.0,";
  AppendQuoted(out, content.blocks.front()->GetLabel());
  out += ',';
  Writer writer(content, out, cond);
  if (!writer.Element(1, content.blocks.size(), levels)) return SequenceTypes::kStatusError;
  out += ')';
  return 0;
}

void CSequenceWriter::AppendQuoted(Dstring& out, std::string_view text, char quote) {
  out += quote;
  for (char c : text) {
    if (c == quote) out += quote;
    out += c;
  }
  out += quote;
}
