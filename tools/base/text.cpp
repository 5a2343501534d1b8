// Bytes from the air as text that can be shown.
#include "base/text.h"

#include <arpa/inet.h>

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <cstdio>
#include <cwchar>

namespace {

// The character that a text begins with. When the bytes are no UTF-8, it is one byte long and not valid.
struct Start {
  char32_t code;
  std::size_t size;
  bool valid;
};

constexpr char32_t kLeast[] = {0, 0, 0x80, 0x800, 0x10000};

Start FirstOf(std::string_view text) {
  const auto lead = static_cast<unsigned char>(text.front());
  if (lead < 0x80) return {lead, 1, true};
  const std::size_t size = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : 2;
  const Start invalid{lead, 1, false};
  if (lead < 0xC2 || lead > 0xF4 || text.size() < size) return invalid;

  auto code = static_cast<char32_t>(lead & (0x7F >> size));
  for (const char byte : text.substr(1, size - 1)) {
    if ((byte & 0xC0) != 0x80) return invalid;
    code = code << 6 | static_cast<char32_t>(byte & 0x3F);
  }
  const bool surrogate = code >= 0xD800 && code <= 0xDFFF;
  return code < kLeast[size] || code > 0x10FFFF || surrogate ? invalid : Start{code, size, true};
}

struct Range {
  char32_t first;
  char32_t last;
};

// Characters that cannot be seen by themselves: controls, direction marks, joiners and others.
constexpr Range kUnseen[] = {
    {0x00, 0x1F},     {0x7F, 0x9F},     {0xAD, 0xAD},     {0x061C, 0x061C}, {0x115F, 0x1160},
    {0x180B, 0x180F}, {0x200B, 0x200F}, {0x2028, 0x202E}, {0x2060, 0x206F}, {0x3164, 0x3164},
    {0xE000, 0xF8FF}, {0xFE00, 0xFE0F}, {0xFEFF, 0xFEFF}, {0xFFF0, 0xFFFB}, {0xE0000, 0x10FFFF},
};

bool IsShown(const Start& character, bool utf8) {
  if (!character.valid || (!utf8 && character.code > 0x7E)) return false;
  return std::ranges::none_of(
      kUnseen, [&](const Range& range) { return character.code >= range.first && character.code <= range.last; });
}

std::size_t WidthOf(const Start& character) {
  if (character.code < 0x80) return 1;
  const int width = ::wcwidth(static_cast<wchar_t>(character.code));
  return width < 0 ? 1 : static_cast<std::size_t>(width);
}

}  // namespace

std::string Rewritten(std::string_view text, bool utf8, std::string (*write)(const Character&)) {
  std::string rewritten;
  while (!text.empty()) {
    const Start first = FirstOf(text);
    rewritten += write({text.substr(0, first.size), first.code, IsShown(first, utf8)});
    text.remove_prefix(first.size);
  }
  return rewritten;
}

std::string Harmless(std::string_view bytes, bool utf8) {
  return Rewritten(bytes, utf8, [](const Character& character) {
    // A backslash is doubled, so that nothing on the air looks like what is written out here.
    if (character.bytes == "\\") return std::string("\\\\");
    if (character.shown) return std::string(character.bytes);
    std::string written;
    for (const char byte : character.bytes) written += "\\x" + Hex({&byte, 1});
    return written;
  });
}

std::size_t WidthOf(std::string_view text, bool utf8) {
  if (!utf8) return text.size();
  std::size_t width = 0;
  while (!text.empty()) {
    const Start character = FirstOf(text);
    width += WidthOf(character);
    text.remove_prefix(character.size);
  }
  return width;
}

std::string CutToWidth(std::string_view text, std::size_t width, bool utf8) {
  if (WidthOf(text, utf8) <= width) return std::string(text);
  const std::string_view sign = utf8 ? "…" : "~";
  std::string cut;
  std::size_t room = width > 0 ? width - 1 : 0;
  while (!text.empty()) {
    const Start character = FirstOf(text);
    const std::size_t needed = utf8 ? WidthOf(character) : 1;
    if (needed > room) break;
    room -= needed;
    cut += text.substr(0, character.size);
    text.remove_prefix(character.size);
  }
  return width > 0 ? cut.append(sign) : cut;
}

