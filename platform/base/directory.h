// Making directories, and a holder that closes one that is read.
#ifndef MERO_PLATFORM_DIRECTORY_H
#define MERO_PLATFORM_DIRECTORY_H

#include <dirent.h>

#include <memory>

#include "platform/base/result.h"

struct CloseDirectory {
  void operator()(DIR* directory) const { ::closedir(directory); }
};
using Directory = std::unique_ptr<DIR, CloseDirectory>;

// Makes a directory of mode 0755, whatever the caller's umask is. One that is there already stays as it is.
Status MakeDirectory(const char* szPath);

#endif  // MERO_PLATFORM_DIRECTORY_H
