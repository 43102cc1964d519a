#pragma once

#include <initializer_list>
#include <string_view>

#include "support/ConditionList.h"
#include "support/Dstring.h"

// Reads the replies of the segment commands. A reply is never trusted: each reader checks the
// shape and the range and says false when they are wrong, leaving its outputs alone.
class SegmentReply {
 public:
  // The whole reply as a decimal integer within [min, max].
  static bool Number(const Dstring& reply, long min, long max, long& out);
  // The first element of the reply parsed as a list, when it is a string or a word.
  static bool FirstText(const Dstring& reply, Dstring& out);
  // The text of the first element, whatever the item's type: a number keeps its text as
  // written, so an unquoted coding 01 is "01", and a quoted "" is the empty text. False when
  // there is no such item.
  static bool FirstItemText(const Dstring& reply, Dstring& out);
  // The first element of the reply parsed as a list, when it is an integer within [min, max].
  static bool FirstNumber(const Dstring& reply, long min, long max, long& out);
  // The first two elements as integers: a trace and a vector, each -1 or more.
  static bool Position(const Dstring& reply, long& trace, long& vector);
  // "TRUE" or "FALSE".
  static bool Truth(const Dstring& reply, bool& out);

  // Adds the catalogue condition and returns `code`.
  static int Refuse(ConditionList& list, std::string_view key, std::initializer_list<Dstring> args, int code);
  // A reply as it may appear in a message: at most 40 characters, unprintable bytes as '.'.
  static Dstring Shown(std::string_view reply);
};
