#include "support/ExportFile.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <fcntl.h>
#include <fstream>
#include <sys/stat.h>
#include <unistd.h>

#include "support/ConditionListLoader.h"

namespace {

int Failed(const Dstring& path, int error, ConditionList& list) {
  ConditionListLoader::ConditionToken(list, "GUI_EXPORT_FAILED",
                                      {path, Dstring(error != 0 ? std::strerror(error) : "write error")}, 1);
  return 1;
}

// The mode a new file gets from the user's umask, or the mode of the file it replaces.
mode_t ModeFor(const Dstring& path) {
  struct stat old {};
  if (::stat(path.c_str(), &old) == 0) return old.st_mode & 07777;
  const mode_t mask = ::umask(0);
  ::umask(mask);
  return 0666 & ~mask;
}

bool Sync(const Dstring& path) {
  const int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd < 0) return false;
  const bool ok = ::fsync(fd) == 0;
  return ::close(fd) == 0 && ok;
}

}  // namespace

int ExportFile::Write(const Dstring& path, const std::function<int(std::ostream&)>& write, ConditionList& list) {
  Dstring temporary = path + ".XXXXXX";
  errno = 0;
  const int fd = ::mkstemp(temporary.data());
  if (fd < 0) return Failed(path, errno, list);
  const bool made = ::fchmod(fd, ModeFor(path)) == 0;
  ::close(fd);
  std::ofstream file(temporary, std::ios::binary | std::ios::trunc);
  if (made && file) {
    if (int status = write(file)) {
      file.close();
      std::remove(temporary.c_str());
      return status;
    }
    file.close();
  }
  if (made && file && Sync(temporary) && ::rename(temporary.c_str(), path.c_str()) == 0) return 0;
  const int error = errno;
  std::remove(temporary.c_str());
  return Failed(path, error, list);
}

int ExportFile::WriteText(const Dstring& path, const Dstring& text, ConditionList& list) {
  return Write(path, [&text](std::ostream& out) {
    out.write(text.data(), static_cast<std::streamsize>(text.size()));
    return 0;
  }, list);
}
