// System calls that are not expected to fail.
#ifndef MERO_TOOLS_REQUIRE_H
#define MERO_TOOLS_REQUIRE_H

#include <cerrno>
#include <system_error>

// The result of such a call; throws when it has failed.
inline int Require(int result, const char* szWhat) {
  if (result < 0) throw std::system_error(errno, std::generic_category(), szWhat);
  return result;
}

#endif  // MERO_TOOLS_REQUIRE_H
