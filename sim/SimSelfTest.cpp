#include "SimSelfTest.h"

#include "support/DataParcel.h"
#include "support/ParserExpression.h"

namespace {

constexpr std::string_view kTypeSuffix = ":TYPE";

// What a failing module reports: the check a real module's test would stop at.
Dstring FailureOf(const Dstring& model) {
  return "Output stage of " + model + ": amplitude 0.82 V where 1.00 V is expected";
}

}  // namespace

const char* SimSelfTest::Word(State state) {
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

void SimSelfTest::Start(SimContext& context) {
  mModules.clear();
  for (std::size_t i : context.Params().WithPrefix(":CGR")) {
    const Dstring& header = context.Params().At(i).GetHeader();
    // Modules are the places with a ":TYPE" directly under ":CGRn:MODm".
    if (!header.EndsWith(kTypeSuffix) || header.find(":CONN") != Dstring::npos) continue;
    mModules.push_back({Dstring(header.substr(0, header.size() - kTypeSuffix.size())),
                        context.Params().At(i).GetText(), "NRUN", ""});
  }
  mState = State::Running;
  mStartMs = context.NowMs();
  mDone = 0;
}

void SimSelfTest::Finish(std::size_t upTo) {
  for (; mDone < upTo && mDone < mModules.size(); ++mDone) {
    Module& m = mModules[mDone];
    const bool fails = !mFailing.empty() && m.path.ToUpper() == mFailing.ToUpper();
    m.result = fails ? "FAIL" : "PASS";
    m.detail = fails ? FailureOf(m.model) : Dstring();
  }
}

void SimSelfTest::Advance(SimContext& context) {
  if (mState != State::Running) return;
  const double seconds = static_cast<double>(context.NowMs() - mStartMs) / 1000.0;
  Finish(mSecondsPerModule > 0 ? static_cast<std::size_t>(seconds / mSecondsPerModule) : mModules.size());
  if (mDone == mModules.size()) mState = State::Done;
}

bool SimSelfTest::RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) {
  if (!rest.StartsWith(":SYST:TEST:")) return false;
  const Dstring what(rest.substr(11));
  if (what == "STAR" && !cmd.IsQuery()) {
    if (mState == State::Running || context.Global().IsRunning()) {
      context.Error(-200);
    } else {
      Start(context);
    }
  } else if (what == "STAT" && cmd.IsQuery()) {
    context.Reply(Dstring::Format("%s,%zu,%zu", Word(mState), mDone, mModules.size()));
  } else if (what == "RES" && cmd.IsQuery()) {
    Dstring out;
    for (const Module& m : mModules) {
      out += Dstring(out.empty() ? "" : ",") + "(\"" + m.path + "\",\"" + m.model + "\"," + m.result + ",\"" + m.detail +
             "\")";
    }
    context.Reply(out);
  } else if (what == "ABOR" && !cmd.IsQuery()) {
    if (mState == State::Running) mState = State::Aborted;
  } else if (what == "FAIL" && !cmd.IsQuery() && context.TestControl()) {
    DataParcel items;
    ConditionList ignored;
    if (ParserExpression::Parse(cmd.GetArgs(), items, ignored) != 0 || items.size() != 1 || !items[0].IsText()) {
      context.Error(-104);
    } else {
      // Named with or without the leading colon.
      const Dstring name(items[0].GetText());
      mFailing = name.empty() || name.StartsWith(":") ? name : Dstring(":" + name);
    }
  } else if (what == "PACE" && !cmd.IsQuery() && context.TestControl()) {
    long ms = 0;
    if (!cmd.GetArgs().ToLong(ms) || ms < 0 || ms > 60000) {
      context.Error(-222);
    } else {
      mSecondsPerModule = static_cast<double>(ms) / 1000.0;
    }
  } else {
    context.Error(-113);
  }
  return true;
}
