// A directory that is read, closed in one place.
#ifndef MERO_PLATFORM_DIRECTORY_H
#define MERO_PLATFORM_DIRECTORY_H

#include <dirent.h>

#include <memory>

struct CloseDirectory {
  void operator()(DIR* directory) const { ::closedir(directory); }
};
using Directory = std::unique_ptr<DIR, CloseDirectory>;

#endif  // MERO_PLATFORM_DIRECTORY_H
