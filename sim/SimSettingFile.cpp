#include "SimSettingFile.h"

#include <cerrno>
#include <cstdio>
#include <fcntl.h>
#include <filesystem>
#include <unistd.h>

namespace {

constexpr std::size_t kMaxNameLength = 64;
constexpr int kNotFound = -256;
constexpr int kStorageError = -250;

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

int SimSettingFile::Read(const Dstring& path, SettingText& out, SettingText::Problem& problem) {
  std::error_code error;
  if (!std::filesystem::exists(path.c_str(), error)) return kNotFound;
  Dstring text;
  if (!ReadWhole(path, text)) {
    problem = {0, "the file could not be read"};
    return kStorageError;
  }
  return SettingText::Read(text, SettingText::Kind::kSetting, out, problem) ? 0 : kStorageError;
}

int SimSettingFile::Write(const Dstring& path, const Dstring& text) {
  std::error_code error;
  std::filesystem::create_directories(std::filesystem::path(path.c_str()).parent_path(), error);
  const Dstring temporary = path + ".tmp";
  int fd = ::open(temporary.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0644);
  if (fd < 0) return kStorageError;
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
