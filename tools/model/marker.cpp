// The marker files of the library: each exists while it joins a network, or sets an access point up.
#include "model/marker.h"

#include <sys/stat.h>

#include <ctime>

bool IsUnderWay(const char* szMarker) {
  constexpr std::time_t kLongest = 120;  // seconds
  struct stat marker {};
  if (::lstat(szMarker, &marker) < 0 || !S_ISREG(marker.st_mode) || marker.st_uid != 0) return false;
  const std::time_t age = std::time(nullptr) - marker.st_mtime;
  return age >= 0 && age < kLongest;
}
