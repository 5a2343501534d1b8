// Results of the helpers under the platform's operations: an error is a value that nobody can ignore.
#ifndef MERO_PLATFORM_RESULT_H
#define MERO_PLATFORM_RESULT_H

#include <cerrno>
#include <utility>

// Success, or the errno of a failure.
class [[nodiscard]] Status {
 public:
  static constexpr Status Ok() { return Status(0); }
  static constexpr Status Failed(int error) { return Status(error); }
  // For a call that has just returned `result`, negative on failure, and set errno then.
  static Status Of(long result) { return Status(result < 0 ? errno : 0); }

  constexpr bool ok() const { return error_ == 0; }
  constexpr int error() const { return error_; }

 private:
  explicit constexpr Status(int error) : error_(error) {}

  int error_;
};

// A T, or the errno of why there is none.
template <class T>
class [[nodiscard]] Result {
 public:
  Result(T value) : value_(std::move(value)), error_(0) {}  // NOLINT(google-explicit-constructor)
  Result(Status failure) : error_(failure.error()) {}       // NOLINT(google-explicit-constructor)

  bool ok() const { return error_ == 0; }
  Status status() const { return Status::Failed(error_); }
  int error() const { return error_; }
  T& operator*() { return value_; }
  T* operator->() { return &value_; }

 private:
  T value_{};
  int error_;
};

#endif  // MERO_PLATFORM_RESULT_H
