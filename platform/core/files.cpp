// Files as such: there or not, made, removed.
#include <fcntl.h>
#include <unistd.h>

#include <cstdio>

#include "platform/base/descriptor.h"
#include "platform/base/error.h"

int PLIBCFileExist(const char* szPath) {
  if (szPath == nullptr) return REFUSE_NULL(), 0;
  if (::access(szPath, F_OK) == 0) return 1;
  // What cannot be looked at may well be there: who takes it for missing would write over it.
  return errno == ENOENT || errno == ENOTDIR || errno == ELOOP || errno == ENAMETOOLONG ? 0 : 1;
}

int PLIBCFileTouch(const char* szPath) {
  if (szPath == nullptr) return REFUSE_NULL(), -1;
  if (PLIBCFileExist(szPath) != 0) return 0;
  Descriptor file(::open(szPath, O_WRONLY | O_CREAT | O_CLOEXEC | O_NONBLOCK, 0600));
  if (!file.valid()) return FAIL(errno, "create", szPath), -1;
  if (Status status = file.Close(); !status.ok()) return FAIL(status.error(), "create", szPath), -1;
  return 0;
}

int PLIBCSysUnlink(const char* szPath) {
  if (szPath == nullptr) return REFUSE_NULL(), -1;
  if (::unlink(szPath) < 0 && errno != ENOENT) return FAIL(errno, "remove", szPath), -1;
  return 0;
}

int PLIBCSysRemove(const char* szPath) {
  if (szPath == nullptr) return REFUSE_NULL(), -1;
  if (std::remove(szPath) < 0 && errno != ENOENT) return FAIL(errno, "remove", szPath), -1;
  return 0;
}
