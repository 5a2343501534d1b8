// Runs the tests of a program on a private machine.
#include <gtest/gtest.h>

#include "private_machine.h"

int main(int argc, char** argv) {
  testing::InitGoogleTest(&argc, argv);
  if (!testing::GTEST_FLAG(list_tests)) EnterPrivateMachine();
  return RUN_ALL_TESTS();
}
