// Bounded copies of text.
#ifndef MERO_COMMON_TEXT_H
#define MERO_COMMON_TEXT_H

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <string_view>

// Copies what fits of `text` and terminates it; a null byte in the text ends it.
[[gnu::noinline]] inline void CopyText(char* szTo, size_t cbTo, std::string_view text) {
  if (cbTo == 0) return;
  const size_t size = std::min({cbTo - 1, text.size(), text.find('\0')});
  if (size > 0) std::memcpy(szTo, text.data(), size);
  szTo[size] = '\0';
}

// The same of a whole text, which callers need not measure.
[[gnu::noinline]] inline void CopyText(char* szTo, size_t cbTo, const char* szText) {
  CopyText(szTo, cbTo, std::string_view(szText));
}

template <size_t kSize>
void CopyText(char (&szTo)[kSize], const char* szText) {
  CopyText(szTo, kSize, szText);
}

template <size_t kSize>
void CopyText(char (&szTo)[kSize], std::string_view text) {
  CopyText(szTo, kSize, text);
}

// The text in a field of a record; all of the field when it has no end.
template <size_t kSize>
std::string_view TextIn(const char (&szField)[kSize]) {
  return {szField, ::strnlen(szField, kSize)};
}

// A part of a text, from one offset up to another or to its end. What lies outside the text is no part of it; unlike
// string_view::substr(), which would bring in the exceptions of the C++ library.
constexpr std::string_view Slice(std::string_view text, size_t begin, size_t end = std::string_view::npos) {
  end = std::min(end, text.size());
  begin = std::min(begin, end);
  return {text.data() + begin, end - begin};
}

// Whether a text ends in another one; unlike string_view::ends_with(), which LLVM's library makes of substr().
constexpr bool EndsWith(std::string_view text, std::string_view end) {
  return text.size() >= end.size() && Slice(text, text.size() - end.size()) == end;
}

// Whether all of a text or an array is so; unlike std::all_of(), which libstdc++ unrolls.
template <class Range, class Condition>
constexpr bool All(const Range& range, Condition is) {
  for (const auto& element : range) {
    if (!is(element)) return false;
  }
  return true;
}

// White space and letters of ASCII: the caller's locale must not change how files and names on the air are read.
constexpr bool IsSpace(char c) {
  return c == ' ' || (c >= '\t' && c <= '\r');
}

constexpr char ToLower(char c) {
  return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

constexpr std::string_view TrimEnd(std::string_view text) {
  while (!text.empty() && IsSpace(text.back())) text.remove_suffix(1);
  return text;
}

constexpr std::string_view Trim(std::string_view text) {
  while (!text.empty() && IsSpace(text.front())) text.remove_prefix(1);
  return TrimEnd(text);
}

constexpr bool EqualIgnoringCase(std::string_view a, std::string_view b) {
  return std::equal(a.begin(), a.end(), b.begin(), b.end(), [](char x, char y) { return ToLower(x) == ToLower(y); });
}

#endif  // MERO_COMMON_TEXT_H
