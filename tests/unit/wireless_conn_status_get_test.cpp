#include "unit_test.h"

namespace {

using testing::ElementsAre;

const std::string kAsks = "MEROWirelessCurInfoGet(4, &)";

class ConnectionStatus : public UnitTest {};

TEST_F(ConnectionStatus, IsTheOneThatThePlatformFinds) {
  for (int status = WIRELESS_STATUS_UNKNOWN; status <= WIRELESS_STATUS_MONITOR; ++status) {
    fake::Begin();
    fake::MEROWirelessCurInfoGet.Does([&](WIRELESS_REQUEST, PWIRELESS_INFO pInfo) {
      pInfo->status = static_cast<WIRELESS_STATUS>(status);
      return 0;
    });
    EXPECT_EQ(MEROWirelessConnStatusGet(), status);
    EXPECT_THAT(fake::Effects(), ElementsAre(kAsks));
  }
}

TEST_F(ConnectionStatus, IsTheOneThatWasLeftByAQuestionThatFailed) {
  fake::MEROWirelessCurInfoGet.Does([&](WIRELESS_REQUEST, PWIRELESS_INFO pInfo) {
    pInfo->status = WIRELESS_STATUS_DOWN;
    return -1;
  });
  EXPECT_EQ(MEROWirelessConnStatusGet(), WIRELESS_STATUS_DOWN);
  EXPECT_THAT(fake::Effects(), ElementsAre(kAsks));
}

// Fills the part of the stack that the next call uses.
[[gnu::noinline]] void DirtyStack() {
  volatile unsigned char bytes[4096];
  for (volatile unsigned char& byte : bytes) byte = 0x05;
}

TEST_F(ConnectionStatus, IsUnknownWhenItCannotBeAsked) {
  for (const int result : {-1, 0}) {
    fake::MEROWirelessCurInfoGet.Returns(result);
    DirtyStack();
    EXPECT_EQ(MEROWirelessConnStatusGet(), WIRELESS_STATUS_UNKNOWN);
  }
}

TEST_F(ConnectionStatus, OfAMachineWithoutAnAdapterSaysSo) {
  EXPECT_EQ(MEROWirelessConnStatusGet(), WIRELESS_STATUS_NO_ADAPTER);
}

}  // namespace
