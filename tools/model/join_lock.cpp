// Keeps other joins away.
#include "model/join_lock.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>

#include "base/failure.h"
#include "common/paths.h"
#include "model/library.h"
#include "model/marker.h"

namespace {

constexpr char kAdvice[] = "wait until that has ended, and try again";

// A directory, since it is no file that could be left half written, and nothing has to be removed.
Descriptor OpenLock() {
  if (::mkdir(kJoinLock, 0700) < 0 && errno != EEXIST) return Descriptor();
  return Descriptor(::open(kJoinLock, O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
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
  if (IsUnderWay(kJoinMarkerPath)) throw Failure(Exit::kBusy, "another program is joining a network", kAdvice);
  if (std::remove(kJoinMarkerPath) == 0 || errno == ENOENT) return;
  throw Failed("an old marker of a join cannot be removed", "look at " + std::string(kJoinMarkerPath));
}
