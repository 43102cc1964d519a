#include "SimSequence.h"

#include "SimSequenceCheck.h"

const SimSequence::Entry SimSequence::kCommands[] = {
    {":SGEN:GLOB:SEQ", &SimSequence::Sequence},
    {":SGEN:GLOB:SEQ:EVEN", &SimSequence::Events},
    {":SGEN:GLOB:SEQ:LLEV", &SimSequence::LoopLevels},
    {":SGEN:GLOB:SEQ:ITER:MAX", &SimSequence::LargestCount},
    {":SGEN:GLOB:CONF", &SimSequence::Configuration},
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
