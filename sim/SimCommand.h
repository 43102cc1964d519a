#pragma once

#include <cstddef>
#include <string_view>

#include "support/Dstring.h"
#include "support/DstringList.h"

// One command of a batch, cut into its parts: "HEADER VALUE" is a write, "HEADER?" a query,
// and "HEADER? WORD" a query with an argument (limit queries, the handle request).
class SimCommand {
 public:
  explicit SimCommand(std::string_view text);

  bool IsQuery() const { return mQuery; }
  bool HasArgs() const { return !mArgs.empty(); }
  const Dstring& GetArgs() const { return mArgs; }
  // The header's elements, upper case, without the leading ":" and the "?".
  const DstringList& GetPath() const { return mPath; }
  // The elements from `from` on, as ":A:B" (empty when there are none).
  Dstring PathFrom(std::size_t from) const;

 private:
  bool mQuery = false;
  Dstring mArgs;
  DstringList mPath;
};
