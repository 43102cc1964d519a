#include "SimTimedTask.h"

#include <algorithm>

const char* SimTimedTask::Word(State state) {
  switch (state) {
    case State::Running:
      return "RUNN";
    case State::Done:
      return "DONE";
    case State::Aborted:
      return "ABOR";
    default:
      return "IDLE";
  }
}

int SimTimedTask::StartRefusal(SimContext& context) const { return context.Global().IsRunning() ? -200 : 0; }

void SimTimedTask::Advance(SimContext& context) {
  if (mState != State::Running) return;
  const double seconds = static_cast<double>(context.NowMs() - mStartMs) / 1000.0;
  const std::size_t due = mSecondsPerItem > 0 ? static_cast<std::size_t>(seconds / mSecondsPerItem) : mItems;
  for (; mDone < std::min(due, mItems); ++mDone) ItemDone(mDone, context);
  if (mDone == mItems) mState = State::Done;
}

bool SimTimedTask::RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) {
  const Dstring stem = Dstring(mStem) + ":";
  if (!rest.StartsWith(stem)) return false;
  const Dstring what(rest.substr(stem.size()));
  if (what == "STAR" && !cmd.IsQuery()) {
    const int refusal = mState == State::Running ? -200 : StartRefusal(context);
    if (refusal != 0) {
      context.Error(refusal);
    } else {
      mItems = Begin(context);
      mDone = 0;
      mStartMs = context.NowMs();
      mState = State::Running;
      Advance(context);
    }
  } else if (what == "STAT" && cmd.IsQuery()) {
    context.Reply(Dstring::Format("%s,%zu,%zu", Word(mState), mDone, mItems));
  } else if (what == "ABOR" && !cmd.IsQuery()) {
    if (mState == State::Running) {
      mState = State::Aborted;
      Aborted(mDone, context);
    }
  } else if (what == "PACE" && !cmd.IsQuery() && context.TestControl()) {
    long ms = 0;
    if (!Dstring(cmd.GetArgs()).ToLong(ms) || ms < 0 || ms > 60000) {
      context.Error(-222);
    } else {
      mSecondsPerItem = static_cast<double>(ms) / 1000.0;
    }
  } else if (!RunTaskCommand(what, cmd, context)) {
    context.Error(-113);
  }
  return true;
}
