// The holder of a descriptor, which closes it.
#ifndef MERO_TOOLS_DESCRIPTOR_H
#define MERO_TOOLS_DESCRIPTOR_H

#include <unistd.h>

#include <cerrno>
#include <system_error>
#include <utility>

class Descriptor {
 public:
  explicit Descriptor(int fd = -1) : fd_(fd) {}
  Descriptor(Descriptor&& other) noexcept : fd_(std::exchange(other.fd_, -1)) {}
  Descriptor& operator=(Descriptor&& other) noexcept {
    std::swap(fd_, other.fd_);
    return *this;
  }
  ~Descriptor() { Close(); }

  explicit operator bool() const { return fd_ >= 0; }
  int get() const { return fd_; }

  void Close() {
    if (fd_ >= 0) ::close(fd_);
    fd_ = -1;
  }

 private:
  int fd_;
};

// The result of a system call that is not expected to fail; throws when it does.
inline int Require(int result, const char* szWhat) {
  if (result < 0) throw std::system_error(errno, std::generic_category(), szWhat);
  return result;
}

#endif  // MERO_TOOLS_DESCRIPTOR_H
