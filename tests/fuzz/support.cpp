#include "tests/fuzz/support.h"

#include <fcntl.h>
#include <syslog.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>

#include "common/descriptor.h"
#include "tests/support/private_machine.h"

namespace {

std::string Escaped(std::string_view text) {
  std::string escaped;
  for (const char c : text) {
    char szByte[sizeof "\\xff"];
    const bool plain = c >= ' ' && c <= '~' && c != '\\';
    std::snprintf(szByte, sizeof szByte, plain ? "%c" : "\\x%02x", static_cast<unsigned char>(c));
    escaped += szByte;
  }
  return escaped;
}

void RequireCall(bool done, const char* szPath) {
  if (done) return;
  std::fprintf(stderr, "fuzz: %s: %s\n", szPath, std::strerror(errno));
  std::exit(EXIT_FAILURE);
}

// A report is made, so that its values are looked at, and goes no further.
void Report(const char* szFormat, va_list values) {
  char szReport[4096];
  std::vsnprintf(szReport, sizeof szReport, szFormat, values);
}

}  // namespace

void Require(bool holds, const char* szPromise, std::initializer_list<std::string_view> shown) {
  if (holds) return;
  std::fprintf(stderr, "broken promise: %s\n", szPromise);
  for (const std::string_view text : shown) std::fprintf(stderr, "  |%s|\n", Escaped(text).c_str());
  std::abort();
}

std::string Fields::Text() {
  const std::string text(left_.substr(0, left_.find('\0')));
  left_.remove_prefix(std::min(text.size() + 1, left_.size()));
  return text;
}

int Fields::Number() {
  const std::string text = Text();
  int number = 0;
  std::from_chars(text.data(), text.data() + text.size(), number);
  return number;
}

void Fields::Fill(char* szField, std::size_t size) {
  const std::string text = Text();
  std::strncpy(szField, text.c_str(), size);
}

std::string EndedText(const char* szField, std::size_t size) {
  const std::size_t end = ::strnlen(szField, size);
  Require(end < size, "a text ends within its field", {{szField, size}});
  return {szField, end};
}

std::string Trimmed(const std::string& text) {
  constexpr char kSpace[] = " \t\n\v\f\r";
  const std::size_t begin = text.find_first_not_of(kSpace);
  return begin == text.npos ? "" : text.substr(begin, text.find_last_not_of(kSpace) - begin + 1);
}

std::vector<std::string> LinesOf(const std::string& text) {
  std::vector<std::string> lines;
  for (std::size_t begin = 0; begin < text.size();) {
    const std::size_t end = std::min(text.find('\n', begin), text.size());
    lines.push_back(text.substr(begin, end - begin));
    begin = end + 1;
  }
  return lines;
}

void PutFile(const char* szPath, std::string_view content) {
  constexpr int kFlags = O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC;
  Descriptor file(::open(szPath, kFlags, 0600));
  if (!file.valid() && errno == ENOENT) {
    std::filesystem::create_directories(std::filesystem::path(szPath).parent_path());
    file = Descriptor(::open(szPath, kFlags, 0600));
  }
  RequireCall(file.valid(), szPath);
  RequireCall(::write(file.get(), content.data(), content.size()) == static_cast<ssize_t>(content.size()), szPath);
}

void RemoveFile(const char* szPath) {
  RequireCall(::unlink(szPath) == 0 || errno == ENOENT, szPath);
}

std::optional<std::string> FileAt(const char* szPath) {
  const Descriptor file(::open(szPath, O_RDONLY | O_CLOEXEC));
  if (!file.valid()) return std::nullopt;
  std::string content(static_cast<std::size_t>(::lseek(file.get(), 0, SEEK_END)), '\0');
  RequireCall(::pread(file.get(), content.data(), content.size(), 0) == static_cast<ssize_t>(content.size()), szPath);
  return content;
}

extern "C" int LLVMFuzzerInitialize(int*, char***) {
  EnterPrivateMachine();
  return 0;
}

// Weak, since the program has its own.
extern "C" [[gnu::weak]] void syslog(int, const char* szFormat, ...) {
  va_list values;
  va_start(values, szFormat);
  Report(szFormat, values);
  va_end(values);
}

// The name of syslog() in a library that is built with _FORTIFY_SOURCE.
// NOLINTNEXTLINE(bugprone-reserved-identifier)
extern "C" [[gnu::weak]] void __syslog_chk(int, int, const char* szFormat, ...) {
  va_list values;
  va_start(values, szFormat);
  Report(szFormat, values);
  va_end(values);
}
