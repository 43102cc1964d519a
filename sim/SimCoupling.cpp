#include "SimCoupling.h"

#include <algorithm>
#include <cmath>

namespace {

using Params = std::vector<SimParam>;
using Members = std::vector<std::size_t>;

void PropagateReciprocal(Params& p, const Members& m, std::size_t written) {
  std::size_t other = written == m[0] ? m[1] : m[0];
  p[other].SetNumber(1.0 / p[written].GetNumber());
}

void PropagateLevels(Params& p, const Members& m, std::size_t written) {
  SimParam& ampl = p[m[0]];
  SimParam& offs = p[m[1]];
  SimParam& high = p[m[2]];
  SimParam& low = p[m[3]];
  // A write keeps its natural partner fixed: amplitude and offset keep each other, high and low too.
  if (written == m[0] || written == m[1]) {
    high.SetNumber(offs.GetNumber() + ampl.GetNumber() / 2.0);
    low.SetNumber(offs.GetNumber() - ampl.GetNumber() / 2.0);
  } else {
    ampl.SetNumber(high.GetNumber() - low.GetNumber());
    offs.SetNumber((high.GetNumber() + low.GetNumber()) / 2.0);
  }
}

void PropagateNothing(Params&, const Members&, std::size_t) {}

void Narrow(SimParam& p, double llim, double hlim) {
  p.SetLimits(std::max(p.GetLlim(), llim), std::min(p.GetHlim(), hlim));
}

void NarrowNothing(Params&, const Members&) {}

void NarrowLevels(Params& p, const Members& m) {
  SimParam& ampl = p[m[0]];
  SimParam& offs = p[m[1]];
  SimParam& high = p[m[2]];
  SimParam& low = p[m[3]];
  double floor = low.GetLmax();
  double ceiling = high.GetHmax();
  double a = ampl.GetNumber();
  double o = offs.GetNumber();
  Narrow(offs, floor + a / 2.0, ceiling - a / 2.0);
  Narrow(ampl, -HUGE_VAL, 2.0 * std::min(o - floor, ceiling - o));
  Narrow(high, low.GetNumber() + ampl.GetLmax(), low.GetNumber() + ampl.GetHmax());
  Narrow(low, high.GetNumber() - ampl.GetHmax(), high.GetNumber() - ampl.GetLmax());
}

void NarrowLimitBy(Params& p, const Members& m) {
  Narrow(p[m[0]], -HUGE_VAL, p[m[1]].GetNumber());
}

bool CheckNumeric(const Params& p, const Members& m, Dstring& error) {
  for (std::size_t i : m) {
    if (!p[i].IsNumeric()) {
      error = Dstring::Format("%s is not numeric", p[i].GetHeader().c_str());
      return false;
    }
  }
  return true;
}

bool CheckReciprocal(const Params& p, const Members& m, Dstring& error) {
  if (!CheckNumeric(p, m, error)) return false;
  for (std::size_t i : m) {
    if (!(p[i].GetLmax() > 0.0)) {
      error = Dstring::Format("%s needs a positive lower limit", p[i].GetHeader().c_str());
      return false;
    }
  }
  return true;
}

bool Near(double a, double b) {
  return std::fabs(a - b) <= 1e-9 * std::max({1.0, std::fabs(a), std::fabs(b)});
}

bool HoldsReciprocal(const Params& p, const Members& m) { return Near(p[m[0]].GetNumber() * p[m[1]].GetNumber(), 1.0); }

bool HoldsLevels(const Params& p, const Members& m) {
  const double ampl = p[m[0]].GetNumber();
  const double offs = p[m[1]].GetNumber();
  return Near(p[m[2]].GetNumber(), offs + ampl / 2.0) && Near(p[m[3]].GetNumber(), offs - ampl / 2.0);
}

// A value beyond a limit that moved is kept (it clashes), so a limit rule always holds.
bool HoldsAlways(const Params&, const Members&) { return true; }

struct Kind {
  const char* name;
  std::size_t members;
  void (*propagate)(Params&, const Members&, std::size_t);
  void (*narrow)(Params&, const Members&);
  bool (*check)(const Params&, const Members&, Dstring&);
  bool (*holds)(const Params&, const Members&);
};

constexpr Kind kKinds[] = {
    {"reciprocal", 2, PropagateReciprocal, NarrowNothing, CheckReciprocal, HoldsReciprocal},
    {"levels", 4, PropagateLevels, NarrowLevels, CheckNumeric, HoldsLevels},
    {"limit-by", 2, PropagateNothing, NarrowLimitBy, CheckNumeric, HoldsAlways},
};

}  // namespace

bool SimCoupling::Make(std::string_view kind, Members members, const Params& params, SimCoupling& out,
                       Dstring& error) {
  for (std::size_t k = 0; k < std::size(kKinds); ++k) {
    if (kind != kKinds[k].name) continue;
    if (members.size() != kKinds[k].members) {
      error = Dstring::Format("%s takes %zu parameters", kKinds[k].name, kKinds[k].members);
      return false;
    }
    if (!kKinds[k].check(params, members, error)) return false;
    out.mKind = k;
    out.mMembers = std::move(members);
    return true;
  }
  error = Dstring::Format("unknown coupling kind \"%s\"", Dstring(kind).c_str());
  return false;
}

bool SimCoupling::Involves(std::size_t index) const {
  return std::find(mMembers.begin(), mMembers.end(), index) != mMembers.end();
}

void SimCoupling::Propagate(Params& params, std::size_t written) const {
  kKinds[mKind].propagate(params, mMembers, written);
}

void SimCoupling::NarrowLimits(Params& params) const {
  kKinds[mKind].narrow(params, mMembers);
}

bool SimCoupling::Holds(const Params& params) const { return kKinds[mKind].holds(params, mMembers); }
