// Arbitrary text as a setting or sequence text: a file a user imports, or a reply of
// ":MMEM:SETT:DATA?".
//  - A text that is refused is refused with a line of the text and a reason.
//  - A text that is read is written in a form that reads back, and writes the same again.
#include <cstddef>
#include <cstdint>
#include <string_view>

#include "settings/SettingText.h"

namespace {

void Check(bool ok) {
  if (!ok) __builtin_trap();
}

std::size_t Lines(std::string_view text) {
  std::size_t n = 1;
  for (char c : text) n += c == '\n';
  return n;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  for (SettingText::Kind kind : {SettingText::Kind::kSetting, SettingText::Kind::kSequence}) {
    SettingText read(kind);
    SettingText::Problem problem;
    if (!SettingText::Read(text, kind, read, problem)) {
      Check(problem.line >= 1 && static_cast<std::size_t>(problem.line) <= Lines(text) + 1 && !problem.what.empty());
      continue;
    }
    if (read.IsLegacy()) continue;
    const Dstring written = read.Write();
    SettingText again(kind);
    Check(SettingText::Read(written, kind, again, problem));
    Check(again.Write() == written);
  }
  return 0;
}
