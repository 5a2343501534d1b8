// What somebody has meant who has misspelt it.
#include "app/spelling.h"

#include <algorithm>
#include <cstddef>
#include <numeric>

namespace {

// How many letters have to be put in, taken out, replaced, or changed with their neighbours to make one word of
// another.
std::size_t Distance(std::string_view one, std::string_view other) {
  std::vector<std::size_t> former, last(other.size() + 1), current(other.size() + 1);
  std::iota(last.begin(), last.end(), 0);
  for (std::size_t i = 1; i <= one.size(); ++i) {
    current[0] = i;
    for (std::size_t j = 1; j <= other.size(); ++j) {
      const bool same = one[i - 1] == other[j - 1];
      current[j] = std::min({last[j] + 1, current[j - 1] + 1, last[j - 1] + (same ? 0 : 1)});
      const bool swapped = i > 1 && j > 1 && one[i - 1] == other[j - 2] && one[i - 2] == other[j - 1];
      if (swapped) current[j] = std::min(current[j], former[j - 2] + 1);
    }
    former = last;
    last = current;
  }
  return last.back();
}

// A word that is begun is as near as one with a wrong letter.
std::size_t DistanceOf(std::string_view given, std::string_view word) {
  constexpr std::size_t kBeginning = 3;
  return given.size() >= kBeginning && word.starts_with(given) ? 1 : Distance(given, word);
}

}  // namespace

std::string Nearest(std::string_view given, const std::vector<std::string>& words) {
  const auto distance = [&](const std::string& word) { return DistanceOf(given, word); };
  const auto nearest = std::ranges::min_element(words, {}, distance);
  const std::size_t furthest = std::max<std::size_t>(1, given.size() / 3);
  return nearest != words.end() && distance(*nearest) <= furthest ? *nearest : "";
}
