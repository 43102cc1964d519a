#pragma once

#include <cstddef>
#include <string_view>
#include <vector>

#include "SimParam.h"
#include "support/Dstring.h"

// A rule that ties numeric parameters together, of one of the kinds the configuration names:
//   reciprocal A B          A = 1 / B
//   levels AMPL OFFS HIGH LOW
//                           HIGH = OFFS + AMPL/2, LOW = OFFS - AMPL/2, inside the level window
//                           [LMAX of LOW, HMAX of HIGH]; which window the current limits follow
//   limit-by TARGET SOURCE  the upper current limit of TARGET is the value of SOURCE
class SimCoupling {
 public:
  // The rule of the named kind over the given parameters; false (with `error`) for an unknown
  // kind, a wrong number of members or members that do not fit the kind.
  static bool Make(std::string_view kind, std::vector<std::size_t> members,
                   const std::vector<SimParam>& params, SimCoupling& out, Dstring& error);

  const std::vector<std::size_t>& GetMembers() const { return mMembers; }
  bool Involves(std::size_t index) const;
  // Gives the other members the values that follow from the new value of `written`.
  void Propagate(std::vector<SimParam>& params, std::size_t written) const;
  // Narrows the current limits of the members, which start from their absolute limits.
  void NarrowLimits(std::vector<SimParam>& params) const;
  // Whether the members' values agree with the rule, to within the last digits a computation
  // of the rule may differ in (a setting's values are taken as they were, not derived again).
  bool Holds(const std::vector<SimParam>& params) const;

 private:
  std::size_t mKind = 0;  // index into the table of kinds
  std::vector<std::size_t> mMembers;
};
