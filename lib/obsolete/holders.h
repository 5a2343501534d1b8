// What holds the resources of the platform and of libc, and the only place that releases them.
#ifndef MERO_LIB_HOLDERS_H
#define MERO_LIB_HOLDERS_H

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
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

  explicit operator bool() const { return pshHash_ != nullptr; }
  PPLIBSZHASH get() const { return pshHash_; }
  PPLIBSZHASH* address() { return &pshHash_; }

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

  explicit operator bool() const { return pslList_ != nullptr; }
  PPLIBSZLIST get() const { return pslList_; }
  PPLIBSZLIST* address() { return &pslList_; }

 private:
  PPLIBSZLIST pslList_;
};

// A zero-filled record that a list is to take.
struct FreeRecord {
  void operator()(void* record) const { std::free(record); }
};
template <class Record>
using RecordHolder = std::unique_ptr<Record, FreeRecord>;

template <class Record>
RecordHolder<Record> NewRecord() {
  return RecordHolder<Record>(static_cast<Record*>(std::calloc(1, sizeof(Record))));
}

// Keeps a stream from the commands that are run while it is open. One without a descriptor has nothing to keep.
inline void CloseOnExec(FILE* pfStream) {
  if (pfStream != nullptr && ::fileno(pfStream) >= 0) (void)::fcntl(::fileno(pfStream), F_SETFD, FD_CLOEXEC);
}

// The output of a command, to be read.
class Pipe {
 public:
  template <size_t kSize>
  explicit Pipe(const Command<kSize>& command) : pfPipe_(command.OpenPipe()) {
    CloseOnExec(pfPipe_);
  }
  Pipe(const Pipe&) = delete;
  Pipe& operator=(const Pipe&) = delete;
  ~Pipe() {
    if (pfPipe_ != nullptr) ::pclose(pfPipe_);
  }

  explicit operator bool() const { return pfPipe_ != nullptr; }
  FILE* get() const { return pfPipe_; }

 private:
  FILE* pfPipe_;
};

// A file that is written from its beginning.
class NewFile {
 public:
  // Who may read a file that is created, whatever the caller's umask; one that exists keeps its mode.
  enum Readers : mode_t { kSecret = 0600, kForAll = 0644 };

  NewFile(const char* szPath, Readers readers) {
    constexpr int kFlags = O_WRONLY | O_CREAT | O_CLOEXEC;
    int fd = ::open(szPath, kFlags | O_EXCL, static_cast<mode_t>(readers));
    if (fd >= 0) (void)::fchmod(fd, readers);  // of an open file of our own
    if (fd < 0 && errno == EEXIST) fd = ::open(szPath, kFlags | O_TRUNC, readers);
    Take(fd);
  }

  // One of a name that nobody can foresee, for a directory into which anyone may put files: `szTemplate` ends with
  // "XXXXXX", which it gives way to. Where it cannot be written to, it is not left behind.
  static NewFile Unforeseen(char* szTemplate, Readers readers) {
    const int fd = ::mkostemp(szTemplate, O_CLOEXEC);
    if (fd >= 0) (void)::fchmod(fd, readers);
    return NewFile(fd, szTemplate);
  }
  NewFile(const NewFile&) = delete;
  NewFile& operator=(const NewFile&) = delete;
  ~NewFile() {
    if (pfFile_ != nullptr) (void)std::fclose(pfFile_);  // given up half written, after a failure
  }

  explicit operator bool() const { return pfFile_ != nullptr; }
  FILE* get() const { return pfFile_; }

  // Whether all that was written has reached the file. Nothing may be written afterwards.
  [[nodiscard]] bool Close() {
    const bool written = std::ferror(pfFile_) == 0;
    return std::fclose(std::exchange(pfFile_, nullptr)) == 0 && written;
  }

 private:
  NewFile(int fd, const char* szPath) {
    Take(fd);
    if (fd >= 0 && pfFile_ == nullptr) (void)::unlink(szPath);
  }

  void Take(int fd) {
    if (fd < 0) return;
    pfFile_ = ::fdopen(fd, "w");
    if (pfFile_ == nullptr) ::close(fd);
  }

  FILE* pfFile_ = nullptr;
};

// The marker file of work that is under way. Gone at the end of every attempt, also of one that is refused because it
// was there.
class Marker {
 public:
  explicit Marker(const char* szPath) : szPath_(szPath) {}
  Marker(const Marker&) = delete;
  Marker& operator=(const Marker&) = delete;
  ~Marker() { (void)PLIBCSysUnlink(szPath_); }

  bool exists() const { return PLIBCFileExist(szPath_) != 0; }
  void Create() const { (void)PLIBCFileTouch(szPath_); }  // a guard that cannot be put up does not keep from the work

 private:
  const char* szPath_;
};

#endif  // MERO_LIB_HOLDERS_H
