// Files that tell by being there.
#include "base/marker.h"

#include <sys/stat.h>

#include <ctime>

namespace {

std::chrono::nanoseconds Duration(const timespec& time) {
  return std::chrono::seconds(time.tv_sec) + std::chrono::nanoseconds(time.tv_nsec);
}

}  // namespace

std::optional<std::chrono::nanoseconds> AgeOfMarker(const std::string& path) {
  struct stat marker{};
  if (::lstat(path.c_str(), &marker) < 0 || !S_ISREG(marker.st_mode) || marker.st_uid != 0) return std::nullopt;
  timespec now{};
  ::clock_gettime(CLOCK_REALTIME, &now);
  return Duration(now) - Duration(marker.st_mtim);
}
