// What is known about the current connection.
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

#include "tests/platform/network_interfaces.h"
#include "tests/platform/platform_test.h"
#include "tests/platform/simulated_radio.h"

namespace {

constexpr char kRecord[] = "/var/tmp/.wireless_current_connection";

// An answer in which any change would show.
WIRELESS_INFO Untouched() {
  WIRELESS_INFO info;
  std::memset(&info, 'x', sizeof info);
  return info;
}

bool IsUntouched(const WIRELESS_INFO& info) {
  const WIRELESS_INFO untouched = Untouched();
  return std::memcmp(&info, &untouched, sizeof info) == 0;
}

class WithoutAnAdapter : public PlatformTest {};

TEST_F(WithoutAnAdapter, TheStatusSaysSo) {
  WIRELESS_INFO info = Untouched();
  EXPECT_EQ(MEROWirelessCurInfoGet(REQUEST_STATUS, &info), 0);
  EXPECT_EQ(info.status, WIRELESS_STATUS_NO_ADAPTER);
}

TEST_F(WithoutAnAdapter, NothingElseIsAnswered) {
  for (const WIRELESS_REQUEST request : {REQUEST_ESSID, REQUEST_PROTOCOL, REQUEST_AUTH, REQUEST_MODE}) {
    WIRELESS_INFO info = Untouched();
    EXPECT_EQ(MEROWirelessCurInfoGet(request, &info), -1) << request;
    ExpectFailure(ERR_NO_DEVICE, "Failed to ask the adapter wlan0: No such device");
    EXPECT_TRUE(IsUntouched(info)) << request;
  }
}

TEST_F(WithoutAnAdapter, NoModeIsSet) {
  EXPECT_EQ(MEROWirelessOpmodeSet(WIRELESS_OPMODE_MANAGED), -1);
  ExpectFailure(ERR_NO_DEVICE, "Failed to set the mode of wlan0: No such device");
}

class CurrentConnection : public PlatformTest {
 protected:
  void SetUp() override {
    PlatformTest::SetUp();
    PLIBCSysUnlink(kRecord);
    driver_.accessPoint = {0x00, 0x11, 0x22, 0xaa, 0xbb, 0xcc};
    driver_.name = "home";
  }

  static WIRELESS_INFO Ask(WIRELESS_REQUEST request) {
    WIRELESS_INFO info = Untouched();
    EXPECT_EQ(MEROWirelessCurInfoGet(request, &info), 0) << request;
    return info;
  }

  void ExpectRefused(WIRELESS_REQUEST request, int code, const char* szReason) {
    WIRELESS_INFO info = Untouched();
    EXPECT_EQ(MEROWirelessCurInfoGet(request, &info), -1) << request;
    ExpectFailure(code, std::string("Failed to ask the adapter wlan3: ") + szReason);
    EXPECT_TRUE(IsUntouched(info)) << request;
  }

