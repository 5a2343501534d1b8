// Whether somebody has disconnected the appliance.
#include "model/left_alone.h"

#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <string>

#include "base/marker.h"
#include "common/paths.h"
#include "model/failed.h"

namespace {

// A directory, like the lock in which it is: nothing can be left half written.
std::string Note() {
  return std::string(kJoinLock) + "/left-alone";
}

}  // namespace

void LeaveAlone() {
  if (::mkdir(Note().c_str(), 0700) == 0 || errno == EEXIST) return;
  throw Failed("disconnected, but `autoconnect --keep` does not know that it is to stay so",
               "look at " + std::string(kJoinLock));
}

void LeaveAloneNoMore() {
  (void)::rmdir(Note().c_str());
}

// The record of a connection is made by each join, and goes with the connection that somebody ends.
bool IsLeftAlone() {
  return ::access(Note().c_str(), F_OK) == 0 && !AgeOfMarker(kConnectionRecordPath);
}
