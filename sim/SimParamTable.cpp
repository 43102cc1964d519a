#include "SimParamTable.h"

#include <algorithm>
#include <cctype>

namespace {

constexpr int kOutOfRange = -222;
constexpr int kBadValue = -224;

// The number that `header` carries in place of the "@" of prefix@suffix, or 0.
unsigned long NumberAt(std::string_view header, std::string_view prefix, std::string_view suffix) {
  if (header.size() <= prefix.size() + suffix.size() || !header.starts_with(prefix) ||
      !header.ends_with(suffix)) {
    return 0;
  }
  std::string_view digits = header.substr(prefix.size(), header.size() - prefix.size() - suffix.size());
  if (digits.size() > 9 || digits[0] == '0') return 0;
  unsigned long n = 0;
  for (char c : digits) {
    if (!std::isdigit(static_cast<unsigned char>(c))) return 0;
    n = n * 10 + static_cast<unsigned long>(c - '0');
  }
  return n;
}

std::vector<std::size_t> Take(std::set<std::size_t>& changes) {
  std::vector<std::size_t> out(changes.begin(), changes.end());
  changes.clear();
  return out;
}

}  // namespace

bool SimParamTable::Add(SimParam param) {
  if (!mIndex.emplace(param.GetHeader().ToUpper(), mParams.size()).second) return false;
  mParams.push_back(std::move(param));
  return true;
}

bool SimParamTable::AddCoupling(std::string_view kind, const DstringList& headers, Dstring& error) {
  std::vector<std::size_t> members;
  for (const Dstring& h : headers) {
    std::size_t index = 0;
    if (!Find(h, index)) {
      error = Dstring::Format("unknown parameter %s", h.c_str());
      return false;
    }
    members.push_back(index);
  }
  SimCoupling rule;
  if (!SimCoupling::Make(kind, std::move(members), mParams, rule, error)) return false;
  mCouplings.push_back(std::move(rule));
  return true;
}

void SimParamTable::Settle() {
  for (const SimCoupling& rule : mCouplings) rule.Propagate(mParams, rule.GetMembers()[0]);
  RecomputeLimits();
  mValueChanges.clear();
  mLimitChanges.clear();
}

bool SimParamTable::Find(std::string_view header, std::size_t& index) const {
  auto it = mIndex.find(Dstring(header).ToUpper());
  if (it == mIndex.end()) return false;
  index = it->second;
  return true;
}

int SimParamTable::Write(std::size_t index, std::string_view text) {
  const SimParam& param = mParams[index];
  double number = 0.0;
  Dstring word;
  if (int rc = param.ParseValue(text, number, word); rc != 0) return rc;
  if (param.IsNumeric()) number = param.Resolve(number);
  if (param.IsNumeric() && !param.IsWithinLimits(number)) return kOutOfRange;
  Store(index, number, word);
  Propagate(index);
  RecomputeLimits();
  return 0;
}

int SimParamTable::Restore(std::size_t index, std::string_view text) {
  const SimParam& param = mParams[index];
  double number = 0.0;
  Dstring word;
  if (int rc = param.ParseValue(text, number, word); rc != 0) return rc;
  if (param.IsNumeric() && (number < param.GetLmax() || number > param.GetHmax())) return kOutOfRange;
  mParams[index].SetValue(number, word);
  return 0;
}

bool SimParamTable::FinishRestore(const std::set<std::size_t>& named, std::vector<std::size_t>& broken) {
  for (const SimCoupling& rule : mCouplings) {
    if (rule.Holds(mParams)) continue;
    const auto& members = rule.GetMembers();
    const auto first = std::find_if(members.begin(), members.end(), [&](std::size_t m) { return named.count(m) != 0; });
    const bool partly = std::any_of(members.begin(), members.end(), [&](std::size_t m) { return named.count(m) == 0; });
    if (first != members.end() && partly) rule.Propagate(mParams, *first);
    if (rule.Holds(mParams)) continue;
    broken = members;
    return false;
  }
  RecomputeLimits();
  mValueChanges.clear();
  mLimitChanges.clear();
  return true;
}

int SimParamTable::WriteAttr(std::size_t index, std::string_view text) {
  SimUnitAttr attr;
  if (int rc = SimUnitAttr::Parse(text, attr); rc != 0) return rc;
  if (attr.GetUnit() != mParams[index].GetAttr().GetUnit()) return kBadValue;
  mParams[index].SetAttr(attr);
  return 0;
}

bool SimParamTable::IsClashing(std::size_t index) const {
  const SimParam& p = mParams[index];
  return p.IsNumeric() && !p.IsWithinLimits(p.GetNumber());
}

std::vector<std::size_t> SimParamTable::TakeValueChanges() {
  return Take(mValueChanges);
}

std::vector<std::size_t> SimParamTable::TakeLimitChanges() {
  return Take(mLimitChanges);
}

unsigned long SimParamTable::Search(std::string_view pattern) const {
  Dstring upper = Dstring(pattern).ToUpper();
  std::size_t at = upper.find('@');
  if (at == Dstring::npos || upper.find('@', at + 1) != Dstring::npos) return 0;
  std::string_view prefix = std::string_view(upper).substr(0, at);
  std::string_view suffix = std::string_view(upper).substr(at + 1);
  unsigned long best = 0;
  for (const SimParam& p : mParams) {
    unsigned long n = NumberAt(p.GetHeader(), prefix, suffix);
    if (n != 0 && (best == 0 || n < best)) best = n;
  }
  return best;
}

std::vector<std::size_t> SimParamTable::WithPrefix(std::string_view prefix) const {
  Dstring upper = Dstring(prefix).ToUpper();
  std::vector<std::size_t> out;
  for (std::size_t i = 0; i < mParams.size(); ++i) {
    if (mParams[i].GetHeader().StartsWith(upper)) out.push_back(i);
  }
  return out;
}

void SimParamTable::Store(std::size_t index, double number, const Dstring& text) {
  if (mParams[index].HasValue(number, text)) return;
  mParams[index].SetValue(number, text);
  mValueChanges.insert(index);
}

void SimParamTable::Propagate(std::size_t written) {
  // Each rule fires at most once per write, so rules that share members cannot loop.
  std::vector<bool> fired(mCouplings.size(), false);
  std::vector<std::size_t> queue{written};
  for (std::size_t q = 0; q < queue.size(); ++q) {
    for (std::size_t r = 0; r < mCouplings.size(); ++r) {
      if (fired[r] || !mCouplings[r].Involves(queue[q])) continue;
      fired[r] = true;
      std::vector<double> before;
      for (std::size_t m : mCouplings[r].GetMembers()) before.push_back(mParams[m].GetNumber());
      mCouplings[r].Propagate(mParams, queue[q]);
      const auto& members = mCouplings[r].GetMembers();
      for (std::size_t i = 0; i < members.size(); ++i) {
        if (mParams[members[i]].GetNumber() == before[i]) continue;
        mValueChanges.insert(members[i]);
        queue.push_back(members[i]);
      }
    }
  }
}

void SimParamTable::RecomputeLimits() {
  std::vector<std::pair<double, double>> before;
  before.reserve(mParams.size());
  for (SimParam& p : mParams) {
    before.emplace_back(p.GetLlim(), p.GetHlim());
    p.SetLimits(p.GetLmax(), p.GetHmax());
  }
  for (const SimCoupling& rule : mCouplings) rule.NarrowLimits(mParams);
  for (std::size_t i = 0; i < mParams.size(); ++i) {
    if (before[i] != std::make_pair(mParams[i].GetLlim(), mParams[i].GetHlim())) mLimitChanges.insert(i);
  }
}