  const NetworkInterface interface_{"wlan3"};
  const ShownInterfaces shown_{{{"wlan3", "phy80211"}, {"eth0", ""}}};
  SimulatedDriver driver_{"wlan3"};
};

TEST_F(CurrentConnection, HasTheStatusThatTheDriverGives) {
  using Address = std::array<unsigned char, 6>;
  constexpr Address kSome = {2, 0, 0, 0, 0, 1};
  const struct {
    unsigned mode;
    Address accessPoint;
    WIRELESS_STATUS status;
  } rows[] = {
      {WIRELESS_OPMODE_MANAGED, kSome, WIRELESS_STATUS_CONNECTED_MANAGED},
      {WIRELESS_OPMODE_ADHOC, kSome, WIRELESS_STATUS_CONNECTED_ADHOC},
      {WIRELESS_OPMODE_MASTER, kSome, WIRELESS_STATUS_DISCONNECTED},
      {WIRELESS_OPMODE_AUTO, kSome, WIRELESS_STATUS_DISCONNECTED},
      {WIRELESS_OPMODE_MONITOR, kSome, WIRELESS_STATUS_MONITOR},
      {WIRELESS_OPMODE_MONITOR, {}, WIRELESS_STATUS_MONITOR},
      {WIRELESS_OPMODE_MANAGED, {}, WIRELESS_STATUS_DISCONNECTED},
      {WIRELESS_OPMODE_ADHOC, {}, WIRELESS_STATUS_DISCONNECTED},
      {WIRELESS_OPMODE_MANAGED, {255, 255, 255, 255, 255, 255}, WIRELESS_STATUS_DISCONNECTED},
      {WIRELESS_OPMODE_MANAGED, {0x44, 0x44, 0x44, 0x44, 0x44, 0x44}, WIRELESS_STATUS_DISCONNECTED},
  };
  ASSERT_EQ(PLIBNetIfUp("wlan3"), 1);
  for (const auto& row : rows) {
    driver_.mode = row.mode;
    driver_.accessPoint = row.accessPoint;
    EXPECT_EQ(Ask(REQUEST_STATUS).status, row.status) << row.mode;
  }
}

// Every question about an access point's own connection was reported as a failure.
TEST_F(CurrentConnection, IsNoneForAnAccessPointAndThatIsNoFailure) {
  ASSERT_EQ(PLIBNetIfUp("wlan3"), 1);
  WriteText(kRecord, "home\n10\n5\n8\n00:11:22:AA:BB:CC\n");
  for (const int mode : {+WIRELESS_OPMODE_MASTER, +WIRELESS_OPMODE_REPEATER, +WIRELESS_OPMODE_SECONDEARY, 7}) {
    driver_.mode = static_cast<unsigned>(mode);
    EXPECT_EQ(Ask(REQUEST_STATUS).status, WIRELESS_STATUS_DISCONNECTED) << mode;
    EXPECT_STREQ(Ask(REQUEST_ESSID).szEssid, "") << mode;
    EXPECT_EQ(Ask(REQUEST_PROTOCOL).protocol, WIRELESS_PROTO_UNKNOWN) << mode;
    EXPECT_EQ(Ask(REQUEST_AUTH).auth, WIRELESS_AUTH_UNKNOWN) << mode;
  }
  driver_.mode = WIRELESS_OPMODE_MONITOR;
  EXPECT_STREQ(Ask(REQUEST_ESSID).szEssid, "");
}

TEST_F(CurrentConnection, IsDownWhileTheInterfaceIs) {
  EXPECT_EQ(Ask(REQUEST_STATUS).status, WIRELESS_STATUS_DOWN);
}

TEST_F(CurrentConnection, IsNotSupportedByADriverThatKnowsNoModes) {
  ASSERT_EQ(PLIBNetIfUp("wlan3"), 1);
  driver_.refusal = EOPNOTSUPP;
  EXPECT_EQ(Ask(REQUEST_STATUS).status, WIRELESS_STATUS_NOT_SUPPORTED);
}

TEST_F(CurrentConnection, HasTheNameThatTheDriverGives) {
  const std::string longest(32, 'n');
  for (const std::string& name : {std::string("home"), std::string(), longest, std::string("\xFF two\nlines")}) {
    driver_.name = name;
    EXPECT_EQ(Ask(REQUEST_ESSID).szEssid, name);
  }
  driver_.hasName = false;
  EXPECT_STREQ(Ask(REQUEST_ESSID).szEssid, "");
}

TEST_F(CurrentConnection, HasTheModeThatTheDriverGives) {
  for (unsigned mode = WIRELESS_OPMODE_AUTO; mode <= WIRELESS_OPMODE_MONITOR; ++mode) {
    driver_.mode = mode;
    EXPECT_EQ(Ask(REQUEST_MODE).opmode, static_cast<WIRELESS_OPMODE>(mode));
  }
  for (const unsigned mode : {7u, 8u, 1000u, 0xffffffffu}) {
    driver_.mode = mode;
    EXPECT_EQ(Ask(REQUEST_MODE).opmode, WIRELESS_OPMODE_UNKNOWN) << mode;
  }
}

TEST_F(CurrentConnection, HasProtocolAndAuthenticationFromTheRecordOfItsAccessPoint) {
  const struct {
    std::string record;
    WIRELESS_PROTOCOL protocol;
    WIRELESS_AUTH auth;
  } rows[] = {
      {"home\n10\n5\n8\n00:11:22:AA:BB:CC\n", WIRELESS_PROTO_11BGN, WIRELESS_AUTH_WPA2PSK},
      {"home\n12\n8\n8\n00:11:22:aa:bb:cc\n", WIRELESS_PROTO_11BN, WIRELESS_AUTH_WPA2EAP},
      {"home\n0\n0\n0\n00:11:22:AA:BB:CC\n", WIRELESS_PROTO_UNKNOWN, WIRELESS_AUTH_UNKNOWN},
      {"home\n10\n5\n8\n00:11:22:AA:BB:CC", WIRELESS_PROTO_11BGN, WIRELESS_AUTH_WPA2PSK},
      {"\n10\n5\n8\n00:11:22:AA:BB:CC\n", WIRELESS_PROTO_11BGN, WIRELESS_AUTH_WPA2PSK},
      {"a\nname of\nlines\n10\n5\n8\n00:11:22:AA:BB:CC\n", WIRELESS_PROTO_11BGN, WIRELESS_AUTH_WPA2PSK},
      {"1\n2\n3\n00:11:22:AA:BB:CC\n10\n5\n8\n00:11:22:AA:BB:CC\n", WIRELESS_PROTO_11BGN, WIRELESS_AUTH_WPA2PSK},
      {"home\n10\n5\n8\n00:11:22:AA:BB:CD\n", WIRELESS_PROTO_UNKNOWN, WIRELESS_AUTH_UNKNOWN},
      {"home\n10\n5\n8\nnonsense\n", WIRELESS_PROTO_UNKNOWN, WIRELESS_AUTH_UNKNOWN},
      {"home\n13\n9\n8\n00:11:22:AA:BB:CC\n", WIRELESS_PROTO_UNKNOWN, WIRELESS_AUTH_UNKNOWN},
      {"home\n-1\n-5\n8\n00:11:22:AA:BB:CC\n", WIRELESS_PROTO_UNKNOWN, WIRELESS_AUTH_UNKNOWN},
      {"home\n10x\n 5\n8\n00:11:22:AA:BB:CC\n", WIRELESS_PROTO_UNKNOWN, WIRELESS_AUTH_UNKNOWN},
      {"home\n99999999999\n\n8\n00:11:22:AA:BB:CC\n", WIRELESS_PROTO_UNKNOWN, WIRELESS_AUTH_UNKNOWN},
      {"home\nx\n5\n8\n00:11:22:AA:BB:CC\n", WIRELESS_PROTO_UNKNOWN, WIRELESS_AUTH_WPA2PSK},
      {"00:11:22:AA:BB:CC\n", WIRELESS_PROTO_UNKNOWN, WIRELESS_AUTH_UNKNOWN},
      {"\n\n\n\n\n", WIRELESS_PROTO_UNKNOWN, WIRELESS_AUTH_UNKNOWN},
      {"", WIRELESS_PROTO_UNKNOWN, WIRELESS_AUTH_UNKNOWN},
  };
  for (const auto& row : rows) {
    WriteText(kRecord, row.record);
    EXPECT_EQ(Ask(REQUEST_PROTOCOL).protocol, row.protocol) << row.record;
    EXPECT_EQ(Ask(REQUEST_AUTH).auth, row.auth) << row.record;
  }
}

TEST_F(CurrentConnection, HasNoProtocolAndAuthenticationWithoutARecord) {
  EXPECT_EQ(Ask(REQUEST_PROTOCOL).protocol, WIRELESS_PROTO_UNKNOWN);
  EXPECT_EQ(Ask(REQUEST_AUTH).auth, WIRELESS_AUTH_UNKNOWN);
}

TEST_F(CurrentConnection, HasNoProtocolAndAuthenticationFromARecordOfSomebodyElses) {
  WriteText(kRecord, "home\n10\n5\n8\n00:11:22:AA:BB:CC\n");
  ASSERT_EQ(::chmod("/var/tmp", 01777), 0);
  ASSERT_EQ(::chown(kRecord, 65534, 65534), 0);
  EXPECT_EQ(Ask(REQUEST_PROTOCOL).protocol, WIRELESS_PROTO_UNKNOWN);
  constexpr char kReport[] = "/var/tmp/.wireless_current_connection is not believed: somebody else has put it there";
  EXPECT_THAT(TakeLog(), testing::ElementsAre(Says(kReport)));
}

TEST_F(CurrentConnection, HasNoProtocolAndAuthenticationWhenThereIsNone) {
  WriteText(kRecord, "home\n10\n5\n8\n00:00:00:00:00:00\n");
  driver_.accessPoint = {};
  EXPECT_EQ(Ask(REQUEST_PROTOCOL).protocol, WIRELESS_PROTO_UNKNOWN);
  EXPECT_EQ(Ask(REQUEST_AUTH).auth, WIRELESS_AUTH_UNKNOWN);
}

TEST_F(CurrentConnection, IsNotKnownWhenTheDriverRefuses) {
  ASSERT_EQ(PLIBNetIfUp("wlan3"), 1);
  for (const WIRELESS_REQUEST request : {REQUEST_ESSID, REQUEST_PROTOCOL, REQUEST_AUTH, REQUEST_MODE, REQUEST_STATUS}) {
    driver_.refusal = EIO;
    ExpectRefused(request, ERR_IO, "Input/output error");
    driver_.refusal = EPERM;
    ExpectRefused(request, ERR_PERMISSION, "Operation not permitted");
  }
}

TEST_F(CurrentConnection, IsNotAskedForWhatItDoesNotHave) {
  ExpectRefused(static_cast<WIRELESS_REQUEST>(5), ERR_BAD_PARAMETERS, "Invalid argument");
  ExpectRefused(static_cast<WIRELESS_REQUEST>(-1), ERR_BAD_PARAMETERS, "Invalid argument");
  EXPECT_EQ(MEROWirelessCurInfoGet(REQUEST_STATUS, nullptr), -1);
  ExpectNullRefused();
}

TEST_F(CurrentConnection, IsOperatedAsTheDriverIsTold) {
  for (int mode = WIRELESS_OPMODE_AUTO; mode <= WIRELESS_OPMODE_MONITOR; ++mode) {
    EXPECT_EQ(MEROWirelessOpmodeSet(static_cast<WIRELESS_OPMODE>(mode)), 0);
    EXPECT_EQ(driver_.mode, static_cast<unsigned>(mode));
  }
}

TEST_F(CurrentConnection, IsNotOperatedAsWhatIsNoMode) {
  for (const int mode : {-1, +WIRELESS_OPMODE_UNKNOWN, +WIRELESS_OPMODE_MAX}) {
    EXPECT_EQ(MEROWirelessOpmodeSet(static_cast<WIRELESS_OPMODE>(mode)), -1);
    ExpectFailure(ERR_BAD_PARAMETERS, "Failed to set the mode of wlan3: Invalid argument");
  }
  driver_.refusal = EBUSY;
  EXPECT_EQ(MEROWirelessOpmodeSet(WIRELESS_OPMODE_ADHOC), -1);
  ExpectFailure(ERR_UNKNOWN, "Failed to set the mode of wlan3: Device or resource busy");
  EXPECT_TRUE(driver_.told.empty());
}

}  // namespace
