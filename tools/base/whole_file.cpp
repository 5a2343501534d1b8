// Files that are read and written whole.
#include "base/whole_file.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>

#include "common/descriptor.h"

std::optional<std::string> TextOfFile(const std::string& path) {
  const Descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
  if (!file.valid()) return std::nullopt;
  std::string text;
  char bytes[4096];
  while (true) {
    const ssize_t size = ::read(file.get(), bytes, sizeof bytes);
    if (size < 0 && errno == EINTR) continue;
    if (size < 0) return std::nullopt;
    if (size == 0) return text;
    text.append(bytes, static_cast<std::size_t>(size));
  }
}
