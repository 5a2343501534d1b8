// Words of the command line that stand for values, in tables whose rows have a `text`.
#ifndef MERO_TOOLS_CHOICES_H
#define MERO_TOOLS_CHOICES_H

#include <algorithm>
#include <span>
#include <string>
#include <string_view>

#include "base/failure.h"
#include "base/text.h"

// All texts of a table, for a sentence.
template <class Row>
std::string Choices(std::span<const Row> rows) {
  std::string choices;
  for (const Row& row : rows) choices.append(choices.empty() ? "" : ", ").append(row.text);
  return choices;
}

template <class Row>
const Row& RowOf(std::span<const Row> rows, const std::string& text, std::string_view option) {
  const auto found = std::ranges::find_if(rows, [&](const Row& row) { return IsWord(text, row.text); });
  if (found == rows.end()) {
    throw Wrong("--" + std::string(option) + " cannot be this", "it is one of " + Choices(rows));
  }
  return *found;
}

struct Name {
  std::string_view text;
  int value;
};

// The name of a value, or its number when the table has no name for it.
inline std::string NameOf(std::span<const Name> names, int value) {
  const auto found = std::ranges::find(names, value, &Name::value);
  return found != names.end() ? std::string(found->text) : std::to_string(value);
}

inline int ValueOf(std::span<const Name> names, const std::string& text, std::string_view option) {
  return RowOf(names, text, option).value;
}

inline int NumberOf(const std::string& text, int least, int greatest, std::string_view option) {
  const auto number = ParseNumber(text);
  if (number && *number >= least && *number <= greatest) return *number;
  throw Wrong("--" + std::string(option) + " cannot be this",
              "it is a number from " + std::to_string(least) + " to " + std::to_string(greatest));
}

#endif  // MERO_TOOLS_CHOICES_H
