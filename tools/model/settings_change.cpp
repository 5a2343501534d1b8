// Several changes of a settings file as one.
#include "model/settings_change.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <thread>

#include "base/whole_file.h"
#include "common/paths.h"
#include "model/library.h"

namespace {

std::string Beside(const std::string& path, const char* szSuffix) {
  const auto name = path.rfind('/') + 1;
  return path.substr(0, name) + "." + path.substr(name) + szSuffix;
}

std::string RealPath(const std::string& path) {
  std::error_code error;
  const auto real = std::filesystem::weakly_canonical(path, error);
  return error ? path : real.string();
}

Failure NotChanged(const std::string& path) {
  return Failed(path + " could not be changed: " + std::strerror(errno), "is there room on the disk?");
}

// Whether a path still names an open file: while its lock was waited for, the holder has removed it.
bool Names(const std::string& path, int fd) {
  struct stat named{};
  struct stat open{};
  return ::lstat(path.c_str(), &named) == 0 && ::fstat(fd, &open) == 0 && named.st_ino == open.st_ino &&
         named.st_dev == open.st_dev;
}

Descriptor Locked(const std::string& lockPath, const std::string& path) {
  constexpr std::chrono::milliseconds kNap{5};
  for (int tries = 1000; tries > 0; --tries) {
    Descriptor lock(::open(lockPath.c_str(), O_RDWR | O_CREAT | O_NOFOLLOW | O_CLOEXEC, 0600));
    if (!lock.valid()) throw NotChanged(path);
    if (::flock(lock.get(), LOCK_EX | LOCK_NB) == 0) {
      if (Names(lockPath, lock.get())) return lock;
    } else if (errno != EWOULDBLOCK && errno != EINTR) {
      throw NotChanged(path);
    }
    std::this_thread::sleep_for(kNap);
  }
  throw Failure(Exit::kBusy, path + " is being changed by another program", "try again in a moment");
}

}  // namespace

SettingsChange::SettingsChange(const std::string& path)
    : path_(RealPath(path)),
      copy_(Beside(path_, ".edit")),
      lockPath_(Beside(path_, ".lock")),
      lock_(Locked(lockPath_, path_)) {
  try {
    Copy();
  } catch (...) {
    ::unlink(copy_.c_str());
    ::unlink(lockPath_.c_str());
    throw;
  }
}

SettingsChange::~SettingsChange() {
  ::unlink(copy_.c_str());
  ::unlink(lockPath_.c_str());  // before it is let go, so that nobody holds one that has no name
}

void SettingsChange::Copy() const {
  ::unlink(copy_.c_str());  // that of a program that was killed
  const Descriptor copy(::open(copy_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0600));
  if (!copy.valid()) throw NotChanged(path_);
  const Descriptor file(::open(path_.c_str(), O_RDONLY | O_CLOEXEC));
  if (!file.valid()) {
    if (errno == ENOENT) return;
    throw NotChanged(path_);
  }
  struct stat model{};
  if (::fstat(file.get(), &model) < 0 || ::fchown(copy.get(), model.st_uid, model.st_gid) < 0 ||
      ::fchmod(copy.get(), model.st_mode & ALLPERMS) < 0) {
    throw NotChanged(path_);
  }
  char bytes[16384];
  for (ssize_t size; (size = ::read(file.get(), bytes, sizeof bytes)) != 0;) {
    if (size < 0 || !WriteAll(copy.get(), {bytes, static_cast<std::size_t>(size)})) throw NotChanged(path_);
  }
}

void SettingsChange::Set(const std::string& section, const char* szKey, const std::string& value) const {
  if (PLIBCFileSetSectionValue(copy(), section.c_str(), szKey, value.c_str(), kSectionLineFormat) >= 0) return;
  throw Failed(path_ + " could not be changed, and is as it was", "is there room on the disk? -v shows more");
}

void SettingsChange::Write(std::string_view text, mode_t mode) const {
  const Descriptor copy(::open(copy_.c_str(), O_WRONLY | O_TRUNC | O_NOFOLLOW | O_CLOEXEC));
  if (!copy.valid() || !WriteAll(copy.get(), text) || ::fchmod(copy.get(), mode) < 0) throw NotChanged(path_);
}

// What the platform has written is flushed already, and a copy in which nothing was changed is not.
void SettingsChange::Commit() {
  const Descriptor copy(::open(copy_.c_str(), O_RDONLY | O_CLOEXEC));
  if (!copy.valid() || ::fsync(copy.get()) < 0) throw NotChanged(path_);
  if (std::rename(copy_.c_str(), path_.c_str()) < 0) throw NotChanged(path_);
  if (FlushDirectoryOf(path_)) return;
  throw MayBeLost(Exit::kFailed,
                  path_ + " is changed, but may be the old one again after a power cut: " + std::strerror(errno),
                  "does the disk fail?");
}

bool ReplaceSettings(const std::string& path, std::string_view text, mode_t mode) try {
  SettingsChange change(path);
  change.Write(text, mode);
  change.Commit();
  return true;
} catch (const Failure&) {
  return false;
}

bool RemoveSettings(const char* szPath) {
  if (PLIBCSysUnlink(szPath) != 0) return false;
  return FlushDirectoryOf(szPath) || errno == ENOENT;  // there is no directory either
}
