#include "support/ExportFile.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <fstream>

#include "support/ConditionListLoader.h"

int ExportFile::Write(const Dstring& path, const std::function<int(std::ostream&)>& write, ConditionList& list) {
  errno = 0;
  std::ofstream file(path, std::ios::binary | std::ios::trunc);
  if (file) {
    // A file left half-written would pass for a whole one.
    if (int status = write(file)) {
      file.close();
      std::remove(path.c_str());
      return status;
    }
    file.flush();
  }
  if (file) return 0;
  const int error = errno;
  ConditionListLoader::ConditionToken(list, "GUI_EXPORT_FAILED",
                                      {path, Dstring(error != 0 ? std::strerror(error) : "write error")}, 1);
  return 1;
}

int ExportFile::WriteText(const Dstring& path, const Dstring& text, ConditionList& list) {
  return Write(path, [&text](std::ostream& out) {
    out.write(text.data(), static_cast<std::streamsize>(text.size()));
    return 0;
  }, list);
}
