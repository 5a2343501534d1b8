// The holders of resources of the platform and of libc. Only they release resources.
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

// The room, in bytes, that hashes and lists have for texts at first.
inline constexpr int kSizeHint = 1024;

// A text hash. Setting a value may move it: pass the address of its pointer on, not the pointer.
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

// A zero-filled record, until it stands in a list.
struct FreeRecord {
  void operator()(void* record) const { std::free(record); }
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
  explicit Pipe(const Command<kSize>& command) : pfPipe_(command.OpenPipe()) {}
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
  // The readers of a file that is created, whatever the caller's umask. A file that exists keeps its mode.
  enum Readers : mode_t { kSecret = 0600, kForAll = 0644 };

  NewFile(const char* szPath, Readers readers) {
    constexpr int kFlags = O_WRONLY | O_CREAT | O_CLOEXEC;
    int fd = ::open(szPath, kFlags | O_EXCL, static_cast<mode_t>(readers));
    if (fd >= 0) (void)::fchmod(fd, readers);  // of an open file of our own
    if (fd < 0 && errno == EEXIST) fd = ::open(szPath, kFlags | O_TRUNC, readers);
    Take(fd);
  }

  // A new file with a name that nobody can foresee, for a directory into which anyone may put files. `szTemplate` ends
  // with "XXXXXX", which mkostemp() replaces. A file that cannot be written to is not left behind.
  static NewFile Unforeseen(char* szTemplate, Readers readers) {
    const int fd = ::mkostemp(szTemplate, O_CLOEXEC);
    if (fd >= 0) (void)::fchmod(fd, readers);
    return NewFile(fd, szTemplate);
  }
  NewFile(const NewFile&) = delete;
  NewFile& operator=(const NewFile&) = delete;
  ~NewFile() {
    if (pfFile_ != nullptr) (void)std::fclose(pfFile_);  // after a failure, when the file is given up half written
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

// The marker file of work that is under way. The end of every attempt removes it, even of an attempt that was refused
// because the marker was there.
class Marker {
 public:
  explicit Marker(const char* szPath) : szPath_(szPath) {}
  Marker(const Marker&) = delete;
  Marker& operator=(const Marker&) = delete;
  ~Marker() { (void)PLIBCSysUnlink(szPath_); }

  bool exists() const { return PLIBCFileExist(szPath_) != 0; }
  void Create() const { (void)PLIBCFileTouch(szPath_); }  // work goes on without a marker that cannot be made

 private:
  const char* szPath_;
};

#endif  // MERO_LIB_HOLDERS_H
