// Changing a file.
#include "platform/base/file_edit.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>

#include "common/text.h"
#include "platform/base/file_read.h"
#include "platform/base/shared_directory.h"

namespace {

constexpr int kReading = O_RDONLY | O_CLOEXEC | O_NONBLOCK;

// The path of a file beside another one, by a format that takes the directory and the name of that one.
class Beside {
 public:
  Beside(const char* szFormat, const char* szPath) {
    const char* szName = std::strrchr(szPath, '/') + 1;
    const int size =
        std::snprintf(szBeside_, sizeof szBeside_, szFormat, static_cast<int>(szName - szPath), szPath, szName);
    fits_ = size >= 0 && static_cast<size_t>(size) < sizeof szBeside_;
  }

  bool fits() const { return fits_; }
  const char* c_str() const { return szBeside_; }

 private:
  char szBeside_[PATH_MAX];
  bool fits_;
};

// The new file, which takes the new content. Only the holder of the lock writes it, so that its name can be a fixed
// one, and what a killed writer has left of it is removed by the next.
constexpr char kNewFormat[] = "%.*s.%s.new";

// The lock file, which is locked instead of the file itself: who may read a file may lock it, and keep it locked.
constexpr char kLockFormat[] = "%.*s.%s.lock";

// How often a lock is asked for, and how long to wait in between: 20 s in all.
constexpr int kTries = 4000;
constexpr timespec kNap = {0, 5'000'000};

// Locks a file by asking again and again, since flock() itself would wait without end. Takes its tries off `tries`.
Status LockSoon(int fd, int& tries) {
  for (; tries > 0; --tries) {
    if (::flock(fd, LOCK_EX | LOCK_NB) == 0) return Status::Ok();
    if (errno != EWOULDBLOCK && errno != EINTR) return Status::Failed(errno);
    (void)::nanosleep(&kNap, nullptr);  // a signal only makes it shorter
  }
  return Status::Failed(kLockKept);
}

// Whether `path` still names the open file: while a lock was waited for, another may have been put in its place.
Result<bool> Names(const char* szPath, int fd) {
  struct stat named;
  struct stat open;
  if (::fstat(fd, &open) < 0) return Status::Failed(errno);
  if (::lstat(szPath, &named) < 0) return errno == ENOENT ? Result<bool>(false) : Status::Failed(errno);
  return named.st_dev == open.st_dev && named.st_ino == open.st_ino;
}

// Opens a lock file, or makes it. In a directory that anyone may write, what others have put in its place is removed.
Result<Descriptor> OpenLock(const char* szLock) {
  if (IsForeign(szLock)) {
    if (Status status = RemoveOrMoveAside(szLock); !status.ok()) return status;
  }
  Descriptor lock(::open(szLock, O_RDWR | O_CREAT | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC, 0600));
  if (!lock.valid()) return Status::Failed(errno);
  if (IsForeign(szLock)) return Status::Failed(kForeign);
  return lock;
}

Status WriteAll(int fd, std::string_view content) {
  while (!content.empty()) {
    const ssize_t put = ::write(fd, content.data(), content.size());
    if (put < 0 && errno == EINTR) continue;
    if (put < 0) return Status::Failed(errno);
    content.remove_prefix(static_cast<size_t>(put));
  }
  return Status::Ok();
}

// Gives the file `fd` the owner and the mode of the file `model`.
Status TakeOwnerAndMode(int fd, int model) {
  struct stat have;
  struct stat want;
  if (::fstat(fd, &have) < 0 || ::fstat(model, &want) < 0) return Status::Failed(errno);
  const bool sameOwner = have.st_uid == want.st_uid && have.st_gid == want.st_gid;
  if (!sameOwner && ::fchown(fd, want.st_uid, want.st_gid) < 0) return Status::Failed(errno);
  return Status::Of(::fchmod(fd, want.st_mode & 07777));
}

Status WriteBeside(const char* szBeside, const Revision& revision, int model) {
  Descriptor file(::open(szBeside, O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0600));
  if (!file.valid()) return Status::Failed(errno);
  if (Status status = TakeOwnerAndMode(file.get(), model); !status.ok()) return status;
  for (const std::string_view part : {revision.before, revision.content.view(), revision.behind}) {
    if (Status status = WriteAll(file.get(), part); !status.ok()) return status;
  }
  if (::fsync(file.get()) < 0) return Status::Failed(errno);
  return Status::Of(file.Close());
}

// Flushes the directory of a path, so that a rename in it outlasts a power cut.
Status FlushDirectory(const char* szPath) {
  char szDirectory[PATH_MAX];
  const char* szName = std::strrchr(szPath, '/') + 1;
  std::snprintf(szDirectory, sizeof szDirectory, "%.*s", static_cast<int>(szName - szPath), szPath);
  const Descriptor directory(::open(szDirectory, O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (!directory.valid()) return Status::Failed(errno);
  // A file system that cannot flush directories says EINVAL; there is nothing more to do on it.
  return ::fsync(directory.get()) < 0 && errno != EINVAL ? Status::Failed(errno) : Status::Ok();
}

// Where a path really leads to, whether or not there is a file. In a directory that anyone may write no link is
// followed, not even one that is put there now.
Status Resolve(const char* szPath, char (&szReal)[PATH_MAX]) {
  if (!IsShared(szPath)) return ::realpath(szPath, szReal) != nullptr ? Status::Ok() : Status::Failed(errno);
  char szDirectory[PATH_MAX] = ".";
  const char* szSlash = std::strrchr(szPath, '/');
  if (szSlash != nullptr) CopyText(szDirectory, {szPath, static_cast<size_t>(szSlash - szPath) + 1});
  if (::realpath(szDirectory, szReal) == nullptr) return Status::Failed(errno);
  const size_t size = std::strlen(szReal);
  std::snprintf(szReal + size, sizeof szReal - size, "/%s", szSlash != nullptr ? szSlash + 1 : szPath);
  return Status::Of(::faccessat(AT_FDCWD, szReal, F_OK, AT_SYMLINK_NOFOLLOW));
}

// Makes a file that is missing. When the path is a link to a missing file, makes that one.
Status Make(const char* szPath, mode_t mode) {
  const Descriptor file(::open(szPath, kReading | O_CREAT | O_EXCL, mode));
  if (file.valid()) return Status::Of(::fchmod(file.get(), mode));  // whatever the umask
  if (errno != EEXIST) return Status::Failed(errno);
  if (IsShared(szPath)) return Status::Ok();
  const Descriptor target(::open(szPath, kReading | O_CREAT, mode));
  return target.valid() ? Status::Ok() : Status::Failed(errno);
}

}  // namespace

// Holds the lock of the file once this succeeds.
Status FileEdit::Lock(int& tries) {
  const Beside path(kLockFormat, szPath_);
  if (!path.fits()) return Status::Failed(ENAMETOOLONG);
  while (true) {
    Result<Descriptor> lock = OpenLock(path.c_str());
    if (!lock.ok()) return lock.status();
    if (Status status = LockSoon(lock->get(), tries); !status.ok()) return status;
    // The last holder has removed the lock file, and another process may have made and locked the next one.
    Result<bool> current = Names(path.c_str(), lock->get());
    if (!current.ok()) return current.status();
    if (!*current) continue;
    lock_ = std::move(*lock);
    return Status::Ok();
  }
}

Status FileEdit::Read() {
  Result<Descriptor> file = OpenOurs(szPath_, kReading);
  if (!file.ok()) return file.status();
  file_ = std::move(*file);
  Result<Bytes> text = ReadWhole(file_.get());
  if (text.ok()) text_ = std::move(*text);
  return text.status();
}

Result<FileEdit> FileEdit::Open(const char* szPath, mode_t mode) {
  bool created = false;
  for (int tries = kTries;;) {
    FileEdit edit;
    const Status found = Resolve(szPath, edit.szPath_);
    if (!found.ok() && (found.error() != ENOENT || mode == 0)) return found;
    if (!found.ok()) {
      if (Status status = Make(szPath, mode); !status.ok()) return status;
      created = true;
      continue;
    }
    edit.created_ = created;
    if (Status status = edit.Lock(tries); !status.ok()) return status;
    const Status status = edit.Read();
    if (status.ok()) return edit;
    if (status.error() != ENOENT) return status;  // else another process has removed it meanwhile
  }
}

FileEdit::~FileEdit() {
  // While the lock is held: a process that waits for it will notice. A lock file that stays is used by the next edit.
  if (lock_.valid()) (void)::unlink(Beside(kLockFormat, szPath_).c_str());
}

void FileEdit::Abandon() {
  // While the lock is held, so that nobody is writing the file; a process that waits for the lock will notice. A file
  // that cannot be removed stays, empty.
  if (created_ && text_.view().empty()) (void)::unlink(szPath_);
}

Status FileEdit::Commit(const Revision& revision) {
  if (Status status = revision.content.status(); !status.ok()) return status;
  const Beside beside(kNewFormat, szPath_);
  if (!beside.fits()) return Status::Failed(ENAMETOOLONG);
  if (Status status = RemoveOrMoveAside(beside.c_str()); !status.ok() && status.error() != ENOENT) return status;
  if (revision.Keeps(text())) return ::fsync(file_.get()) < 0 ? Status::Failed(errno) : FlushDirectory(szPath_);

  Status status = WriteBeside(beside.c_str(), revision, file_.get());
  if (status.ok()) status = Status::Of(::rename(beside.c_str(), szPath_));
  if (!status.ok()) {
    (void)::unlink(beside.c_str());  // may never have come into being
    return status;
  }
  return FlushDirectory(szPath_);
}

Status EditFile(const char* szPath, mode_t mode, Composer compose) {
  Result<FileEdit> edit = FileEdit::Open(szPath, mode);
  if (!edit.ok()) return edit.status();
  Revision revision;
  compose(edit->text(), revision);
  const Status status = edit->Commit(revision);
  if (!status.ok()) edit->Abandon();
  return status;
}
