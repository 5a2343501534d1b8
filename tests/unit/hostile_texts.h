// Names, keys and addresses as strangers choose them, and programs that tell what they were given.
#ifndef MERO_TESTS_UNIT_HOSTILE_TEXTS_H
#define MERO_TESTS_UNIT_HOSTILE_TEXTS_H

#include <filesystem>
#include <string>
#include <vector>

#include "tests/support/early.h"
#include "unit_test.h"

// What the texts below would create, if a shell ran any part of them.
EARLY inline const std::string kIntruder = "/tmp/x";

inline std::string BytesFromTo(int first, int last) {
  std::string bytes;
  for (int byte = first; byte <= last; ++byte) bytes += static_cast<char>(byte);
  return bytes;
}

// Those of up to 15 bytes stand for the name of an interface too. None is empty.
inline const std::vector<std::string> kHostileTexts = {
    "$(touch /tmp/x)",
    "`touch /tmp/x`",
    ";touch /tmp/x",
    "a;touch /tmp/x;",
    "|touch /tmp/x",
    "&touch /tmp/x",
    "&&touch /tmp/x",
    "||touch /tmp/x",
    "\ntouch /tmp/x\n",
    "a\ntouch /tmp/x",
    "';touch /tmp/x'",
    "\";touch /tmp/x\"",
    "'$(touch /tmp/x)'",
    "\"$(touch /tmp/x)\"",
    "''`touch /tmp/x`''",
    "\\';touch /tmp/x",
    ">/tmp/x",
    "a>/tmp/x",
    "2>/tmp/x",
    "<>/tmp/x",
    "#",
    "a #b",
    "'",
    "''",
    "\"",
    "\\",
    "\\\\",
    "*",
    "/etc/*",
    "?",
    "[a-z]",
    "~",
    "!",
    "!!",
    "{a,b}",
    "$HOME",
    "$IFS",
    "${IFS}",
    "$$",
    "%s%n",
    " ",
    " a",
    "a ",
    "a  b",
    "\t\r\n",
    "-h",
    "it's",
    "'''''''''''''''",
    "caf\xc3\xa9",
    BytesFromTo(0x80, 0x8e),
    BytesFromTo(0x01, 0x1f),
    BytesFromTo(0x80, 0x9f),
    BytesFromTo(0xe0, 0xff),
};

// The words of a call, the program's own name first.
using Call = std::vector<std::string>;

inline constexpr char kNotedCalls[] = "/tmp/calls";

// Puts a program in the place of a real one: it notes its words, and then does what `behind` says.
inline void InstallNoter(const std::string& path, const std::string& behind = "") {
  WriteScript(path, "printf '%s\\0' \"$(($# + 1))\" \"$0\" \"$@\" >> " + std::string(kNotedCalls) + "\n" + behind);
}

inline void ForgetCalls() {
  std::filesystem::remove(kNotedCalls);
  std::filesystem::remove(kIntruder);
}

inline std::vector<Call> NotedCalls() {
  const std::string text = TextOrNothing(kNotedCalls);
  size_t at = 0;
  const auto next = [&] {
    const size_t end = text.find('\0', at);
    std::string word = text.substr(at, end - at);
    at = end + 1;
    return word;
  };
  std::vector<Call> calls;
  while (at < text.size()) {
    Call call(std::stoul(next()));
    for (std::string& word : call) word = next();
    calls.push_back(std::move(call));
  }
  return calls;
}

inline bool HasIntruder() {
  return Exists(kIntruder);
}

#endif  // MERO_TESTS_UNIT_HOSTILE_TEXTS_H
