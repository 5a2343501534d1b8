// What holds the resources of the platform and of libc, and the only place that releases them.
#ifndef MERO_LIB_HOLDERS_H
#define MERO_LIB_HOLDERS_H

#include <fcntl.h>

#include <cstdio>
#include <cstdlib>
#include <memory>
#include <utility>

#include "platform.h"
#include "shell_words.h"

// What texts hashes and lists are made room for at first.
inline constexpr int kSizeHint = 1024;

// A text hash. Setting values may move it, so that it is passed on by the address of its pointer.
class Hash {
 public:
  Hash() : pshHash_(PLIBCSzHashAlloc(kSizeHint)) {}
  Hash(const Hash&) = delete;
  Hash& operator=(const Hash&) = delete;
  ~Hash() {
    if (pshHash_ != nullptr) PLIBCSzHashFree(pshHash_);
  }

  explicit operator bool() const {
    return pshHash_ != nullptr;
  }
  PPLIBSZHASH get() const {
    return pshHash_;
  }
  PPLIBSZHASH* address() {
    return &pshHash_;
  }

 private:
  PPLIBSZHASH pshHash_;
};

// A text list; passed on like a hash.
class List {
 public:
  List() : pslList_(PLIBCSzListAlloc(kSizeHint)) {}
  List(const List&) = delete;
  List& operator=(const List&) = delete;
  ~List() {
    if (pslList_ != nullptr) PLIBCSzListFree(pslList_);
  }

  explicit operator bool() const {
    return pslList_ != nullptr;
  }
  PPLIBSZLIST get() const {
    return pslList_;
  }
  PPLIBSZLIST* address() {
    return &pslList_;
  }

 private:
  PPLIBSZLIST pslList_;
};

// A zero-filled record that a list is to take.
struct FreeRecord {
  void operator()(void* record) const {
    std::free(record);
  }
};
template <class Record>
using RecordHolder = std::unique_ptr<Record, FreeRecord>;

template <class Record>
RecordHolder<Record> NewRecord() {
  return RecordHolder<Record>(static_cast<Record*>(std::calloc(1, sizeof(Record))));
}

// The output of a command, to be read.
class Pipe {
 public:
  template <size_t kSize>
  explicit Pipe(const Command<kSize>& command) : pfPipe_(command.OpenPipe()) {
    // Commands that run while this one is read inherit nothing of it. It has no descriptor when it is no real pipe.
    if (pfPipe_ != nullptr && ::fileno(pfPipe_) >= 0) (void)::fcntl(::fileno(pfPipe_), F_SETFD, FD_CLOEXEC);
  }
  Pipe(const Pipe&) = delete;
  Pipe& operator=(const Pipe&) = delete;
  ~Pipe() {
    if (pfPipe_ != nullptr) ::pclose(pfPipe_);
  }

  explicit operator bool() const {
    return pfPipe_ != nullptr;
  }
  FILE* get() const {
    return pfPipe_;
  }

 private:
  FILE* pfPipe_;
};

#endif  // MERO_LIB_HOLDERS_H
