// Keeps other joins away.
#include "model/join_lock.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <string>
#include <thread>

#include "base/failure.h"
#include "base/marker.h"
#include "common/paths.h"
#include "model/library.h"
#include "platform.h"

namespace {

constexpr char kAdvice[] = "wait until that has ended, and try again";

// Locked by the keeper as long as it has the lock, or tries to get it; and by commands that wait for it to give way.
constexpr char kKeeper[] = "/keeper";
constexpr char kInTheWay[] = "/in-the-way";

// A directory, since it is no file that could be left half written, and nothing has to be removed.
Descriptor OpenLock(const std::string& name = "") {
  const std::string path = kJoinLock + name;
  if (::mkdir(path.c_str(), 0700) < 0 && errno != EEXIST) return Descriptor();
  return Descriptor(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
}

// Without waiting for those that have it.
bool Take(const Descriptor& lock) {
  return ::flock(lock.get(), LOCK_EX | LOCK_NB) == 0;
}

// Whoever only asks has it for a moment, too.
bool IsTaken(const char* szName) {
  const Descriptor lock = OpenLock(szName);
  return lock.valid() && ::flock(lock.get(), LOCK_SH | LOCK_NB) < 0;
}

// An attempt that is taken back ends its processes, which may take some seconds; one that is not may have to wait for
// an address first.
bool TakeFromKeeper(const Descriptor& lock, JoinLockFor who) {
  constexpr std::chrono::milliseconds kPause{100};
  constexpr int kPatience = 600;  // pauses
  const Descriptor inTheWay = OpenLock(kInTheWay);
  if (who == JoinLockFor::kCommand) (void)::flock(inTheWay.get(), LOCK_EX);
  for (int pauses = 0; pauses < kPatience && IsTaken(kKeeper); ++pauses) {
    std::this_thread::sleep_for(kPause);
    if (Take(lock)) return true;
  }
  return Take(lock);
}

// Whether the marker tells of a join that is under way. One that was cut off, as by a power cut, leaves its marker
// behind; a join does not last long, so an old marker tells of nothing.
bool IsUnderWay() {
  constexpr std::chrono::seconds kLongest{120};
  const auto age = AgeOfMarker(kJoinMarkerPath);
  return age && *age >= std::chrono::seconds(0) && *age < kLongest;
}

}  // namespace

JoinLock::JoinLock(JoinLockFor who) : held_(OpenLock()) {
  if (held_.get() < 0) {
    throw Failed("other joins cannot be kept away", "look at " + std::string(kJoinLock));
  }
  if (who == JoinLockFor::kKeeper) {
    keeper_ = OpenLock(kKeeper);
    (void)::flock(keeper_.get(), LOCK_EX);
  }
  if (Take(held_) || (who != JoinLockFor::kKeeper && TakeFromKeeper(held_, who))) return;
  throw Failure(Exit::kBusy, "another command is at work with the adapter", kAdvice);
}

bool IsKeeperInTheWay() {
  return IsTaken(kInTheWay);
}

void RequireNoOtherJoin() {
  if (IsUnderWay()) throw Failure(Exit::kBusy, "another program is joining a network", kAdvice);
  if (PLIBCSysUnlink(kJoinMarkerPath) == 0) return;
  throw Failed("an old marker of a join cannot be removed", "look at " + std::string(kJoinMarkerPath));
}
