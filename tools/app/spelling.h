// What somebody has meant who has misspelt it.
#ifndef MERO_TOOLS_SPELLING_H
#define MERO_TOOLS_SPELLING_H

#include <string>
#include <string_view>
#include <vector>

// The one of `words` that `given` is a misspelling of, or the beginning; empty when none is near.
std::string Nearest(std::string_view given, const std::vector<std::string>& words);

#endif  // MERO_TOOLS_SPELLING_H
