// What a worker sends to the program.
#include "work/frames.h"

#include <unistd.h>

#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <cstring>

namespace {

struct Head {
  Frame::Kind kind;
  uint32_t size;
};

void WriteAll(int fd, std::string_view bytes) {
  while (!bytes.empty()) {
    const ssize_t written = ::write(fd, bytes.data(), bytes.size());
    if (written < 0 && errno == EINTR) continue;
    if (written < 0) ::_exit(EXIT_FAILURE);
    bytes.remove_prefix(static_cast<std::size_t>(written));
  }
}

}  // namespace

void SendFrame(int fd, Frame::Kind kind, std::string_view bytes) {
  const Head head{kind, static_cast<uint32_t>(bytes.size())};
  WriteAll(fd, {reinterpret_cast<const char*>(&head), sizeof head});
  WriteAll(fd, bytes);
}

bool Frames::Read(int fd) {
  char bytes[65536];
  const ssize_t size = ::read(fd, bytes, sizeof bytes);
  if (size < 0) return errno == EINTR || errno == EAGAIN;
  received_.append(bytes, static_cast<std::size_t>(size));
  return size > 0;
}

std::optional<Frame> Frames::Next() {
  Head head;
  if (received_.size() < sizeof head) return std::nullopt;
  std::memcpy(&head, received_.data(), sizeof head);
  if (received_.size() < sizeof head + head.size) return std::nullopt;
  Frame frame{head.kind, received_.substr(sizeof head, head.size)};
  received_.erase(0, sizeof head + head.size);
  return frame;
}
