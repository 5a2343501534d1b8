// Whether a file exists; making one, and removing one.
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdio>

#include "common/descriptor.h"
#include "platform/base/failure.h"
#include "platform/base/shared_directory.h"

namespace {

// In a directory that anyone may write, what others have put in the file's place is removed, and a link that they put
// there meanwhile is not followed.
Status Create(const char* szPath) {
  if (IsForeign(szPath)) {
    if (Status status = RemoveOrMoveAside(szPath); !status.ok()) return status;
  }
  constexpr int kFlags = O_WRONLY | O_CREAT | O_CLOEXEC | O_NONBLOCK;
  const Descriptor file(::open(szPath, kFlags | O_EXCL, 0600));
  if (file.valid()) return Status::Of(::fchmod(file.get(), 0600));  // whatever the umask
  if (errno != EEXIST) return Status::Failed(errno);
  if (IsShared(szPath)) return IsForeign(szPath) ? Status::Failed(kForeign) : Status::Ok();
  const Descriptor target(::open(szPath, kFlags, 0600));  // the missing target of a link
  return target.valid() ? Status::Ok() : Status::Failed(errno);
}

enum class Looked { kThere, kMissing, kUnknown };

Looked Look(const char* szPath) {
  if (IsForeign(szPath)) {
    return LOG("%s is taken for missing: somebody else has put it there", szPath), Looked::kMissing;
  }
  if (::access(szPath, F_OK) == 0) return Looked::kThere;
  const bool missing = errno == ENOENT || errno == ENOTDIR || errno == ELOOP || errno == ENAMETOOLONG;
  return missing ? Looked::kMissing : Looked::kUnknown;
}

}  // namespace

// A file that cannot be looked at may exist. A caller that took it for missing would write over it.
int PLIBCFileExist(const char* szPath) {
  if (szPath == nullptr) return REFUSE_NULL(), 0;
  return Look(szPath) != Looked::kMissing ? 1 : 0;
}

// Nor is a file that cannot be looked at taken to be there: making it tells.
int PLIBCFileTouch(const char* szPath) {
  if (szPath == nullptr) return REFUSE_NULL(), -1;
  if (Look(szPath) == Looked::kThere) return 0;
  if (const Status status = Create(szPath); !status.ok()) {
    return FAIL(status.error(), "Failed to create %s", szPath), -1;
  }
  return 0;
}

int PLIBCSysUnlink(const char* szPath) {
  if (szPath == nullptr) return REFUSE_NULL(), -1;
  const Status status = RemoveOrMoveAside(szPath);
  if (!status.ok() && status.error() != ENOENT) return FAIL(status.error(), "Failed to remove %s", szPath), -1;
  return 0;
}

int PLIBCSysRemove(const char* szPath) {
  if (szPath == nullptr) return REFUSE_NULL(), -1;
  if (std::remove(szPath) < 0 && errno != ENOENT) return FAIL(errno, "Failed to remove %s", szPath), -1;
  return 0;
}
