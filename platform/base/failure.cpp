// The error codes of errnos.
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

// The reason of an error; that of an errno as libc has it.
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

}  // namespace

int CodeOfError(int error) {
  for (const CodeOfErrno& row : kCodes) {
    if (row.error == error) return row.code;
  }
  return ERR_UNKNOWN;
}

void ReportFailure(SourcePlace place, int error, const char* szVerb, const char* szSubject) {
  PLIBCErrSet(CodeOfError(error));
  LOG_AS(place.szUnit, place.line, "Failed to %s %s: %s", szVerb, szSubject, ReasonOf(error));
}

void ReportNull(SourcePlace place) {
  PLIBCErrSet(ERR_BAD_PARAMETERS);
  LOG_AS(place.szUnit, place.line, "Bad parameters");
}
