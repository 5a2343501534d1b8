// What every test of a unit starts from.
#ifndef MERO_TESTS_UNIT_UNIT_TEST_H
#define MERO_TESTS_UNIT_UNIT_TEST_H

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstddef>
#include <set>
#include <string>
#include <vector>

#include "fakes.h"
#include "memory.h"
#include "tests/support/files.h"
#include "tests/support/processes.h"
#include "tests/support/ring.h"
#include "wireless.h"

// Fakes record, sleeps take no time, and a test that leaves a descriptor or counted memory behind has failed.
class UnitTest : public testing::Test {
 protected:
  UnitTest();
  ~UnitTest() override;

 private:
  std::set<int> descriptors_;
};

#endif  // MERO_TESTS_UNIT_UNIT_TEST_H
