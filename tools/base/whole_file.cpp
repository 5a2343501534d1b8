// Files that are read and written whole.
#include "base/whole_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "base/failure.h"
#include "common/descriptor.h"

// A file system that cannot flush directories says EINVAL; there is nothing more to do on it.
bool FlushDirectoryOf(const std::string& path) {
  const std::string directory = path.substr(0, path.rfind('/') + 1);
  const Descriptor file(::open(directory.empty() ? "." : directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  return file.valid() && (::fsync(file.get()) == 0 || errno == EINVAL);
}

bool WriteAll(int fd, std::string_view text) {
  while (!text.empty()) {
    const ssize_t size = ::write(fd, text.data(), text.size());
    if (size < 0 && errno == EINTR) continue;
    if (size < 0) return false;
    text.remove_prefix(static_cast<std::size_t>(size));
  }
  return true;
}

std::optional<std::string> TextOf(int fd, std::size_t most) {
  std::string text;
  char bytes[4096];
  while (text.size() <= most) {
    const ssize_t size = ::read(fd, bytes, sizeof bytes);
    if (size < 0 && errno == EINTR) continue;
    if (size < 0) return std::nullopt;
    if (size == 0) break;
    text.append(bytes, static_cast<std::size_t>(size));
  }
  return text;
}

std::optional<std::string> TextOfFile(const std::string& path) {
  const Descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
  if (!file.valid()) return std::nullopt;
  return TextOf(file.get(), std::string::npos - 1);
}

namespace {

// False when that fails; then errno tells why, and what there was is there still.
bool ReplaceFile(const std::string& path, std::string_view text, mode_t mode) {
  std::string beside = path + ".XXXXXX";
  const Descriptor file(::mkostemp(beside.data(), O_CLOEXEC));
  if (!file.valid()) return false;
  const bool written = WriteAll(file.get(), text) && ::fchmod(file.get(), mode) == 0 && ::fsync(file.get()) == 0;
  if (written && std::rename(beside.c_str(), path.c_str()) == 0) return FlushDirectoryOf(path);
  const int error = errno;
  ::unlink(beside.c_str());
  errno = error;
  return false;
}

}  // namespace

// Links are not followed: in a directory that others may write, they could lead anywhere.
void WriteForOwner(const std::string& path, const std::string& shown, std::string_view bytes) {
  struct stat there{};
  if (::lstat(path.c_str(), &there) == 0 && !S_ISREG(there.st_mode)) {
    throw Failure(Exit::kFailed, shown + " is no plain file, and was not replaced", "give a name of its own");
  }
  if (ReplaceFile(path, bytes, S_IRUSR | S_IWUSR)) return;
  throw Failure(Exit::kFailed, shown + " cannot be written: " + std::strerror(errno), "give another place");
}
