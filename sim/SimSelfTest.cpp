#include "SimSelfTest.h"

#include "support/DataParcel.h"
#include "support/ParserExpression.h"

namespace {

constexpr std::string_view kTypeSuffix = ":TYPE";

// What a failing module reports: the check a real module's test would stop at.
Dstring FailureOf(const Dstring& model) {
  return "Front end of " + model + ": level check read 0.82 V where 1.00 V is expected";
}

}  // namespace

std::size_t SimSelfTest::Begin(SimContext& context) {
  mModules.clear();
  for (std::size_t i : context.Params().WithPrefix(":CGR")) {
    const Dstring& header = context.Params().At(i).GetHeader();
    // Modules are the places with a ":TYPE" directly under ":CGRn:MODm".
    if (!header.EndsWith(kTypeSuffix) || header.find(":CONN") != Dstring::npos) continue;
    mModules.push_back({Dstring(header.substr(0, header.size() - kTypeSuffix.size())),
                        context.Params().At(i).GetText(), "NRUN", ""});
  }
  return mModules.size();
}

void SimSelfTest::ItemDone(std::size_t item, SimContext&) {
  Module& m = mModules[item];
  const bool fails = !mFailing.empty() && m.path.ToUpper() == mFailing.ToUpper();
  m.result = fails ? "FAIL" : "PASS";
  m.detail = fails ? FailureOf(m.model) : Dstring();
}

bool SimSelfTest::RunTaskCommand(const Dstring& what, const SimCommand& cmd, SimContext& context) {
  if (what == "RES" && cmd.IsQuery()) {
    Dstring out;
    for (const Module& m : mModules) {
      out += Dstring(out.empty() ? "" : ",") + "(\"" + m.path + "\",\"" + m.model + "\"," + m.result + ",\"" + m.detail +
             "\")";
    }
    context.Reply(out);
    return true;
  }
  if (what != "FAIL" || cmd.IsQuery() || !context.TestControl()) return false;
  DataParcel items;
  ConditionList ignored;
  if (ParserExpression::Parse(cmd.GetArgs(), items, ignored) != 0 || items.size() != 1 || !items[0].IsText()) {
    context.Error(-104);
    return true;
  }
  // Named with or without the leading colon.
  const Dstring name(items[0].GetText());
  mFailing = name.empty() || name.StartsWith(":") ? name : Dstring(":" + name);
  return true;
}
