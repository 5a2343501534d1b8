// Reading whole files.
#ifndef MERO_PLATFORM_FILE_READ_H
#define MERO_PLATFORM_FILE_READ_H

#include "platform/base/bytes.h"
#include "platform/base/result.h"

// The content of an open regular file; EFBIG when it is larger than any file of settings has reason to be.
Result<Bytes> ReadWhole(int fd);

// The content of a file; ENOENT when there is none, kForeign when it is somebody else's in a directory that anyone may
// write.
Result<Bytes> ReadFile(const char* szPath);

#endif  // MERO_PLATFORM_FILE_READ_H
