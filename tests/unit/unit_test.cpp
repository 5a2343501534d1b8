#include "unit_test.h"

UnitTest::UnitTest() : descriptors_(OpenDescriptors()) {
  fake::Begin();
  fake::sleep.Returns(0);
}

UnitTest::~UnitTest() {
  fake::End();
  EXPECT_EQ(OpenDescriptors(), descriptors_) << "descriptors are left open";
  EXPECT_EQ(memory::Held(), 0u) << "memory is left allocated";
}
