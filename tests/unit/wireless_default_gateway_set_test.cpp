#include <climits>

#include "hostile_texts.h"
#include "reports.h"
#include "unit_test.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr char kTool[] = "/usr/sbin/route";
constexpr char kAsksForInterface[] = "MEROWirelessInterfaceGet()";

std::string ReportOf(const std::string& message) {
  return fake::Report("wireless_default_gateway_set:# " + message);
}

std::string CommandFor(const std::string& gateway, const std::string& ifName) {
  return "/sbin/route add default gw " + gateway + " metric 0 dev " + ifName + " > /dev/null 2>&1";
}

class DefaultGateway : public UnitTest {
 protected:
  DefaultGateway() {
    fake::MEROWirelessInterfaceGet.Returns("wlan0");
    fake::system.Returns(0);
  }
};

TEST_F(DefaultGateway, IsAddedThroughTheWirelessInterface) {
  EXPECT_EQ(MEROWirelessDefaultGatewaySet("192.168.1.1"), 0);
  EXPECT_THAT(Steps(),
              ElementsAre(kAsksForInterface,
                          "system(/sbin/route add default gw 192.168.1.1 metric 0 dev wlan0 > /dev/null 2>&1)"));
}

TEST_F(DefaultGateway, IsRejectedWhenNullOrEmptyOnceTheInterfaceIsAskedFor) {
  for (const char* szGateway : {static_cast<const char*>(nullptr), ""}) {
    fake::Begin();
    EXPECT_EQ(MEROWirelessDefaultGatewaySet(szGateway), -1);
    EXPECT_THAT(Steps(), ElementsAre(kAsksForInterface, ReportOf("Bad parameters")));
  }
}

TEST_F(DefaultGateway, IsNotCheckedForBeingAnAddress) {
  for (const char* szGateway : {"x", "999.0.0.1", "gateway.example", "fe80::1", "0"}) {
    EXPECT_EQ(MEROWirelessDefaultGatewaySet(szGateway), 0);
    EXPECT_EQ(Last(fake::Effects()), "system(" + CommandFor(szGateway, "wlan0") + ")");
  }
}

TEST_F(DefaultGateway, IsSetHoweverTheCommandEnds) {
  for (const int status : {0, 1, 256, 65280, INT_MAX}) {
    fake::system.Returns(status);
    EXPECT_EQ(MEROWirelessDefaultGatewaySet("10.0.0.1"), 0) << status;
  }
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(DefaultGateway, IsNotSetWhenTheCommandCannotBeStarted) {
  for (const int status : {-1, INT_MIN}) {
    fake::Begin();
    fake::MEROWirelessInterfaceGet.Returns("usb7");
    fake::system.Returns(status);
    EXPECT_EQ(MEROWirelessDefaultGatewaySet("10.0.0.1"), -1);
    const std::string command = CommandFor("10.0.0.1", "usb7");
    EXPECT_THAT(Steps(), ElementsAre(kAsksForInterface, "system(" + command + ")",
                                     ReportOf("Failed to execute '" + command + "'")));
  }
}

TEST_F(DefaultGateway, ReachesTheToolUnchangedWhateverItHolds) {
  InstallNoter(kTool);
  for (const std::string& text : kHostileTexts) {
    fake::Begin();
    fake::MEROWirelessInterfaceGet.Returns("wlan0");
    ForgetCalls();
    EXPECT_EQ(MEROWirelessDefaultGatewaySet(text.c_str()), 0) << text;
    EXPECT_THAT(NotedCalls(),
                ElementsAre(Call{"/sbin/route", "add", "default", "gw", text, "metric", "0", "dev", "wlan0"}));
    EXPECT_FALSE(HasIntruder()) << text;
  }
}

TEST_F(DefaultGateway, GoesThroughAnInterfaceOfAnyName) {
  InstallNoter(kTool);
  for (const std::string& text : kHostileTexts) {
    fake::Begin();
    fake::MEROWirelessInterfaceGet.Returns(text.c_str());
    ForgetCalls();
    EXPECT_EQ(MEROWirelessDefaultGatewaySet("10.0.0.1"), 0) << text;
    EXPECT_THAT(NotedCalls(),
                ElementsAre(Call{"/sbin/route", "add", "default", "gw", "10.0.0.1", "metric", "0", "dev", text}));
    EXPECT_FALSE(HasIntruder()) << text;
  }
}

// A command has up to 1023 bytes.
TEST_F(DefaultGateway, IsSetWholeOrNotAtAll) {
  const size_t room = 1023 - CommandFor("", "wlan0").size();
  const std::string longest(room, '1');
  EXPECT_EQ(MEROWirelessDefaultGatewaySet(longest.c_str()), 0);
  EXPECT_EQ(Last(fake::Effects()), "system(" + CommandFor(longest, "wlan0") + ")");

  for (const std::string& text : {longest + "1", std::string(5000, '1'), std::string(room / 4, '\'')}) {
    fake::Begin();
    fake::MEROWirelessInterfaceGet.Returns("wlan0");
    EXPECT_EQ(MEROWirelessDefaultGatewaySet(text.c_str()), -1) << text.size();
    EXPECT_EQ(fake::system.calls(), 0);
    ASSERT_EQ(fake::Messages().size(), 1u);
    const std::string message = WithoutLines(fake::Messages()).front();
    EXPECT_THAT(message,
                testing::StartsWith("wireless_default_gateway_set:# Failed to execute '/sbin/route add default gw "));
    EXPECT_EQ(message.size(), std::string("wireless_default_gateway_set:# Failed to execute ''").size() + 1023);
  }
}

}  // namespace
