#include "core/SelfTest.h"

#include "instrument/QenGuiInst.h"
#include "support/ConditionListLoader.h"
#include "support/DataParcel.h"
#include "support/FWBlocker.h"
#include "support/LispList.h"
#include "support/ParserExpression.h"

namespace {

Dstring Command(const char* rest) {
  return ":" + QenGuiInst::GetAppHandle() + rest;
}

int Call(const char* scope, const char* rest, Dstring& reply, ConditionList& list) {
  FWBlocker guard(scope, list);
  if (int status = guard.Block()) return status;
  return QenGuiInst::Call(Command(rest), reply, list);
}

int BadReply(const char* rest, const Dstring& reply, ConditionList& list) {
  ConditionListLoader::ConditionToken(list, "GUI_STATE_BAD_REPLY", {Command(rest), reply}, 1);
  return 1;
}

bool StateOf(std::string_view word, SelfTest::State& state) {
  static const std::pair<const char*, SelfTest::State> kWords[] = {{"IDLE", SelfTest::State::Idle},
                                                                   {"RUNN", SelfTest::State::Running},
                                                                   {"DONE", SelfTest::State::Done},
                                                                   {"ABOR", SelfTest::State::Aborted}};
  for (const auto& [text, value] : kWords) {
    if (Dstring(word).ToUpper() == text) {
      state = value;
      return true;
    }
  }
  return false;
}

}  // namespace

int SelfTest::Start(ConditionList& list) {
  Dstring reply;
  return Call("SelfTest::Start", ":SYST:TEST:STAR", reply, list);
}

int SelfTest::Cancel(ConditionList& list) {
  Dstring reply;
  return Call("SelfTest::Cancel", ":SYST:TEST:ABOR", reply, list);
}

int SelfTest::Ask(Progress& out, ConditionList& list) {
  static const char* kQuery = ":SYST:TEST:STAT?";
  Dstring reply;
  if (int status = Call("SelfTest::Ask", kQuery, reply, list)) return status;
  DataParcel items;
  ConditionList ignored;
  Progress read;
  if (ParserExpression::Parse(reply, items, ignored) != 0 || items.size() != 3 || !StateOf(items[0].GetText(), read.state) ||
      !items[1].GetULong(read.done) || !items[2].GetULong(read.total) || read.done > read.total) {
    return BadReply(kQuery, reply, list);
  }
  out = read;
  return 0;
}

int SelfTest::Results(std::vector<ModuleResult>& out, ConditionList& list) {
  static const char* kQuery = ":SYST:TEST:RES?";
  Dstring reply;
  if (int status = Call("SelfTest::Results", kQuery, reply, list)) return status;
  LispList tree;
  ConditionList ignored;
  if (ParserExpression::Parse(reply, tree, ignored) != 0) return BadReply(kQuery, reply, list);
  std::vector<ModuleResult> read;
  for (const LispList& entry : tree) {
    if (!entry.IsList() || entry.Size() != 4) return BadReply(kQuery, reply, list);
    ModuleResult r;
    Dstring* fields[] = {&r.module, &r.model, &r.result, &r.detail};
    for (std::size_t i = 0; i < 4; ++i) {
      if (!entry[i].IsItem() || !entry[i].GetItem().IsText()) return BadReply(kQuery, reply, list);
      *fields[i] = Dstring(entry[i].GetItem().GetText());
    }
    r.result = r.result.ToUpper();
    read.push_back(std::move(r));
  }
  out = std::move(read);
  return 0;
}
