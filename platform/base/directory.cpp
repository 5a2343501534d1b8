// Making directories.
#include "platform/base/directory.h"

#include <sys/stat.h>

Status MakeDirectory(const char* szPath) {
  constexpr mode_t kMode = 0755;
  if (::mkdir(szPath, kMode) < 0) return errno == EEXIST ? Status::Ok() : Status::Failed(errno);
  return Status::Of(::chmod(szPath, kMode));
}
