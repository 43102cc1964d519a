#include "sequences/CSequenceReader.h"

#include <algorithm>
#include <cmath>

#include "sequences/CLoop.h"
#include "sequences/CSequenceBlock.h"
#include "sequences/CSequenceStructure.h"

namespace {

using Block = SequenceTypes::CSequenceBlock;

// `text` equals the upper-case `upper` in any case; no allocation, this runs for every element.
bool SameWord(std::string_view text, std::string_view upper) {
  if (text.size() != upper.size()) return false;
  for (std::size_t i = 0; i < text.size(); ++i) {
    const char c = text[i] >= 'a' && text[i] <= 'z' ? static_cast<char>(text[i] - 'a' + 'A') : text[i];
    if (c != upper[i]) return false;
  }
  return true;
}

bool IsWord(const LispList& e, std::string_view upper) {
  return e.IsItem() && e.GetItem().GetType() == DataItemType::Word && SameWord(e.GetItem().GetText(), upper);
}

bool Text(const LispList& e, Dstring& out) {
  if (!e.IsItem() || !e.GetItem().IsText()) return false;
  out = Dstring(e.GetItem().GetText());
  return true;
}

bool Unsigned(const LispList& e, unsigned long& out) {
  return e.IsItem() && e.GetItem().IsInteger() && e.GetItem().GetULong(out);
}

// A number of iterations, or INF (endless, kept as 0).
bool Iterations(const LispList& e, unsigned long& out) {
  if (IsWord(e, "INF")) {
    out = 0;
    return true;
  }
  return Unsigned(e, out);
}

// A quoted segment name, or a keyword of a built-in kind (any bare word).
bool Segment(const LispList& e, DataItem& out) {
  if (!e.IsItem()) return false;
  const DataItem& item = e.GetItem();
  if (item.GetType() == DataItemType::String) {
    out = DataItem::MakeString(item.GetText());
    return true;
  }
  if (item.GetType() != DataItemType::Word || item.GetText().empty()) return false;
  const std::string_view text = item.GetText();
  const bool upper = std::none_of(text.begin(), text.end(), [](char c) { return c >= 'a' && c <= 'z'; });
  out = upper ? item : DataItem::MakeWord(Dstring(text).ToUpper());
  return true;
}

}  // namespace

bool CSequenceReader::Label(const LispList& element, Dstring& out) {
  if (!element.IsItem() || element.GetItem().GetType() == DataItemType::Block) return false;
  out = Dstring(element.GetItem().GetText());
  return true;
}

namespace {

class Reader {
 public:
  Reader(CSequenceReader::Generation generation, CSequence* owner, SequenceTypes::Content& out)
      : mSecond(generation == CSequenceReader::Generation::Second), mOwner(owner), mOut(out) {}

  // Reads one element; `level` becomes the highest loop level within it.
  bool Element(const LispList& e, unsigned long& level);
  // One item of a SEQ list, with the label before it (none for the first).
  bool SequentialItem(const LispList* labelElement, const LispList& item, unsigned long& level);

 private:
  bool BlockElement(const LispList& e);
  bool Sequential(const LispList& e, unsigned long& level);
  bool LoopElement(const LispList& e, unsigned long& level);
  bool Reactions(const LispList& e, Block& block);
  bool Ports(unsigned long numPorts);
  // The level of a "LOOPh" word of the second generation; 0 when it is none.
  static unsigned long LevelOf(const LispList& e);

