#include "SimSettingFile.h"

#include <cerrno>
#include <charconv>
#include <cstdio>
#include <fcntl.h>
#include <filesystem>
#include <unistd.h>

#include "support/DstringList.h"

namespace {

constexpr std::string_view kHeader = "qensim setting 1";
constexpr std::size_t kMaxNameLength = 64;
constexpr int kNotFound = -256;
constexpr int kStorageError = -250;

bool IsControl(char c) { return static_cast<unsigned char>(c) < 0x20 || c == 0x7f; }

Dstring Escape(std::string_view text) {
  Dstring out;
  for (char c : text) {
    if (IsControl(c) || c == '%') {
      out.AppendPrintf("%%%02X", static_cast<unsigned char>(c));
    } else {
      out += c;
    }
  }
  return out;
}

bool Unescape(std::string_view text, Dstring& out) {
  out.clear();
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] != '%') {
      out += text[i];
      continue;
    }
    unsigned value = 0;
    const char* digits = text.data() + i + 1;
    if (i + 2 >= text.size() || std::from_chars(digits, digits + 2, value, 16).ptr != digits + 2) return false;
    out += static_cast<char>(value);
    i += 2;
  }
  return true;
}

bool ReadWhole(const Dstring& path, Dstring& text) {
  std::FILE* f = std::fopen(path.c_str(), "rb");
  if (f == nullptr) return false;
  char buffer[8192];
  for (std::size_t n; (n = std::fread(buffer, 1, sizeof buffer, f)) > 0;) text.append(buffer, n);
  bool ok = std::ferror(f) == 0;
  std::fclose(f);
  return ok;
}

}  // namespace

bool SimSettingFile::IsSettingName(std::string_view name) {
  if (name.empty() || name.size() > kMaxNameLength || name[0] == '.' || name[0] == ' ') return false;
  for (char c : name) {
    bool plain = (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9');
    if (!plain && Dstring("_-. ").find(c) == Dstring::npos) return false;
  }
  return true;
}

Dstring SimSettingFile::PathOf(const Dstring& dataDir, const Dstring& name) {
  return dataDir + "/settings/" + name + ".qset";
}

SimSettingFile SimSettingFile::Capture(const SimParamTable& params, const Dstring& profile) {
  SimSettingFile file;
  for (std::size_t i = 0; i < params.Size(); ++i) {
    const SimParam& param = params.At(i);
    if (param.IsReadOnly()) continue;
    bool exact = param.GetType() == SimParamType::Double;
    file.mValues.emplace_back(param.GetHeader(), exact ? Dstring::Format("%.17g", param.GetNumber()) : param.FormatValue());
  }
  file.mProfile = profile;
  return file;
}

Dstring SimSettingFile::ToText() const {
  Dstring out(kHeader);
  out += '\n';
  for (const auto& [header, text] : mValues) out += "value " + header + " " + Escape(text) + "\n";
  out += "profile " + Escape(mProfile) + "\nend\n";
  return out;
}

bool SimSettingFile::FromText(std::string_view text, SimSettingFile& out) {
  DstringList lines = DstringList::Split(text, '\n');
  if (lines.size() < 4 || lines[0] != kHeader || lines.back() != "" || lines[lines.size() - 2] != "end") return false;
  SimSettingFile file;
  for (std::size_t i = 1; i + 3 < lines.size(); ++i) {
    const Dstring& line = lines[i];
    std::size_t blank = line.find(' ', 6);
    Dstring value;
    if (!line.StartsWith("value :") || blank == Dstring::npos || !Unescape(line.substr(blank + 1), value)) return false;
    file.mValues.emplace_back(Dstring(line.substr(6, blank - 6)).ToUpper(), value);
  }
  const Dstring& profile = lines[lines.size() - 3];
  if (!profile.StartsWith("profile ") || !Unescape(profile.substr(8), file.mProfile)) return false;
  out = std::move(file);
  return true;
}

int SimSettingFile::Read(const Dstring& path) {
  std::error_code error;
  if (!std::filesystem::exists(path.c_str(), error)) return kNotFound;
  Dstring text;
  return ReadWhole(path, text) && FromText(text, *this) ? 0 : kStorageError;
}

int SimSettingFile::Write(const Dstring& path) const {
  std::error_code error;
  std::filesystem::create_directories(std::filesystem::path(path.c_str()).parent_path(), error);
  const Dstring temporary = path + ".tmp";
  int fd = ::open(temporary.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644);
  if (fd < 0) return kStorageError;
  const Dstring text = ToText();
  std::size_t done = 0;
  for (ssize_t n = 0; done < text.size(); done += static_cast<std::size_t>(n)) {
    n = ::write(fd, text.data() + done, text.size() - done);
    if (n < 0 && errno == EINTR) n = 0;
    if (n < 0) break;
  }
  bool ok = done == text.size() && ::fsync(fd) == 0;
  ok = ::close(fd) == 0 && ok && ::rename(temporary.c_str(), path.c_str()) == 0;
  if (!ok) ::unlink(temporary.c_str());
  return ok ? 0 : kStorageError;
}
