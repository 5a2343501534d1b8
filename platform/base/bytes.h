// A growing run of bytes: a file that was read, or the content that it is to get. What was read may hold secrets, so
// that the memory is wiped before it is freed.
#ifndef MERO_PLATFORM_BYTES_H
#define MERO_PLATFORM_BYTES_H

#include <cstddef>
#include <string_view>
#include <utility>

#include "platform/base/result.h"

class Bytes {
 public:
  Bytes() = default;
  Bytes(Bytes&& other) noexcept
      : data_(std::exchange(other.data_, nullptr)),
        size_(std::exchange(other.size_, 0)),
        capacity_(std::exchange(other.capacity_, 0)),
        error_(other.error_) {}
  Bytes& operator=(Bytes&& other) noexcept {
    std::swap(data_, other.data_);
    std::swap(size_, other.size_);
    std::swap(capacity_, other.capacity_);
    std::swap(error_, other.error_);
    return *this;
  }
  ~Bytes();

  std::string_view view() const { return {data_, size_}; }
  size_t capacity() const { return capacity_; }
  char* data() { return data_; }

  // Appends bytes, unless something has failed before. The first failure is remembered, so that a text is built in as
  // many steps as it takes, and status() is looked at once, at the end.
  void Append(std::string_view text);
  void Fail(int error);
  Status status() const { return Status::Failed(error_); }

  // False when memory ran out; what was there stays.
  [[nodiscard]] bool Reserve(size_t capacity);

  // Takes in `size` bytes that were written behind the end, within the capacity.
  void Grow(size_t size) { size_ += size; }

 private:
  char* data_ = nullptr;
  size_t size_ = 0;
  size_t capacity_ = 0;
  int error_ = 0;
};

#endif  // MERO_PLATFORM_BYTES_H