  bool mSecond;
  CSequence* mOwner;
  SequenceTypes::Content& mOut;
};

bool Reader::Element(const LispList& e, unsigned long& level) {
  level = 0;
  if (!e.IsList() || e.Size() == 0 || !e[0].IsItem()) return false;
  if (IsWord(e[0], "BLOCK")) return BlockElement(e);
  if (IsWord(e[0], "SEQ")) return Sequential(e, level);
  return LoopElement(e, level);
}

bool Reader::Ports(unsigned long numPorts) {
  if (mOut.blocks.empty()) mOut.numPorts = numPorts;
  return numPorts == mOut.numPorts;
}

bool Reader::BlockElement(const LispList& e) {
  auto block = std::make_unique<Block>();
  unsigned long length = 0;
  std::size_t first = 2;
  if (mSecond) {
    unsigned long trigger = 0, measure = 0;
    Dstring vxi;
    if (e.Size() < 6 || (e.Size() - 6) % 3 != 0) return false;
    if (!Unsigned(e[1], trigger) || !Unsigned(e[2], length) || !Unsigned(e[3], measure) || !Text(e[4], vxi))
      return false;
    if (IsWord(e[5], "SYNC")) {
      block->SetSync(1);
    } else if (!Reactions(e[5], *block)) {
      return false;
    }
    block->SetTrigger(trigger);
    block->SetMeasurementStart(measure);
    block->SetVXITrigger(vxi);
    first = 6;
  } else if (e.Size() < 2 || !Unsigned(e[1], length)) {
    return false;
  }
  block->SetLength(length);
  const std::size_t step = mSecond ? 3 : 1;
  if (!Ports((e.Size() - first) / step)) return false;
  DataParcel& segments = block->Segments();
  segments.reserve(mOut.numPorts);
  for (std::size_t i = first; i < e.Size(); i += step) {
    DataItem item;
    if (!Segment(e[i], item)) return false;
    // The two numbers after a segment are the instrument's; they are always written as 0.
    if (mSecond && (!e[i + 1].IsItem() || !e[i + 2].IsItem())) return false;
    segments.push_back(std::move(item));
  }
  mOut.blocks.push_back(std::move(block));
  return true;
}

bool Reader::Reactions(const LispList& e, Block& block) {
  if (!e.IsList()) return false;
  for (const LispList& r : e) {
    Block::Reaction reaction;
    if (!r.IsList() || r.Size() != 4 || !Text(r[0], reaction.ifCondition) ||
        !Text(r[1], reaction.gotoTarget) || !Unsigned(r[2], reaction.trigger) ||
        !Text(r[3], reaction.vxiTrigger)) {
      return false;
    }
    block.Reactions().push_back(std::move(reaction));
  }
  return true;
}

bool Reader::Sequential(const LispList& e, unsigned long& level) {
  // (SEQ,item,"label",item,...): an item, then pairs of a label and an item.
  if (e.Size() < 2 || e.Size() % 2 != 0) return false;
  for (std::size_t i = 1; i < e.Size(); i += 2) {
    if (!SequentialItem(i > 1 ? &e[i - 1] : nullptr, e[i], level)) return false;
  }
  return true;
}

bool Reader::SequentialItem(const LispList* labelElement, const LispList& item, unsigned long& level) {
  Dstring label;
  if (labelElement != nullptr && !CSequenceReader::Label(*labelElement, label)) return false;
  const std::size_t firstBlock = mOut.blocks.size();
  unsigned long inner = 0;
  if (!Element(item, inner)) return false;
  if (labelElement != nullptr) mOut.blocks[firstBlock]->SetLabel(label);
  level = std::max(level, inner);
  return true;
}

unsigned long Reader::LevelOf(const LispList& e) {
  if (e.GetItem().GetType() != DataItemType::Word) return 0;
  const std::string_view word = e.GetItem().GetText();
  if (word.size() <= 4 || word.size() > 6 || !SameWord(word.substr(0, 4), "LOOP")) return 0;
  unsigned long level = 0;
  for (std::size_t i = 4; i < word.size(); ++i) {
    if (word[i] < '0' || word[i] > '9') return 0;
    level = level * 10 + static_cast<unsigned long>(word[i] - '0');
  }
  return level <= SequenceTypes::kMaxLoopLevels ? level : 0;
}

bool Reader::LoopElement(const LispList& e, unsigned long& level) {
  unsigned long trigger = 0, iterations = 0;
  Dstring vxi;
  unsigned long own = 0;
  if (mSecond) {
    own = LevelOf(e[0]);
    if (own == 0 || e.Size() != 5 || !Unsigned(e[1], trigger) || !Iterations(e[2], iterations) ||
        !Text(e[3], vxi))
      return false;
  } else if (!IsWord(e[0], "LOOP") || e.Size() != 3 || !Iterations(e[1], iterations)) {
    return false;
  }
  const unsigned long first = mOut.blocks.size() + 1;
  unsigned long inner = 0;
  if (!Element(e[e.Size() - 1], inner)) return false;
  if (!mSecond) own = inner + 1;
  if (inner >= own || own > SequenceTypes::kMaxLoopLevels) return false;
  SequenceTypes::CLoop* loop =
      CSequenceStructure::AddLoop(mOut, mOwner, first, mOut.blocks.size() + 1 - first, own);
  loop->SetNumIterations(iterations);
  loop->SetTrigger(trigger);
  loop->SetVXITrigger(vxi);
  level = own;
  return true;
}

}  // namespace

bool CSequenceReader::Read(const LispList& element, Generation generation, CSequence* owner,
                           SequenceTypes::Content& out) {
  Reader reader(generation, owner, out);
  unsigned long level = 0;
  return reader.Element(element, level);
}

// The version and the label are the outer list's first two elements; while the third is open,
// the elements at depth 2 are those of the block expression.
bool CSequenceReader::Stream::Take(std::size_t depth, std::size_t index, LispList& element) {
  if (depth == 1) {
    mTopCount = index + 1;
    double version = 0.0;
    if (index == 0) {
      mVersionOk = element.IsItem() && element.GetItem().GetDouble(version) && !std::isnan(version) && version <= 3.0;
      mGeneration = GenerationOf(version);
    }
    return false;
  }
  if (mTopCount != 2 || !mVersionOk) return false;
  if (index == 0) {
    mStreamed = IsWord(element, "SEQ");
    mCount = 1;
    return false;
  }
  if (!mStreamed) return false;
  ++mCount;
  if (mFailed) return true;
  if (index % 2 == 0) {
    mLabel = std::move(element);
    return true;
  }
  mFailed = !Reader(mGeneration, mOwner, mOut).SequentialItem(index > 1 ? &mLabel : nullptr, element, mLevel);
  return true;
}
