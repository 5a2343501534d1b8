// What settings are compared with: GLib's GKeyFile. A unit of its own, since GLib has other ideas of TRUE and FALSE.
#ifndef MERO_BENCH_KEY_FILE_H
#define MERO_BENCH_KEY_FILE_H

#include <cstddef>

// Loads a settings file with GLib's GKeyFile, and sorts its groups by their ACCESS_TIME, the latest first. Gives how
// many there are.
size_t SortedGroupsOfKeyFile(const char* szPath);

// Loads a settings file, and gives how long all values of a group are together.
size_t SizeOfValuesInKeyFile(const char* szPath, const char* szGroup);

// Loads a settings file, sets all values of a group to what they are, and saves it.
void SaveGroupOfKeyFile(const char* szPath, const char* szGroup);

#endif  // MERO_BENCH_KEY_FILE_H
