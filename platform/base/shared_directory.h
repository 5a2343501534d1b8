// Files in directories that anyone may write, such as /tmp: what others have put there is neither followed, nor read,
// nor written to, nor taken for ours.
#ifndef MERO_PLATFORM_SHARED_DIRECTORY_H
#define MERO_PLATFORM_SHARED_DIRECTORY_H

#include "common/descriptor.h"
#include "platform/base/result.h"

// The file is somebody else's. An error of our own: no errno says so.
inline constexpr int kForeign = -1;

// Whether anyone may put files into the directory of a path.
bool IsShared(const char* szPath);

// Opens a file that exists. In a directory that anyone may write, kForeign unless the file is a plain one with one name
// that belongs to root or to this process; elsewhere links are followed.
Result<Descriptor> OpenOurs(const char* szPath, int flags);

// Whether a path names something of somebody else's in a directory that anyone may write.
bool IsForeign(const char* szPath);

// Removes a file, as unlink() does; but a directory that somebody else has put in its place, in a directory that anyone
// may write, is moved aside, to PATH.foreign-NUMBER.
Status RemoveOrMoveAside(const char* szPath);

#endif  // MERO_PLATFORM_SHARED_DIRECTORY_H
