// What the measurements have in common.
#ifndef MERO_BENCH_SUPPORT_H
#define MERO_BENCH_SUPPORT_H

#include <fcntl.h>
#include <search.h>
#include <sys/mount.h>
#include <unistd.h>

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>

#include "private_machine.h"
#include "wireless.h"

// Ends the program with the reason in errno, unless something has been done.
inline void Require(bool done, const char* szWhat) {
  if (done) return;
  std::perror(szWhat);
  std::exit(EXIT_FAILURE);
}

// Releases a ring of such records, and tells how many there were.
template <class Record>
int64_t CountAndFree(WIRELESS_LIST& head) {
  int64_t count = 0;
  for (; head.q_forw != &head; ++count) {
    WIRELESS_LIST* node = head.q_forw;
    ::remque(node);
    std::free(reinterpret_cast<char*>(node) - offsetof(Record, list));
  }
  return count;
}

// The whole of a file.
inline std::string ContentOf(const char* szPath) {
  std::ifstream file(szPath, std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(file), {});
}

// Puts a file in the place of another one, as little as can be done for one of the two to be there whole after a crash;
// with its directory flushed, for the new one to be there.
inline void Replace(const char* szPath, const std::string& content, bool flushDirectory = true) {
  const std::filesystem::path directory = std::filesystem::path(szPath).parent_path();
  const std::string beside = directory / "beside";
  const int file = ::open(beside.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600);
  Require(::write(file, content.data(), content.size()) == static_cast<ssize_t>(content.size()), "write");
  Require(::fsync(file) == 0 && ::close(file) == 0, "flush");
  Require(::rename(beside.c_str(), szPath) == 0, "rename");
  if (!flushDirectory) return;
  const int in = ::open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  Require(::fsync(in) == 0 && ::close(in) == 0, "flush the directory");
}

// Runs `measure` on a private machine whose settings lie on the file system of the current directory, so that a save is
// measured on the disk that holds it.
template <class Measure>
void MeasureOnDisk(Measure measure) {
  // A relative path, which leads there also where the private machine has its own /tmp or /var.
  char szStore[] = "store-XXXXXX";
  Require(::mkdtemp(szStore) != nullptr, "make a directory for the store");
  EnterPrivateMachine();
  Require(::mount(szStore, "/usr/mero/etc", nullptr, MS_BIND, nullptr) == 0, "mount the store");
  measure();
  Require(::umount("/usr/mero/etc") == 0, "unmount the store");
  std::filesystem::remove_all(szStore);
}

#endif  // MERO_BENCH_SUPPORT_H
