// Arbitrary text as the unit attribute reply ("%s",%d,%d,%d,%fd) that a parameter's :ATTR?
// answers: the project's parse into a flat parcel with the five-item extraction a reader of
// it does, and qensim's own reader of attribute writes.
//  - Text that gives five items of the right kinds is taken; written back in the reply form,
//    it reads again to the same unit, exponents and step.
//  - qensim's reader takes text only when the extraction does, and what it takes it writes in
//    a form both read back equal.
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "SimUnitAttr.h"
#include "support/ParserExpression.h"

namespace {

void Check(bool ok) {
  if (!ok) __builtin_trap();
}

struct Attr {
  Dstring unit;
  long exps[3] = {0, 0, 0};
  double step = 0;
};

// The five items: a text, three integers, a number; false for anything else.
bool Extract(std::string_view text, Attr& out) {
  DataParcel items;
  ConditionList list;
  if (ParserExpression::Parse(text, items, list) != 0) {
    Check(list.Size() == 1);
    return false;
  }
  if (items.size() != 5 || !items[0].IsText()) return false;
  for (int i = 0; i < 3; ++i) {
    if (!items[1 + i].IsInteger() || !items[1 + i].GetLong(out.exps[i])) return false;
  }
  if (!items[4].IsNumber() || !items[4].GetDouble(out.step)) return false;
  out.unit = Dstring(items[0].GetText());
  return true;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  Attr attr;
  const bool taken = Extract(text, attr);
  if (taken && attr.unit.find('"') == Dstring::npos && std::isfinite(attr.step) &&
      std::fabs(attr.step) < 1e300) {
    Dstring again = Dstring::Format("(\"%s\",%ld,%ld,%ld,%.17gd)", attr.unit.c_str(), attr.exps[0], attr.exps[1],
                                    attr.exps[2], attr.step);
    Attr back;
    if (attr.unit.find('\0') == Dstring::npos) {
      Check(Extract(again, back));
      Check(back.unit == attr.unit && back.step == attr.step);
      for (int i = 0; i < 3; ++i) Check(back.exps[i] == attr.exps[i]);
    }
  }
  SimUnitAttr sim;
  const int rc = SimUnitAttr::Parse(text, sim);
  Check(rc == 0 || rc == -104 || rc == -224);
  if (rc == 0) {
    SimUnitAttr again;
    Check(SimUnitAttr::Parse(sim.Format(), again) == 0);
    Check(again.GetUnit() == sim.GetUnit());
  }
  return 0;
}
