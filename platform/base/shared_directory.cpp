// Files in directories that anyone may write.
#include "platform/base/shared_directory.h"

#include <fcntl.h>
#include <linux/fs.h>
#include <sys/random.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <climits>
#include <cstdio>
#include <cstring>

#include "common/text.h"

namespace {

// A file of ours with a second name is not taken for ours: somebody else may have given it that name.
bool IsOurs(const struct stat& info) {
  return (info.st_uid == 0 || info.st_uid == ::geteuid()) && S_ISREG(info.st_mode) && info.st_nlink == 1;
}

// renameat2() is a function of its own in some libcs only.
bool RenameToNew(const char* szFrom, const char* szTo) {
  return ::syscall(SYS_renameat2, AT_FDCWD, szFrom, AT_FDCWD, szTo, RENAME_NOREPLACE) == 0;
}

Status MoveAside(const char* szPath) {
  constexpr int kTries = 8;
  for (int i = 0; i < kTries; ++i) {
    unsigned number = 0;
    if (::getrandom(&number, sizeof number, 0) < 0) return Status::Failed(errno);
    char szAside[PATH_MAX];
    const int size = std::snprintf(szAside, sizeof szAside, "%s.foreign-%08x", szPath, number);
    if (size >= PATH_MAX) return Status::Failed(ENAMETOOLONG);
    if (RenameToNew(szPath, szAside)) return Status::Ok();
    if (errno != EEXIST) break;
  }
  return Status::Failed(errno);
}

}  // namespace

bool IsShared(const char* szPath) {
  char szDirectory[PATH_MAX] = ".";
  const char* szSlash = std::strrchr(szPath, '/');
  if (szSlash != nullptr) CopyText(szDirectory, {szPath, static_cast<size_t>(szSlash - szPath) + 1});
  struct stat info;
  return ::stat(szDirectory, &info) < 0 || (info.st_mode & S_IWOTH) != 0;  // not trusted when it cannot be examined
}

Result<Descriptor> OpenOurs(const char* szPath, int flags) {
  const bool shared = IsShared(szPath);
  Descriptor file(::open(szPath, shared ? flags | O_NOFOLLOW : flags));
  if (!file.valid()) return Status::Failed(shared && errno == ELOOP ? kForeign : errno);
  struct stat info;
  if (!shared) return file;
  if (::fstat(file.get(), &info) < 0) return Status::Failed(errno);
  if (!IsOurs(info)) return Status::Failed(kForeign);
  return file;
}

bool IsForeign(const char* szPath) {
  struct stat info;
  if (!IsShared(szPath)) return false;
  if (::lstat(szPath, &info) == 0) return !IsOurs(info);
  return errno != ENOENT && errno != ENOTDIR;  // root may look at all files but those that others have mounted
}

Status RemoveOrMoveAside(const char* szPath) {
  if (::unlink(szPath) == 0) return Status::Ok();
  const int error = errno;
  return error == EISDIR && IsForeign(szPath) ? MoveAside(szPath) : Status::Failed(error);
}
