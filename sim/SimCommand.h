#pragma once

#include <cstddef>
#include <string_view>

#include "support/Dstring.h"
#include "support/DstringList.h"

// One command of a batch, cut into its parts: "HEADER VALUE" is a write, "HEADER?" a query,
// and "HEADER? WORD" a query with an argument (limit queries, the handle request). The
// arguments are a view into the text, which must outlive the command: a data block among
// them is never copied here.
class SimCommand {
 public:
  explicit SimCommand(std::string_view text);

  bool IsQuery() const { return mQuery; }
  bool HasArgs() const { return !mArgs.empty(); }
  std::string_view GetArgs() const { return mArgs; }
  // The header's elements, upper case, without the leading ":" and the "?".
  const DstringList& GetPath() const { return mPath; }
  // The elements from `from` on, as ":A:B" (empty when there are none).
  Dstring PathFrom(std::size_t from) const;
  // Arguments of plain values ending in a definite-length block ("0,0,63,7,#18<bytes>"):
  // `head` the values before the block without the comma, `bytes` the block's bytes, both
  // views into the arguments. False for any other shape.
  bool SplitTrailingBlock(std::string_view& head, std::string_view& bytes) const;

 private:
  bool mQuery = false;
  std::string_view mArgs;
  DstringList mPath;
};
