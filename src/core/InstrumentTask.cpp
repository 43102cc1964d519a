#include "core/InstrumentTask.h"

#include <utility>

#include "instrument/QenGuiInst.h"
#include "support/ConditionListLoader.h"
#include "support/DataParcel.h"
#include "support/FWBlocker.h"
#include "support/ParserExpression.h"

namespace {

bool StateOf(std::string_view word, InstrumentTask::State& state) {
  static const std::pair<const char*, InstrumentTask::State> kWords[] = {{"IDLE", InstrumentTask::State::Idle},
                                                                         {"RUNN", InstrumentTask::State::Running},
                                                                         {"DONE", InstrumentTask::State::Done},
                                                                         {"ABOR", InstrumentTask::State::Aborted}};
  for (const auto& [text, value] : kWords) {
    if (Dstring(word).ToUpper() == text) {
      state = value;
      return true;
    }
  }
  return false;
}

}  // namespace

Dstring InstrumentTask::Command(const char* what) const {
  return ":" + QenGuiInst::GetAppHandle() + mStem + what;
}

int InstrumentTask::Call(const char* what, Dstring& reply, ConditionList& list) const {
  FWBlocker guard("InstrumentTask::Call", list);
  if (int status = guard.Block()) return status;
  return QenGuiInst::Call(Command(what), reply, list);
}

int InstrumentTask::BadReply(const char* what, const Dstring& reply, ConditionList& list) const {
  ConditionListLoader::ConditionToken(list, "GUI_STATE_BAD_REPLY", {Command(what), reply}, 1);
  return 1;
}

int InstrumentTask::Start(ConditionList& list) const {
  Dstring reply;
  return Call(":STAR", reply, list);
}

int InstrumentTask::Cancel(ConditionList& list) const {
  Dstring reply;
  return Call(":ABOR", reply, list);
}

int InstrumentTask::Ask(Progress& out, ConditionList& list) const {
  Dstring reply;
  if (int status = Call(":STAT?", reply, list)) return status;
  DataParcel items;
  ConditionList ignored;
  Progress read;
  if (ParserExpression::Parse(reply, items, ignored) != 0 || items.size() != 3 || !StateOf(items[0].GetText(), read.state) ||
      !items[1].GetULong(read.done) || !items[2].GetULong(read.total) || read.done > read.total) {
    return BadReply(":STAT?", reply, list);
  }
  out = read;
  return 0;
}
