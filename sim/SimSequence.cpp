#include "SimSequence.h"

#include "SimReply.h"
#include "SimSequenceCheck.h"
#include "support/DataParcel.h"
#include "support/ParserExpression.h"

const SimSequence::Entry SimSequence::kCommands[] = {
    {":SGEN:GLOB:SEQ", &SimSequence::Sequence},
    {":SGEN:GLOB:SEQ:EVEN", &SimSequence::Events},
    {":SGEN:GLOB:SEQ:LLEV", &SimSequence::LoopLevels},
    {":SGEN:GLOB:SEQ:ITER:MAX", &SimSequence::LargestCount},
    {":SGEN:GLOB:CONF", &SimSequence::Configuration},
    {":SGEN:GLOB:SEQ:DATA", &SimSequence::Data},
};

SimSequence::SimSequence(const SimParamTable& params)
    : mConfig(params),
      mMode(mConfig.Mode(params)),
      mSequence(SimSequenceCheck::InitialSequence(mConfig, mMode)),
      mEvents(SimSequenceCheck::InitialEvents()) {}

bool SimSequence::RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) {
  for (const Entry& entry : kCommands) {
    if (rest == entry.path) {
      (this->*entry.handler)(cmd, context);
      return true;
    }
  }
  return false;
}

void SimSequence::Advance(SimContext& context) {
  // The mode is an ordinary parameter that anyone may write; the configuration follows it.
  Dstring mode = mConfig.Mode(context.Params());
  if (mode == mMode) return;
  mMode = std::move(mode);
  context.MarkChanged(":SGEN:GLOB:CONF");
}

void SimSequence::Store(const SimCommand& cmd, SimContext& context, int check, Dstring& stored,
                        const char* header) {
  if (check != 0) return context.Error(check);
  if (cmd.GetArgs() == stored) return;
  stored = cmd.GetArgs();
  context.MarkChanged(header);
}

void SimSequence::Sequence(const SimCommand& cmd, SimContext& context) {
  if (cmd.IsQuery()) return context.Reply(mSequence);
  if (!cmd.HasArgs()) return context.Error(-109);
  const int check =
      SimSequenceCheck::CheckSequence(cmd.GetArgs(), mConfig.NumDataPorts(), mConfig.LoopLevels());
  Store(cmd, context, check, mSequence, ":SGEN:GLOB:SEQ");
}

void SimSequence::Events(const SimCommand& cmd, SimContext& context) {
  // Only a central module has the event logic.
  if (!mConfig.HasCentral()) return context.Error(-113);
  if (cmd.IsQuery()) return context.Reply(mEvents);
  if (!cmd.HasArgs()) return context.Error(-109);
  Store(cmd, context, SimSequenceCheck::CheckEvents(cmd.GetArgs()), mEvents, ":SGEN:GLOB:SEQ:EVEN");
}

void SimSequence::LoopLevels(const SimCommand& cmd, SimContext& context) {
  if (!cmd.IsQuery()) return context.Error(-200);
  context.Reply(Dstring::Format("%lu", mConfig.LoopLevels()));
}

void SimSequence::LargestCount(const SimCommand& cmd, SimContext& context) {
  if (!cmd.IsQuery()) return context.Error(-200);
  context.Reply(Dstring::Format("%lu", SimSequenceCheck::kMaxLoopCount));
}

void SimSequence::Configuration(const SimCommand& cmd, SimContext& context) {
  if (!cmd.IsQuery()) return context.Error(-200);
  context.Reply(mConfig.Format(context.Params()));
}

void SimSequence::Capture(SettingText& text) const {
  text.SetSequence(mSequence);
  if (mConfig.HasCentral()) text.SetEvents(mEvents);
}

int SimSequence::Check(const SettingText& text, Dstring& detail) const {
  const int line = text.GetSequenceLine();
  switch (SimSequenceCheck::CheckSequence(text.GetSequence(), mConfig.NumDataPorts(), mConfig.LoopLevels())) {
    case 0:
      break;
    case -222:
      detail = Dstring::Format("line %d: a loop of the sequence runs more than %lu times", line,
                               SimSequenceCheck::kMaxLoopCount);
      return -222;
    case -224:
      detail = Dstring::Format("line %d: the sequence does not fit this instrument of %lu data ports and %lu loop levels",
                               line, mConfig.NumDataPorts(), mConfig.LoopLevels());
      return -224;
    default:
      detail = Dstring::Format("line %d: the sequence is not a sequence expression", line);
      return -104;
  }
  if (!text.HasEvents()) return 0;
  if (!mConfig.HasCentral()) {
    detail = Dstring::Format("line %d: this instrument has no central module to take sequence events",
                             text.GetEventsLine());
    return -224;
  }
  if (int rc = SimSequenceCheck::CheckEvents(text.GetEvents())) {
    detail = Dstring::Format("line %d: the events are not a table of ten sequence events", text.GetEventsLine());
    return rc;
  }
  return 0;
}

void SimSequence::Take(const SettingText& text) {
  mSequence = text.GetSequence();
  mEvents = text.HasEvents() ? text.GetEvents() : SimSequenceCheck::InitialEvents();
}

void SimSequence::Reset(const SimParamTable& params) {
  mSequence = SimSequenceCheck::InitialSequence(mConfig, mConfig.Mode(params));
  mEvents = SimSequenceCheck::InitialEvents();
}

// The sequence text travels as a block, "#<n><length><text>", so that its lines arrive whole.
void SimSequence::Data(const SimCommand& cmd, SimContext& context) {
  if (cmd.IsQuery()) {
    SettingText text(SettingText::Kind::kSequence);
    Capture(text);
    const Dstring written = text.Write();
    return context.Reply(SimBlockHeader(written.size()) + written);
  }
  DataParcel items;
  ConditionList ignored;
  if (!cmd.HasArgs()) return context.Error(-109);
  if (ParserExpression::Parse(cmd.GetArgs(), items, ignored) != 0 || items.size() != 1 ||
      items[0].GetType() != DataItemType::Block) {
    return context.Error(-104);
  }
  SettingText text(SettingText::Kind::kSequence);
  SettingText::Problem problem;
  if (!SettingText::Read(items[0].GetText(), SettingText::Kind::kSequence, text, problem)) {
    return context.Error(-104, Dstring::Format("line %d: %s", problem.line, problem.what.c_str()));
  }
  Dstring detail;
  if (int rc = Check(text, detail)) return context.Error(rc, detail);
  const Dstring sequence = mSequence;
  const Dstring events = mEvents;
  Take(text);
  if (mSequence != sequence) context.MarkChanged(":SGEN:GLOB:SEQ");
  if (mEvents != events) context.MarkChanged(":SGEN:GLOB:SEQ:EVEN");
}
