// Files as a test writes and finds them.
#ifndef MERO_TESTS_SUPPORT_FILES_H
#define MERO_TESTS_SUPPORT_FILES_H

#include <sys/types.h>

#include <string>
#include <string_view>
#include <vector>

// Makes the directories above the file too.
void WriteText(const std::string& path, std::string_view text, mode_t mode = 0600);

// A file that the shell runs.
void WriteScript(const std::string& path, const std::string& text);

// The whole file, which must be there.
std::string ReadText(const std::string& path);

// The whole file; an empty text when there is none.
std::string TextOrNothing(const std::string& path);

// Whether there is something of that name; a link to nothing is something.
bool Exists(const std::string& path);

// The permissions of a file, or of a link itself.
mode_t ModeOf(const std::string& path);

// The names in a directory, in order.
std::vector<std::string> NamesIn(const std::string& directory);

// Waits until the clock has left the file's last change so far behind that its times are bound to show the next change.
void LetSettle(const std::string& path);

#endif  // MERO_TESTS_SUPPORT_FILES_H