std::string Wrapped(std::string_view text, std::size_t width, std::size_t indent, bool utf8) {
  if (width == 0) return std::string(text);
  std::string wrapped;
  std::size_t column = 0;
  bool begun = false;  // a word stands on this line
  while (!text.empty()) {
    const std::size_t blanks = std::min(text.find_first_not_of(' '), text.size());
    const std::size_t end = std::min(text.find(' ', blanks), text.size());
    const std::string_view word = text.substr(blanks, end - blanks);
    std::size_t gap = blanks;
    if (begun && column + gap + WidthOf(word, utf8) > width) {
      wrapped += '\n';
      column = 0;
      gap = indent;
    }
    wrapped.append(gap, ' ').append(word);
    column += gap + WidthOf(word, utf8);
    begun = true;
    text.remove_prefix(end);
  }
  return wrapped;
}

bool IsUtf8(std::string_view bytes) {
  while (!bytes.empty()) {
    const Start character = FirstOf(bytes);
    if (!character.valid) return false;
    bytes.remove_prefix(character.size);
  }
  return true;
}

std::string Hex(std::string_view bytes) {
  constexpr std::string_view kDigits = "0123456789abcdef";
  std::string hex;
  for (const char byte : bytes) {
    hex += kDigits[static_cast<unsigned char>(byte) >> 4];
    hex += kDigits[static_cast<unsigned char>(byte) & 0xF];
  }
  return hex;
}

std::string BytesOfHex(std::string_view hex) {
  std::string bytes;
  for (std::size_t i = 0; i + 2 <= hex.size(); i += 2) {
    unsigned value = 0;
    const char* end = hex.data() + i + 2;
    if (std::from_chars(hex.data() + i, end, value, 16).ptr == end) bytes += static_cast<char>(value);
  }
  return bytes;
}

std::string AddressText(const Address& address) {
  char szText[sizeof "00:11:22:33:44:55"];
  std::snprintf(szText, sizeof szText, "%02X:%02X:%02X:%02X:%02X:%02X", address[0], address[1], address[2], address[3],
                address[4], address[5]);
  return szText;
}

std::string AddressText(const unsigned char (&address)[6]) {
  return AddressText(std::to_array(address));
}

std::optional<Address> ParseAddress(std::string_view text) {
  constexpr std::size_t kOctet = 3;  // two digits and a colon
  Address address{};
  if (text.size() != kOctet * address.size() - 1) return std::nullopt;
  for (std::size_t i = 0; i < address.size(); ++i) {
    const char* digits = text.data() + kOctet * i;
    if (i > 0 && digits[-1] != ':') return std::nullopt;
    const auto [end, error] = std::from_chars(digits, digits + 2, address[i], 16);
    if (error != std::errc() || end != digits + 2) return std::nullopt;
  }
  return address;
}

std::string WithBlanks(std::span<const std::string> words) {
  std::string text;
  for (const std::string& word : words) text.append(text.empty() ? "" : " ").append(word);
  return text;
}

bool IsStation(const Address& address) {
  return address != Address{} && (address[0] & 1) == 0;
}

bool IsIpAddress(const std::string& text) {
  in_addr address;
  return ::inet_pton(AF_INET, text.c_str(), &address) == 1;
}

bool IsNetmask(const std::string& text) {
  in_addr mask;
  if (::inet_pton(AF_INET, text.c_str(), &mask) != 1) return false;
  const uint32_t zeros = ~ntohl(mask.s_addr);
  return zeros != UINT32_MAX && (zeros & (zeros + 1)) == 0;
}

std::string Lower(std::string_view text) {
  std::string lower(text);
  for (char& c : lower) {
    if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
  }
  return lower;
}

bool IsWord(std::string_view text, std::string_view word) {
  return Lower(text) == Lower(word);
}

std::optional<int> ParseNumber(std::string_view text) {
  int number = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (error != std::errc() || end != text.data() + text.size()) return std::nullopt;
  return number;
}
