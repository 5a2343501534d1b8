// Files that are read and written whole.
#ifndef MERO_TOOLS_WHOLE_FILE_H
#define MERO_TOOLS_WHOLE_FILE_H

#include <sys/types.h>

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

// The bytes of a file; nothing when it cannot be read, and errno tells why.
std::optional<std::string> TextOfFile(const std::string& path);

// The bytes that an open file has left, or the first of them: `most` and a few more. Nothing when they cannot be read,
// and errno tells why.
std::optional<std::string> TextOf(int fd, std::size_t most);

// Puts a file at a path that its owner alone may read, in one step: whoever reads it, and whoever switches the machine
// off, finds what there was or all of this. Fails with advice when it cannot be written, or when something
// other than a plain file is there; `shown` is the path for a sentence.
void WriteForOwner(const std::string& path, const std::string& shown, std::string_view bytes);

// Flushes the directory of a path, so that what was made, renamed or removed in it outlasts a power cut. False when
// that fails; then errno tells why.
bool FlushDirectoryOf(const std::string& path);

// Writes all of a text to an open file. False when it cannot; then errno tells why.
bool WriteAll(int fd, std::string_view text);

#endif  // MERO_TOOLS_WHOLE_FILE_H
