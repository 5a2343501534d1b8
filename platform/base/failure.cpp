// The error codes and the reasons of failures.
#include "platform/base/failure.h"

#include <cstring>

#include "platform/base/file_edit.h"
#include "platform/base/shared_directory.h"

namespace {

struct CodeOfErrno {
  int error;
  MERO_ERROR code;
};

constexpr CodeOfErrno kCodes[] = {
    {ENOMEM, ERR_OUT_OF_MEMORY},   {EINVAL, ERR_BAD_PARAMETERS},
    {EACCES, ERR_PERMISSION},      {EPERM, ERR_PERMISSION},
    {EROFS, ERR_PERMISSION},       {ENOSPC, ERR_NO_SPACE},
    {EDQUOT, ERR_NO_SPACE},        {EIO, ERR_IO},
    {ENOENT, ERR_FILE_NOT_FOUND},  {ENOTDIR, ERR_FILE_NOT_FOUND},
    {EFBIG, ERR_TOO_LARGE},        {ERANGE, ERR_TOO_LARGE},
    {ENAMETOOLONG, ERR_TOO_LARGE}, {ENODEV, ERR_NO_DEVICE},
    {ENXIO, ERR_NO_DEVICE},        {ENOEXEC, ERR_COMMAND_FAILED},
    {kForeign, ERR_PERMISSION},
};

// The reason of an error as a text; of an errno, libc's.
const char* ReasonOf(int error) {
  switch (error) {
    case kForeign:
      return "it is somebody else's, in a directory that anyone may write";
    case kLockKept:
      return "another process keeps its lock";
    default:
      return std::strerror(error);
  }
}

int CodeOf(int error) {
  for (const CodeOfErrno& row : kCodes) {
    if (row.error == error) return row.code;
  }
  return ERR_UNKNOWN;
}

}  // namespace

const char* NoteFailure(int error) {
  PLIBCErrSet(CodeOf(error));
  return ReasonOf(error);
}

void RefuseNull(const char* szUnit, int line) {
  PLIBCErrSet(ERR_BAD_PARAMETERS);
  LOG_AS(szUnit, line, "Bad parameters");
}
