// What the enumeration of known networks is compared with.
#ifndef MERO_BENCH_KEY_FILE_H
#define MERO_BENCH_KEY_FILE_H

#include <cstddef>

// Loads a settings file with GLib's GKeyFile, and sorts its groups by their ACCESS_TIME, the latest first. Gives how
// many there are.
size_t SortedGroupsOfKeyFile(const char* szPath);

#endif  // MERO_BENCH_KEY_FILE_H
