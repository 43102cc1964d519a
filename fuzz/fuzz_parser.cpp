// Arbitrary bytes into both parses and the ";" split. A parse either succeeds and writes a
// text that reads back to an equal tree, or fails with a condition; a split covers the text.
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "support/ParserExpression.h"

namespace {

void Check(bool ok) {
  if (!ok) __builtin_trap();
}

void CheckTree(std::string_view text) {
  ConditionList list;
  LispList tree;
  if (ParserExpression::Parse(text, tree, list) != 0) {
    Check(list.Size() == 1 && tree.Size() == 0);
    return;
  }
  Check(list.IsEmpty());
  Dstring written = tree.AsExpression();
  LispList again;
  Check(ParserExpression::Parse(written, again, list) == 0);
  Check(again == tree);
  Check(again.AsExpression() == written);
}

// The flat parse agrees with the tree parse: it succeeds exactly when no element is a list.
void CheckParcel(std::string_view text) {
  ConditionList list;
  LispList tree;
  DataParcel parcel;
  bool flat = ParserExpression::Parse(text, tree, list) == 0;
  for (const LispList& child : tree) flat = flat && child.IsItem();
  Check((ParserExpression::Parse(text, parcel, list) == 0) == flat);
  if (!flat) return;
  Check(parcel.size() == tree.Size());
  DataParcel again;
  Check(ParserExpression::Parse(parcel.AsExpression(), again, list) == 0);
  Check(again == parcel);
}

// Takes every other element at depth 2 and puts it back where it was: a parse with the sink
// fails exactly when one without it does, and ends with the same tree.
class PutBack : public ParserExpression::Sink {
 public:
  std::size_t Depth() const override { return 2; }
  bool Take(std::size_t depth, std::size_t index, LispList& element) override {
    Check(depth >= 1 && depth <= 2);
    if (depth == 1) {
      // The list just completed lost the elements taken from it; they go back in order.
      if (element.IsList()) {
        for (auto& [at, taken] : mTaken) element.Insert(at, std::move(taken));
      }
      mTaken.clear();
      return false;
    }
    if (index % 2 == 0) return false;
    mTaken.emplace_back(index, std::move(element));
    return true;
  }

 private:
  std::vector<std::pair<std::size_t, LispList>> mTaken;
};

void CheckSink(std::string_view text) {
  ConditionList list;
  LispList plain;
  LispList streamed;
  PutBack sink;
  const int rc = ParserExpression::Parse(text, plain, list);
  Check((ParserExpression::Parse(text, streamed, list, sink) == 0) == (rc == 0));
  Check(rc != 0 || streamed == plain);
}

void CheckSplit(std::string_view text) {
  ConditionList list;
  std::vector<std::string_view> parts;
  if (ParserExpression::SplitJoined(text, parts, list) != 0) {
    Check(list.Size() == 1 && parts.empty());
    return;
  }
  std::string joined;
  for (std::size_t i = 0; i < parts.size(); ++i) {
    Check(parts[i].data() >= text.data() && parts[i].data() + parts[i].size() <= text.data() + text.size());
    joined += (i > 0 ? ";" : "") + std::string(parts[i]);
  }
  Check(joined == text);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  std::string_view text(reinterpret_cast<const char*>(data), size);
  CheckTree(text);
  CheckParcel(text);
  CheckSplit(text);
  CheckSink(text);
  return 0;
}
