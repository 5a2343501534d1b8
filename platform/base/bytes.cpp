// A growing run of bytes.
#include "platform/base/bytes.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>

Bytes::~Bytes() {
  if (data_ != nullptr) ::explicit_bzero(data_, size_);
  std::free(data_);
}

bool Bytes::Reserve(size_t capacity) {
  if (capacity <= capacity_) return true;
  void* data = std::realloc(data_, capacity);
  if (data == nullptr) return false;
  data_ = static_cast<char*>(data);
  capacity_ = capacity;
  return true;
}

void Bytes::Append(std::string_view text) {
  if (text.empty() || error_ != 0) return;
  const size_t size = size_ + text.size();
  if (size > capacity_ && !Reserve(std::max(size, 2 * capacity_))) return Fail(ENOMEM);
  std::memcpy(data_ + size_, text.data(), text.size());
  size_ = size;
}

void Bytes::Fail(int error) {
  if (error_ == 0) error_ = error;
}
