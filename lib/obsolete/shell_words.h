// Commands for the shell. Values in them may come from strangers: anyone in range chooses the name of a network.
#ifndef MERO_LIB_SHELL_WORDS_H
#define MERO_LIB_SHELL_WORDS_H

#include <cstddef>
#include <cstdio>
#include <string_view>

// A value as one word of a command, which the shell passes on unchanged: quoted, unless all its characters are
// ordinary.
class ShellWord {
 public:
  explicit ShellWord(std::string_view value);

  // The word. When the value was longer than any command, so is the word: no command is run with a part of a value.
  const char* c_str() const { return szWord_; }

 private:
  // The longest command is 1024 bytes. Quoting makes a value of that size at most four times as long.
  char szWord_[4 * 1024 + 3];
};

// A value for a word that stands in double quotes in the command: characters that the shell would change are escaped.
class ShellQuoted {
 public:
  explicit ShellQuoted(std::string_view value);

  const char* c_str() const { return szText_; }

 private:
  char szText_[2 * 1024 + 1];  // longer than any command when the value was
};

// Commands of any size, for the next class.
int RunShell(const char* szCommand);
FILE* OpenShell(const char* szCommand);
int RefuseShell();  // -1, with E2BIG

// A command of at most kSize - 1 bytes. A longer one is never run; its text is cut, and serves for messages.
template <size_t kSize>
class Command {
 public:
  template <class... Values>
  explicit Command(const char* szFormat, Values... values) {
    int size = 0;
    if constexpr (sizeof...(values) > 0) {
      size = std::snprintf(szText_, kSize, szFormat, values...);
    } else {
      size = std::snprintf(szText_, kSize, "%s", szFormat);
    }
    fits_ = size >= 0 && static_cast<size_t>(size) < kSize;
  }

  const char* c_str() const { return szText_; }

  // Runs it and waits; negative when it could not be started. The exit status is for callers that look at it.
  [[nodiscard]] int Run() const { return fits_ ? RunShell(szText_) : RefuseShell(); }

  // Starts it, to read its output, which no other command inherits; null when it could not be started.
  [[nodiscard]] FILE* OpenPipe() const { return fits_ ? OpenShell(szText_) : (RefuseShell(), nullptr); }

 private:
  char szText_[kSize] = {};
  bool fits_ = false;
};

#endif  // MERO_LIB_SHELL_WORDS_H
