// Keeps other joins away.
#include "model/join_lock.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <ctime>

#include "base/failure.h"
#include "common/paths.h"
#include "model/library.h"

namespace {

constexpr char kAdvice[] = "wait until that has ended, and try again";

// A directory, since it is no file that could be left half written, and nothing has to be removed.
Descriptor OpenLock() {
  if (::mkdir(kJoinLock, 0700) < 0 && errno != EEXIST) return Descriptor();
  return Descriptor(::open(kJoinLock, O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
}

// Whether the marker tells of a join that is under way. One that was cut off, as by a power cut, leaves its marker
// behind; a join does not last long, so an old marker tells of nothing. Nor does one that is not root's, since anyone
// may make files where it stands.
bool IsUnderWay() {
  constexpr std::time_t kLongest = 120;  // seconds
  struct stat marker {};
  if (::lstat(kJoinMarkerPath, &marker) < 0 || !S_ISREG(marker.st_mode) || marker.st_uid != 0) return false;
  const std::time_t age = std::time(nullptr) - marker.st_mtime;
  return age >= 0 && age < kLongest;
}

}  // namespace

JoinLock::JoinLock() : held_(OpenLock()) {
  if (held_.get() < 0) {
    throw Failed("other joins cannot be kept away", "look at " + std::string(kJoinLock));
  }
  if (::flock(held_.get(), LOCK_EX | LOCK_NB) == 0) return;
  throw Failure(Exit::kBusy, "another command is joining or leaving a network", kAdvice);
}

void RequireNoOtherJoin() {
  if (IsUnderWay()) throw Failure(Exit::kBusy, "another program is joining a network", kAdvice);
  if (std::remove(kJoinMarkerPath) == 0 || errno == ENOENT) return;
  throw Failed("an old marker of a join cannot be removed", "look at " + std::string(kJoinMarkerPath));
}
