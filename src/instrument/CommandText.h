#pragma once

#include <string_view>

#include "support/ConditionList.h"

// Guards the command language against user text. User text is always an argument of a
// format, never the format, and text that would end a quoted argument or start another
// command is refused before anything is sent.
class CommandText {
 public:
  // 0 when `text` may stand inside a quoted argument; otherwise QenStatus::kBadCommand and
  // "GUI_COMMAND_BAD_TEXT" naming what was found (a double quote, ";", a line break, a
  // control character).
  static int CheckArgument(std::string_view text, ConditionList& list);
  // 0 when `text` may stand as a whole value after a header: quoted strings may hold ";",
  // but no line break or control character anywhere, no ";" outside quotes and no open quote.
  static int CheckValue(std::string_view text, ConditionList& list);
  // 0 when `text` may go out as one typed command line: ";" joins commands and a ";" inside
  // quotes is the user's business, but a line break or a control character is refused.
  static int CheckLine(std::string_view text, ConditionList& list);
  // Fills in the application handle where a command of the line starts with "::"
  // ("::TRIG:MODE?" becomes ":<handle>:TRIG:MODE?"), leaving quoted text alone.
  static Dstring ExpandHandle(const Dstring& line, const Dstring& handle);
};
