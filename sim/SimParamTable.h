#pragma once

#include <cstddef>
#include <set>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "SimCoupling.h"
#include "SimParam.h"
#include "SimRack.h"
#include "support/DstringList.h"

// All parameters of the instrument with their coupling rules. Every value or current-limit
// change is noted until taken, so that callers can tell who must hear of it.
class SimParamTable {
 public:
  // False when the header is already taken.
  bool Add(SimParam param);
  // False (with `error`) when the rule does not fit; see SimCoupling::Make.
  bool AddCoupling(std::string_view kind, const DstringList& headers, Dstring& error);
  // After loading: derive the coupled values from the first member of each rule, set the
  // current limits and forget the changes that made.
  void Settle();

  // The rack the parameters were made for (the configuration's groups, modules and ports).
  void SetRack(SimRack rack) { mRack = std::move(rack); }
  const SimRack& GetRack() const { return mRack; }

  std::size_t Size() const { return mParams.size(); }
  const SimParam& At(std::size_t index) const { return mParams[index]; }
  // Case-insensitive.
  bool Find(std::string_view header, std::size_t& index) const;

  // Reads and stores a value text, then applies the couplings: 0, or the SCPI error
  // -104/-222/-224, in which case nothing changed.
  int Write(std::size_t index, std::string_view text);
  // Stores a value as a setting kept it: read as a write reads it and within the absolute
  // limits, but neither rounded to the resolution nor handed on to coupled parameters, so that
  // it comes back exactly as it was saved. 0, or -104/-222/-224, in which case nothing changed.
  int Restore(std::size_t index, std::string_view text);
  // After Restore of the values a setting names (`named`, by index): a coupling rule with
  // members it does not name has them follow the first member it names; false, with its
  // members, when a rule still does not hold. Otherwise the current limits follow the values
  // and no change is left to take.
  bool FinishRestore(const std::set<std::size_t>& named, std::vector<std::size_t>& broken);

  // 0, or -104/-224 from SimUnitAttr::Parse, or -224 when the unit is not the parameter's.
  int WriteAttr(std::size_t index, std::string_view text);
  // A value outside the current limits, left there by a limit that moved.
  bool IsClashing(std::size_t index) const;

  // Indices, in table order, whose value (or current limits) changed since the last take.
  std::vector<std::size_t> TakeValueChanges();
  std::vector<std::size_t> TakeLimitChanges();

  // The smallest positive number that, put in place of the one "@" of `pattern`, names a
  // parameter; 0 when none does.
  unsigned long Search(std::string_view pattern) const;
  // Indices of the parameters whose header begins with `prefix` (case-insensitive).
  std::vector<std::size_t> WithPrefix(std::string_view prefix) const;

 private:
  void Store(std::size_t index, double number, const Dstring& text);
  void Propagate(std::size_t written);
  void RecomputeLimits();

  SimRack mRack;
  std::vector<SimParam> mParams;
  std::unordered_map<std::string, std::size_t> mIndex;
  std::vector<SimCoupling> mCouplings;
  std::set<std::size_t> mValueChanges;
  std::set<std::size_t> mLimitChanges;
};
