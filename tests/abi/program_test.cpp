// Runs the program in C on a machine of its own.
#include <gtest/gtest.h>

#include <cstdlib>

#include "tests/support/shell.h"

namespace {

TEST(Abi, ServesAProgramInC99) {
  EXPECT_EQ(std::system(C_PROGRAM), 0);
}

#ifdef musl_DIRECTORY
TEST(Musl, ServesAProgramInC99) {
  EXPECT_EQ(std::system(musl_DIRECTORY "/program"), 0);
}

// It cannot be told to close all descriptors from one on.
TEST(Musl, HasAProgramInheritTheStandardDescriptorsAndNothingElse) {
  EXPECT_EQ(Shell(musl_DIRECTORY "/inherits"), "0\n1\n2\n3\n");  // 3 is the listing itself
}
#elif !defined MERO_SANITIZE
constexpr char kNoMusl[] = "there is no musl here with words of 64 bits for this processor, or no libc++";

TEST(Musl, ServesAProgramInC99) {
  GTEST_SKIP() << kNoMusl;
}

TEST(Musl, HasAProgramInheritTheStandardDescriptorsAndNothingElse) {
  GTEST_SKIP() << kNoMusl;
}
#endif

#ifdef m32_DIRECTORY
TEST(M32, ServesAProgramInC99) {
  EXPECT_EQ(std::system(m32_DIRECTORY "/program"), 0);
}
#elif !defined MERO_SANITIZE
TEST(M32, ServesAProgramInC99) {
  GTEST_SKIP() << "the compiler has no headers and libraries for 32 bits";
}
#endif

}  // namespace
