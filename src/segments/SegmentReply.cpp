#include "segments/SegmentReply.h"

#include <climits>

#include "support/ConditionListLoader.h"
#include "support/LispList.h"
#include "support/ParserExpression.h"

namespace {

constexpr std::size_t kShownLength = 40;

// The element at `index` of the reply parsed as a list, when it is an item.
bool ItemAt(const Dstring& reply, std::size_t index, DataItem& out) {
  LispList parsed;
  ConditionList ignored;
  if (ParserExpression::Parse(reply, parsed, ignored) != 0) return false;
  if (parsed.Size() <= index || !parsed[index].IsItem()) return false;
  out = parsed[index].GetItem();
  return true;
}

bool IntegerItem(const DataItem& item, long min, long max, long& out) {
  long value = 0;
  if (!item.IsInteger() || !item.GetLong(value) || value < min || value > max) return false;
  out = value;
  return true;
}

}  // namespace

bool SegmentReply::Number(const Dstring& reply, long min, long max, long& out) {
  long value = 0;
  if (!reply.ToLong(value) || value < min || value > max) return false;
  out = value;
  return true;
}

bool SegmentReply::FirstText(const Dstring& reply, Dstring& out) {
  DataItem item;
  if (!ItemAt(reply, 0, item) || !item.IsText()) return false;
  out = Dstring(item.GetText());
  return true;
}

bool SegmentReply::FirstItemText(const Dstring& reply, Dstring& out) {
  DataItem item;
  if (!ItemAt(reply, 0, item)) return false;
  // A quoted empty text is a coding of no characters; any other empty item is none.
  if (item.GetText().empty() && item.GetType() != DataItemType::String) return false;
  out = Dstring(item.GetText());
  return true;
}

bool SegmentReply::FirstNumber(const Dstring& reply, long min, long max, long& out) {
  DataItem item;
  return ItemAt(reply, 0, item) && IntegerItem(item, min, max, out);
}

bool SegmentReply::Position(const Dstring& reply, long& trace, long& vector) {
  LispList parsed;
  ConditionList ignored;
  if (ParserExpression::Parse(reply, parsed, ignored) != 0 || parsed.Size() < 2) return false;
  long t = 0, v = 0;
  if (!parsed[0].IsItem() || !IntegerItem(parsed[0].GetItem(), -1, INT_MAX, t)) return false;
  if (!parsed[1].IsItem() || !IntegerItem(parsed[1].GetItem(), -1, INT_MAX, v)) return false;
  trace = t;
  vector = v;
  return true;
}

bool SegmentReply::Truth(const Dstring& reply, bool& out) {
  const Dstring word = reply.Trimmed();
  if (word != "TRUE" && word != "FALSE") return false;
  out = word == "TRUE";
  return true;
}

int SegmentReply::Refuse(ConditionList& list, std::string_view key, std::initializer_list<Dstring> args,
                         int code) {
  ConditionListLoader::ConditionToken(list, key, args, code);
  return code;
}

Dstring SegmentReply::Shown(std::string_view reply) {
  Dstring out(reply.substr(0, kShownLength));
  for (char& c : out) {
    if (static_cast<unsigned char>(c) < 0x20 || static_cast<unsigned char>(c) >= 0x7f) c = '.';
  }
  if (reply.size() > kShownLength) out += "...";
  return out;
}
