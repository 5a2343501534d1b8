// A file descriptor that is closed in one place.
#ifndef MERO_PLATFORM_DESCRIPTOR_H
#define MERO_PLATFORM_DESCRIPTOR_H

#include <unistd.h>

#include <utility>

#include "platform/base/result.h"

class Descriptor {
 public:
  explicit Descriptor(int fd = -1) : fd_(fd) {}
  Descriptor(Descriptor&& other) noexcept : fd_(std::exchange(other.fd_, -1)) {}
  Descriptor& operator=(Descriptor&& other) noexcept {
    std::swap(fd_, other.fd_);
    return *this;
  }
  ~Descriptor() {
    if (fd_ >= 0) ::close(fd_);
  }

  bool valid() const { return fd_ >= 0; }
  int get() const { return fd_; }

  // For a file that was written, where a failed close is a failed write.
  Status Close() { return Status::Of(::close(std::exchange(fd_, -1))); }

 private:
  int fd_;
};

#endif  // MERO_PLATFORM_DESCRIPTOR_H
