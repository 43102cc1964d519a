#pragma once

#include <string_view>
#include <vector>

#include "support/ConditionList.h"
#include "support/DataParcel.h"
#include "support/LispList.h"

// The one parser of reply and expression text.
//
// Grammar: a text is a comma-separated sequence of elements; an element is a parenthesised
// list of elements, a double- or single-quoted string (a doubled quote stands for one quote
// character), an IEEE 488.2 definite-length block "#<n><length><bytes>", or a bare token
// (up to the next ',', '(' or ')'), surrounding blanks ignored. A bare token that reads
// whole as a number is a number: a suffix i, u, f or d makes it signed, unsigned, float or
// double; without a suffix an integer is Signed (Unsigned when it only fits that, Double when
// it fits neither) and any other number is Double. A number that does not fit its type, such
// as "1e400", "1e-400", "9223372036854775808i" or "-1u", is a failure. Every other token is a
// bare word ("INF", "1.5i"); a quote inside one is a failure. Nothing between two commas
// is an empty word, and "()" an empty list. A text that is exactly one parenthesised list
// parses to that list's elements, so "(1,2)" and "1,2" give the same result; an empty or
// blank text gives an empty list.
//
// Blocks are not copied per item: every block refers into one shared copy of the text.
// Lists nest at most 256 deep, counting the outer list. Every failure adds a condition naming
// the byte offset (from 0) and returns a nonzero status, leaving `out` unchanged.
class ParserExpression {
 public:
  // Is shown each element of the text's outer list, and of the lists nested in it down to
  // Depth(), as soon as the element is complete (its own elements first). An element it takes
  // is left out of the tree, so a long list is read without ever standing whole.
  class Sink {
   public:
    virtual ~Sink() = default;
    virtual std::size_t Depth() const = 0;
    // `depth` is 1 inside the outer parentheses; `index` counts the list's elements so far,
    // taken ones included. True takes the element; the sink may move it away.
    virtual bool Take(std::size_t depth, std::size_t index, LispList& element) = 0;
  };

  static int Parse(std::string_view text, LispList& out, ConditionList& list);
  // As above, showing the elements to `sink` as they are read.
  static int Parse(std::string_view text, LispList& out, ConditionList& list, Sink& sink);
  // The top-level elements as a flat parcel; a nested list is refused.
  static int Parse(std::string_view text, DataParcel& out, ConditionList& list);
  // The text's elements as they stand, never unwrapped: "(1,2)" is one element, a list, where
  // Parse gives two; for replies that are a list of lists of which there may be one.
  static int ParseElements(std::string_view text, LispList& out, ConditionList& list);

  // Splits the replies of several queries (or several commands) joined by ";" into their
  // parts, leaving ";" inside quoted strings and blocks alone. The parts refer into `text`;
  // empty parts are kept, so an empty text is one empty part. A '#' that starts a token
  // always starts a block.
  static int SplitJoined(std::string_view text, std::vector<std::string_view>& parts,
                         ConditionList& list);
};
