// Arbitrary text as the unit attribute reply ("%s",%d,%d,%d,%fd) that a parameter's :ATTR?
// answers, through the reader the parameter fields use, and through qensim's own reader of
// attribute writes.
//  - The fields' reader never fails without saying so, and
//    what it takes it writes in a form that reads back to the same text.
//  - qensim's reader refuses with a SCPI code or takes text that it writes back readably.
#include <cctype>
#include <cstddef>
#include <cstdint>
#include <string_view>

#include "SimUnitAttr.h"
#include "params/UnitsRecord.h"

namespace {

void Check(bool ok) {
  if (!ok) __builtin_trap();
}

// A record whose written form the reader can take again: a plain unit and a step that "%f"
// writes without losing it to zero.
bool IsWritable(const UnitsRecord& units) {
  for (char c : units.unitName) {
    if (c == '"' || std::iscntrl(static_cast<unsigned char>(c))) return false;
  }
  return units.step >= 1e-6 && units.step < 1e15;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  UnitsRecord units;
  ConditionList list;
  const int status = units.Parse(Dstring(text), list);
  Check(status == 0 ? list.IsEmpty() : !list.IsEmpty());
  if (status == 0 && IsWritable(units)) {
    UnitsRecord back;
    ConditionList again;
    Check(back.Parse(units.Format(), again) == 0);
    Check(back.Format() == units.Format());
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
