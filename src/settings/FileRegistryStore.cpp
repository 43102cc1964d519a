#include "settings/FileRegistryStore.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <sys/file.h>
#include <unistd.h>

#include "support/LgsDebug.h"

namespace {

Dstring SystemReason(const char* what, const Dstring& path) {
  return Dstring::Format("%s %s: %s", what, path.c_str(), std::strerror(errno));
}

// A file descriptor that closes itself.
class Fd {
 public:
  explicit Fd(int fd) : mFd(fd) {}
  ~Fd() {
    if (mFd >= 0) ::close(mFd);
  }
  Fd(const Fd&) = delete;
  Fd& operator=(const Fd&) = delete;
  int Get() const { return mFd; }
  // Closes now, so that a failing close can be told.
  bool Close() {
    int fd = mFd;
    mFd = -1;
    return ::close(fd) == 0;
  }

 private:
  int mFd;
};

bool WriteAll(int fd, const Dstring& text) {
  for (std::size_t done = 0; done < text.size();) {
    ssize_t n = ::write(fd, text.data() + done, text.size() - done);
    if (n < 0 && errno == EINTR) continue;
    if (n <= 0) return false;
    done += static_cast<std::size_t>(n);
  }
  return true;
}

Dstring ReadAll(int fd, Dstring& text) {
  char buffer[8192];
  for (;;) {
    ssize_t n = ::read(fd, buffer, sizeof buffer);
    if (n < 0 && errno == EINTR) continue;
    if (n < 0) return std::strerror(errno);
    if (n == 0) return {};
    text.append(buffer, static_cast<std::size_t>(n));
  }
}

Dstring MakeDirectory(const Dstring& path) {
  std::error_code error;
  std::filesystem::create_directories(std::filesystem::path(path.c_str()).parent_path(), error);
  return error ? Dstring("cannot create the folder of " + path + ": " + error.message()) : Dstring();
}

}  // namespace

Dstring FileRegistryStore::DefaultPath() {
  const char* xdg = std::getenv("XDG_CONFIG_HOME");
  if (xdg != nullptr && *xdg != '\0') return Dstring(xdg) + "/qengui/registry";
  const char* home = std::getenv("HOME");
  return Dstring(home != nullptr ? home : ".") + "/.config/qengui/registry";
}

Dstring FileRegistryStore::Load(RegistryTree& tree) const {
  Fd fd(::open(mPath.c_str(), O_RDONLY | O_CLOEXEC));
  if (fd.Get() < 0) return errno == ENOENT ? Dstring() : SystemReason("cannot open", mPath);
  Dstring text;
  if (Dstring reason = ReadAll(fd.Get(), text); !reason.empty()) return "cannot read " + mPath + ": " + reason;
  Dstring problem;
  if (!RegistryTree::FromText(text, tree, problem)) return "the file " + mPath + " is damaged: " + problem;
  return {};
}

Dstring FileRegistryStore::Save(const RegistryTree& tree) const {
  LgsDebug trace("FileRegistryStore::Save ", "settings");
  const Dstring temporary = mPath + ".tmp";
  Fd fd(::open(temporary.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600));
  if (fd.Get() < 0) return SystemReason("cannot create", temporary);
  bool written = WriteAll(fd.Get(), tree.ToText()) && ::fsync(fd.Get()) == 0;
  if (!written || !fd.Close() || ::rename(temporary.c_str(), mPath.c_str()) != 0) {
    Dstring reason = SystemReason("cannot write", temporary);
    ::unlink(temporary.c_str());
    return reason;
  }
  // The rename itself reaches the disk only with its folder.
  const Dstring folder = std::filesystem::path(mPath.c_str()).parent_path().string();
  Fd dir(::open(folder.empty() ? "." : folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (dir.Get() >= 0) ::fsync(dir.Get());
  trace.Printf("%s\n", mPath.c_str());
  return {};
}

int FileRegistryStore::Inspect(const Dstring& key, const Dstring& name, const Look& look, ConditionList& list) const {
  RegistryTree tree;
  if (Dstring reason = Load(tree); !reason.empty()) return Fail(key, name, reason, list);
  if (const char* reason = look(tree)) return Fail(key, name, reason, list);
  return 0;
}

int FileRegistryStore::Modify(const Dstring& key, const Dstring& name, const Change& change, ConditionList& list) {
  if (Dstring reason = MakeDirectory(mPath); !reason.empty()) return Fail(key, name, reason, list);
  const Dstring lockPath = mPath + ".lock";
  Fd lock(::open(lockPath.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600));
  int locked = -1;
  while (lock.Get() >= 0 && (locked = ::flock(lock.Get(), LOCK_EX)) != 0 && errno == EINTR) {
  }
  if (locked != 0) return Fail(key, name, SystemReason("cannot lock", lockPath), list);
  RegistryTree tree;
  if (Dstring reason = Load(tree); !reason.empty()) return Fail(key, name, reason, list);
  if (const char* reason = change(tree)) return Fail(key, name, reason, list);
  if (Dstring reason = Save(tree); !reason.empty()) return Fail(key, name, reason, list);
  return 0;
}

int FileRegistryStore::Query(void* root, const Dstring& key, const Dstring& name, Dstring& data,
                             ConditionList& list) {
  return Inspect(key, name, [&](const RegistryTree& t) { return t.Query(root, key, name, data); }, list);
}

int FileRegistryStore::Set(void* root, const Dstring& key, const Dstring& name, const Dstring& data,
                           ConditionList& list) {
  return Modify(key, name, [&](RegistryTree& t) { return t.Set(root, key, name, data); }, list);
}

int FileRegistryStore::HasValue(void* root, const Dstring& key, const Dstring& name, bool& exists,
                                ConditionList& list) {
  return Inspect(key, name, [&](const RegistryTree& t) { return t.HasValue(root, key, name, exists); }, list);
}

int FileRegistryStore::HasKey(void* root, const Dstring& key, bool& exists, ConditionList& list) {
  return Inspect(key, "", [&](const RegistryTree& t) { return t.HasKey(root, key, exists); }, list);
}

int FileRegistryStore::DeleteValue(void* root, const Dstring& key, const Dstring& name, ConditionList& list) {
  return Modify(key, name, [&](RegistryTree& t) { return t.DeleteValue(root, key, name); }, list);
}

int FileRegistryStore::DeleteKey(void* root, const Dstring& key, ConditionList& list) {
  return Modify(key, "", [&](RegistryTree& t) { return t.DeleteKey(root, key); }, list);
}
