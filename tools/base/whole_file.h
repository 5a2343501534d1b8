// Files that are read and written whole.
#ifndef MERO_TOOLS_WHOLE_FILE_H
#define MERO_TOOLS_WHOLE_FILE_H

#include <optional>
#include <string>

// The bytes of a file; nothing when it cannot be read, and errno tells why.
std::optional<std::string> TextOfFile(const std::string& path);

#endif  // MERO_TOOLS_WHOLE_FILE_H
