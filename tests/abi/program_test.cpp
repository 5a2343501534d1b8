// Runs the program in C on a machine of its own.
#include <gtest/gtest.h>

#include <cstdlib>

namespace {

TEST(Abi, ServesAProgramInC99) {
  EXPECT_EQ(std::system(C_PROGRAM), 0);
}

}  // namespace
