#pragma once

#include <string_view>
#include <utility>
#include <vector>

#include "SimParamTable.h"
#include "support/Dstring.h"

// A setting as qensim keeps it in its data directory, "<dir>/settings/<name>.qset": the value
// of every writable parameter and the setting profile (the sequence is not kept here). The
// text is the line "qensim setting 1", one line "value HEADER TEXT" per parameter, the line
// "profile EXPRESSION" and the line "end"; "%" and control characters in a text are written
// as "%XX". A file without its "end" line is refused as cut short.
class SimSettingFile {
 public:
  using Values = std::vector<std::pair<Dstring, Dstring>>;

  // Letters, digits, "_", "-", "." and blanks, at most 64, not starting with "." or a blank.
  static bool IsSettingName(std::string_view name);
  static Dstring PathOf(const Dstring& dataDir, const Dstring& name);

  // The setting as the instrument holds it now; doubles with every digit they need.
  static SimSettingFile Capture(const SimParamTable& params, const Dstring& profile);

  // 0, or the SCPI error: -256 no such file, -250 not readable or not a whole setting file.
  int Read(const Dstring& path);
  // 0, or -250. The file is replaced whole (temporary file, flush, rename) or not at all.
  int Write(const Dstring& path) const;

  Dstring ToText() const;
  static bool FromText(std::string_view text, SimSettingFile& out);

  // Headers (upper case) with their value texts, as written by a client.
  const Values& GetValues() const { return mValues; }
  const Dstring& GetProfile() const { return mProfile; }

 private:
  Values mValues;
  Dstring mProfile;
};
