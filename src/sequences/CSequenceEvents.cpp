#include "sequences/CSequenceEvents.h"

#include <climits>

#include "sequences/CSequenceWriter.h"
#include "support/ConditionListLoader.h"
#include "support/LispList.h"
#include "support/ParserExpression.h"

namespace {

bool Text(const LispList& e, Dstring& out) {
  if (!e.IsItem() || !e.GetItem().IsText()) return false;
  out = Dstring(e.GetItem().GetText());
  return true;
}

bool ReadItem(const LispList& e, CSequenceEvents::Item& item) {
  if (!e.IsList() || e.Size() != 4 || !Text(e[0], item.first) || !Text(e[1], item.second) ||
      !Text(e[2], item.third) || !e[3].IsItem()) {
    return false;
  }
  item.bare = e[3].GetItem().AsExpression();
  return true;
}

bool ReadEvent(const LispList& e, CSequenceEvents::Event& event) {
  long number = 0;
  if (!e.IsList() || e.Size() != 3 || !Text(e[0], event.name) || !e[1].IsItem() ||
      !e[1].GetItem().IsInteger() || !e[1].GetItem().GetLong(number) || number < INT_MIN ||
      number > INT_MAX || !e[2].IsList()) {
    return false;
  }
  event.number = static_cast<int>(number);
  for (const LispList& i : e[2]) {
    CSequenceEvents::Item item;
    if (!ReadItem(i, item)) return false;
    event.items.push_back(std::move(item));
  }
  return true;
}

}  // namespace

void CSequenceEvents::Reset() {
  mEvents = {};
}

int CSequenceEvents::FromExpression(const Dstring& text, ConditionList& cond) {
  ConditionList parse;
  LispList top;
  double version = 0.0;
  std::array<Event, kNumEvents> events;
  bool ok = ParserExpression::Parse(text, top, parse) == 0 && top.Size() == kNumEvents + 1 &&
            top[0].IsItem() && top[0].GetItem().GetDouble(version) && version <= 3.0;
  for (std::size_t i = 0; ok && i < kNumEvents; ++i) ok = ReadEvent(top[i + 1], events[i]);
  if (!ok) {
    // A whole table would drown the message.
    const Dstring shown = text.size() <= 160 ? text : Dstring(text.substr(0, 160) + "...");
    ConditionListLoader::ConditionToken(cond, "GUI_SEQUENCE_EVENT_EXPR_SYNTAX", {shown}, 1);
    return 1;
  }
  mEvents = std::move(events);
  return 0;
}

const Dstring& CSequenceEvents::BuildExpression() {
  Dstring& out = mLastBuilt;
  out = "(3.0";
  for (const Event& event : mEvents) {
    out += ",(";
    CSequenceWriter::AppendQuoted(out, event.name);
    out.AppendPrintf(",%d,(", event.number);
    bool first = true;
    for (const Item& item : event.items) {
      out += first ? "(" : ",(";
      first = false;
      CSequenceWriter::AppendQuoted(out, item.first, '\'');
      out += ',';
      CSequenceWriter::AppendQuoted(out, item.second, '\'');
      out += ',';
      CSequenceWriter::AppendQuoted(out, item.third, '\'');
      out += ',';
      out += item.bare;
      out += ')';
    }
    out += "))";
  }
  out += ')';
  return out;
}
