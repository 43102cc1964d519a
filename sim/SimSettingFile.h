#pragma once

#include <string_view>

#include "settings/SettingText.h"
#include "support/Dstring.h"

// A setting as qensim keeps it in its data directory, "<dir>/settings/<name>.qset": the setting
// text of docs/settings.md, the very text ":MMEM:SETT:DATA?" sends. A file of an older qensim
// ("qensim setting 1") holds values and profile only.
class SimSettingFile {
 public:
  // Letters, digits, "_", "-", "." and blanks, at most 64, not starting with "." or a blank.
  static bool IsSettingName(std::string_view name);
  static Dstring PathOf(const Dstring& dataDir, const Dstring& name);

  // 0, or the SCPI error: -256 no such file, -250 not readable, or not a whole setting text
  // (`problem` says where).
  static int Read(const Dstring& path, SettingText& out, SettingText::Problem& problem);
  // 0, or -250. The file is replaced whole (temporary file, flush, rename) or not at all.
  static int Write(const Dstring& path, const Dstring& text);
};
