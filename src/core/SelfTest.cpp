#include "core/SelfTest.h"

#include "support/LispList.h"
#include "support/ParserExpression.h"

int SelfTest::Results(std::vector<ModuleResult>& out, ConditionList& list) {
  static const char* kQuery = ":RES?";
  Dstring reply;
  if (int status = Task().Call(kQuery, reply, list)) return status;
  LispList tree;
  ConditionList ignored;
  if (ParserExpression::Parse(reply, tree, ignored) != 0) return Task().BadReply(kQuery, reply, list);
  std::vector<ModuleResult> read;
  for (const LispList& entry : tree) {
    if (!entry.IsList() || entry.Size() != 4) return Task().BadReply(kQuery, reply, list);
    ModuleResult r;
    Dstring* fields[] = {&r.module, &r.model, &r.result, &r.detail};
    for (std::size_t i = 0; i < 4; ++i) {
      if (!entry[i].IsItem() || !entry[i].GetItem().IsText()) return Task().BadReply(kQuery, reply, list);
      *fields[i] = Dstring(entry[i].GetItem().GetText());
    }
    r.result = r.result.ToUpper();
    read.push_back(std::move(r));
  }
  out = std::move(read);
  return 0;
}
