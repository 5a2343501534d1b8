// Bytes from the air as text that can be shown.
#ifndef MERO_TOOLS_TEXT_H
#define MERO_TOOLS_TEXT_H

#include <array>
#include <cstddef>
#include <optional>
#include <span>
#include <string>
#include <string_view>

// A character of a text, or a byte that belongs to none.
struct Character {
  std::string_view bytes;
  char32_t code;
  bool shown;  // neither commands a terminal, nor hides, nor reorders what stands around it
};

// `text` with each character as `write` writes it. Without `utf8` none is shown that is not ASCII.
std::string Rewritten(std::string_view text, bool utf8, std::string (*write)(const Character&));

// `bytes` with everything written out as \xNN that is no printable text, so that it can neither command a terminal nor
// reorder what stands around it. Without `utf8` that is all but ASCII.
std::string Harmless(std::string_view bytes, bool utf8);

// How many columns a harmless text takes.
std::size_t WidthOf(std::string_view text, bool utf8);

// A harmless text, cut to `width` columns with a sign that it was.
std::string CutToWidth(std::string_view text, std::size_t width, bool utf8);

// A harmless text in lines of up to `width` columns, each after the first behind `indent` blanks. Lines are broken at
// blanks, so a longer word makes a longer line. 0 is any width.
std::string Wrapped(std::string_view text, std::size_t width, std::size_t indent, bool utf8);

bool IsUtf8(std::string_view bytes);
std::string Hex(std::string_view bytes);

// The bytes that Hex() wrote out; what is no pair of its digits is left out.
std::string BytesOfHex(std::string_view hex);

using Address = std::array<unsigned char, 6>;

std::string AddressText(const unsigned char (&address)[6]);
std::string AddressText(const Address& address);

// Six hexadecimal octets between colons, and nothing else.
std::optional<Address> ParseAddress(std::string_view text);

// With a blank between each and the next.
std::string WithBlanks(std::span<const std::string> words);

// Whether it can be an access point's: it is not all zeros, and not a group's.
bool IsStation(const Address& address);

bool IsIpAddress(const std::string& text);

// A dotted netmask: ones, then zeros.
bool IsNetmask(const std::string& text);

// ASCII letters as small ones. A word of the command line may be written in either.
std::string Lower(std::string_view text);
bool IsWord(std::string_view text, std::string_view word);

// A whole decimal number.
std::optional<int> ParseNumber(std::string_view text);

#endif  // MERO_TOOLS_TEXT_H
