// A file descriptor that is closed in one place.
#ifndef MERO_COMMON_DESCRIPTOR_H
#define MERO_COMMON_DESCRIPTOR_H

#include <unistd.h>

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

  bool valid() const { return fd_ >= 0; }
  int get() const { return fd_; }

  // Closes it before its time. Of a file that was written, a failed close is a failed write: -1, and errno says why.
  int Close() { return fd_ < 0 ? 0 : ::close(std::exchange(fd_, -1)); }

 private:
  int fd_;
};

#endif  // MERO_COMMON_DESCRIPTOR_H
