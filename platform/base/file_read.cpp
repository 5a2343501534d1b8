// Reading whole files.
#include "platform/base/file_read.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "platform/base/shared_directory.h"

namespace {

constexpr size_t kLargestFile = size_t{64} << 20;

}  // namespace

Result<Bytes> ReadWhole(int fd) {
  struct stat info;
  if (::fstat(fd, &info) < 0) return Status::Failed(errno);
  if (!S_ISREG(info.st_mode)) return Status::Failed(EINVAL);

  Bytes content;
  // One byte more than the size, so that the end is found without a second round of growing.
  size_t room = static_cast<size_t>(info.st_size) + 1;
  while (true) {
    const size_t size = content.view().size();
    if (size + room > kLargestFile) return Status::Failed(EFBIG);
    if (!content.Reserve(size + room)) return Status::Failed(ENOMEM);

    const ssize_t got = ::read(fd, content.data() + size, content.capacity() - size);
    if (got < 0 && errno == EINTR) continue;
    if (got < 0) return Status::Failed(errno);
    if (got == 0) return content;
    content.Grow(static_cast<size_t>(got));
    room = content.capacity() - content.view().size();
    if (room == 0) room = content.capacity();
  }
}

Result<Bytes> ReadFile(const char* szPath) {
  // Without O_NONBLOCK, a pipe in the place of a file would block until somebody writes to it.
  Result<Descriptor> file = OpenOurs(szPath, O_RDONLY | O_CLOEXEC | O_NONBLOCK);
  if (!file.ok()) return file.status();
  return ReadWhole(file->get());
}
