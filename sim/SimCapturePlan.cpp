#include "SimCapturePlan.h"

#include "support/ConditionList.h"
#include "support/LispList.h"
#include "support/ParserExpression.h"

namespace {

Dstring WordOf(const LispList& e) {
  return e.IsItem() && e.GetItem().GetType() == DataItemType::Word ? Dstring(e.GetItem().GetText()).ToUpper() : Dstring();
}

class Player {
 public:
  Player(std::size_t port, unsigned long vectors, std::vector<SimCapturePlan::Run>& runs)
      : mPort(port), mVectors(vectors), mRuns(runs) {}

  bool Full() const { return mCovered >= mVectors; }
  unsigned long Covered() const { return mCovered; }

  void Element(const LispList& e) {
    if (Full() || !e.IsList() || e.Size() == 0) return;
    const Dstring word = WordOf(e[0]);
    if (word == "BLOCK") {
      Block(e);
    } else if (word == "SEQ") {
      for (std::size_t i = 1; i < e.Size() && !Full(); i += 2) Element(e[i]);
    } else if (word.StartsWith("LOOP") && e.Size() == 5) {
      Loop(e);
    }
  }

 private:
  void Block(const LispList& e) {
    const std::size_t slot = 6 + 3 * mPort;
    unsigned long length = 0;
    if (slot >= e.Size() || !e[slot].IsItem() || !e[2].IsItem() || !e[2].GetItem().GetULong(length) || length == 0) return;
    const DataItem& segment = e[slot].GetItem();
    const bool named = segment.GetType() == DataItemType::String;
    mRuns.push_back({named ? Dstring(segment.GetText()) : Dstring(segment.GetText()).ToUpper(), named, length});
    mCovered += length;
  }

  void Loop(const LispList& e) {
    unsigned long count = 0;
    const bool endless = WordOf(e[2]) == "INF";
    if (!endless && (!e[2].IsItem() || !e[2].GetItem().GetULong(count))) return;
    for (unsigned long i = 0; (endless || i < count) && !Full(); ++i) {
      const unsigned long before = mCovered;
      Element(e[4]);
      if (mCovered == before) return;  // a body that plays nothing would loop for ever
    }
  }

  std::size_t mPort;
  unsigned long mVectors;
  std::vector<SimCapturePlan::Run>& mRuns;
  unsigned long mCovered = 0;
};

}  // namespace

std::vector<SimCapturePlan::Run> SimCapturePlan::Runs(std::string_view sequence, std::size_t port,
                                                      unsigned long vectors) {
  std::vector<Run> runs;
  LispList top;
  ConditionList ignored;
  if (ParserExpression::Parse(sequence, top, ignored) != 0 || top.Size() != 3) return runs;
  Player player(port, vectors, runs);
  while (!player.Full()) {
    const unsigned long before = player.Covered();
    player.Element(top[2]);
    if (player.Covered() == before) break;
  }
  return runs;
}
