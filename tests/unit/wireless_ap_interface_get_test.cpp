#include "unit_test.h"

namespace {

using testing::IsEmpty;

class AccessPointInterface : public UnitTest {};

TEST_F(AccessPointInterface, IsWlan0WhateverAdapterIsThere) {
  fake::MEROWirelessAdapterNum.Returns(0);
  fake::MEROWirelessInterfaceGet.Returns("usb7");
  EXPECT_STREQ(MEROWirelessAPInterfaceGet(), "wlan0");
  EXPECT_THAT(fake::Effects(), IsEmpty());
}

TEST_F(AccessPointInterface, IsOneTextForTheWholeLifeOfTheProcess) {
  const char* szFirst = memory::Run(0, [] { return MEROWirelessAPInterfaceGet(); });
  EXPECT_EQ(MEROWirelessAPInterfaceGet(), szFirst);
}

}  // namespace
