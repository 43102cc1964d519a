// Arbitrary bytes into both parses and the ";" split. A parse either succeeds and writes a
// text that reads back to an equal tree, or fails with a condition; a split covers the text.
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
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
  return 0;
}
