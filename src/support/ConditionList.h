#pragma once

#include <cstddef>
#include <vector>

#include "support/Condition.h"

// The accumulator of conditions handed, by reference and last, to every operation that can fail.
class ConditionList {
 public:
  void Add(const Condition& condition) { mConditions.push_back(condition); }
  void Add(long code, const Dstring& message) { mConditions.emplace_back(code, message); }
  void Append(const ConditionList& other);
  void Clear() { mConditions.clear(); }

  bool IsEmpty() const { return mConditions.empty(); }
  std::size_t Size() const { return mConditions.size(); }
  const Condition& operator[](std::size_t i) const { return mConditions[i]; }
  const Condition& Last() const { return mConditions.back(); }
  bool HasKey(const Dstring& key) const;

  auto begin() const { return mConditions.begin(); }
  auto end() const { return mConditions.end(); }

  // All conditions as "code: message" lines, for logs and consoles.
  Dstring ToText() const;

 private:
  std::vector<Condition> mConditions;
};
