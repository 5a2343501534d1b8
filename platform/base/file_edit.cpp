// Changing a file.
#include "platform/base/file_edit.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "platform/base/file_read.h"

namespace {

Status Lock(int fd) {
  while (::flock(fd, LOCK_EX) < 0) {
    if (errno != EINTR) return Status::Failed(errno);
  }
  return Status::Ok();
}

// Whether `path` still names the open file: while the lock was waited for, another may have been put in its place.
Result<bool> Names(const char* szPath, int fd) {
  struct stat named;
  struct stat open;
  if (::fstat(fd, &open) < 0) return Status::Failed(errno);
  if (::stat(szPath, &named) < 0) return errno == ENOENT ? Result<bool>(false) : Status::Failed(errno);
  return named.st_dev == open.st_dev && named.st_ino == open.st_ino;
}

// The file beside `path` that takes the new content. Only the holder of the lock writes it, so that the name can be
// fixed, and what a writer left that was killed is not left for long.
Status PathBeside(const char* szPath, char (&szBeside)[PATH_MAX]) {
  const char* szName = std::strrchr(szPath, '/') + 1;
  const int size =
      std::snprintf(szBeside, sizeof szBeside, "%.*s.%s.new", static_cast<int>(szName - szPath), szPath, szName);
  return size < PATH_MAX ? Status::Ok() : Status::Failed(ENAMETOOLONG);
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

Status WriteBeside(const char* szBeside, std::string_view content, int model) {
  Descriptor file(::open(szBeside, O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, 0600));
  if (!file.valid()) return Status::Failed(errno);
  if (Status status = TakeOwnerAndMode(file.get(), model); !status.ok()) return status;
  if (Status status = WriteAll(file.get(), content); !status.ok()) return status;
  if (::fsync(file.get()) < 0) return Status::Failed(errno);
  return file.Close();
}

// Makes a rename in the directory of `path` last.
Status FlushDirectory(const char* szPath) {
  char szDirectory[PATH_MAX];
  const char* szName = std::strrchr(szPath, '/') + 1;
  std::snprintf(szDirectory, sizeof szDirectory, "%.*s", static_cast<int>(szName - szPath), szPath);
  const Descriptor directory(::open(szDirectory, O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (!directory.valid()) return Status::Failed(errno);
  // A file system that cannot flush directories says EINVAL; there is nothing more to do on it.
  return ::fsync(directory.get()) < 0 && errno != EINVAL ? Status::Failed(errno) : Status::Ok();
}

}  // namespace

Result<FileEdit> FileEdit::Open(const char* szPath, mode_t mode) {
  constexpr int kFlags = O_RDONLY | O_CLOEXEC | O_NONBLOCK;
  FileEdit edit;
  while (true) {
    edit.created_ = false;
    edit.lock_ = Descriptor(::open(szPath, kFlags));
    if (!edit.lock_.valid() && errno == ENOENT && mode != 0) {
      edit.created_ = true;
      edit.lock_ = Descriptor(::open(szPath, kFlags | O_CREAT, mode));
    }
    if (!edit.lock_.valid()) return Status::Failed(errno);
    if (Status status = Lock(edit.lock_.get()); !status.ok()) return status;
    if (::realpath(szPath, edit.szPath_) == nullptr) {
      if (errno == ENOENT) continue;
      return Status::Failed(errno);
    }
    Result<bool> current = Names(edit.szPath_, edit.lock_.get());
    if (!current.ok()) return current.status();
    if (*current) break;
  }

  Result<Bytes> text = ReadWhole(edit.lock_.get());
  if (!text.ok()) return text.status();
  edit.text_ = std::move(*text);
  return edit;
}

void FileEdit::Abandon() {
  // Under the lock, so that nobody is writing it; who waits for the lock will notice.
  if (created_ && text_.view().empty()) (void)::unlink(szPath_);  // it is as good as never made
}

Status FileEdit::Commit(std::string_view content) {
  char szBeside[PATH_MAX];
  if (Status status = PathBeside(szPath_, szBeside); !status.ok()) return status;
  if (::unlink(szBeside) < 0 && errno != ENOENT) return Status::Failed(errno);

  Status status = WriteBeside(szBeside, content, lock_.get());
  if (status.ok()) status = Status::Of(::rename(szBeside, szPath_));
  if (!status.ok()) {
    (void)::unlink(szBeside);  // may never have come into being
    return status;
  }
  return FlushDirectory(szPath_);
}

Status EditFile(const char* szPath, mode_t mode, Composer compose) {
  Result<FileEdit> edit = FileEdit::Open(szPath, mode);
  if (!edit.ok()) return edit.status();
  Bytes content;
  Status status = compose(edit->text(), content);
  if (status.ok()) status = edit->Commit(content.view());
  if (!status.ok()) edit->Abandon();
  return status;
}
