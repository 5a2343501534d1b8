// Addressing an interface: what it has afterwards.
#include <dlfcn.h>
#include <linux/netlink.h>
#include <sys/socket.h>
#include <sys/stat.h>

#include <cerrno>
#include <filesystem>
#include <string>

#include "common/text.h"
#include "tests/platform/network_interfaces.h"
#include "tests/platform/platform_test.h"
#include "tests/platform/simulated_radio.h"

namespace {

using testing::HasSubstr;

// Which of the changes that the kernel is asked for, counted from 1, it refuses; 0 for none.
int g_refused = 0;

}  // namespace

// In place of libc's: the kernel gets an address of another protocol to add or delete, which it refuses.
extern "C" ssize_t send(int fd, const void* message, size_t size, int flags) {
  static const auto next = reinterpret_cast<ssize_t (*)(int, const void*, size_t, int)>(::dlsym(RTLD_NEXT, "send"));
  const auto& header = *static_cast<const nlmsghdr*>(message);
  const bool isChange = (header.nlmsg_flags & NLM_F_ACK) != 0;
  if (g_refused > 0 && isChange && --g_refused == 0) {
    errno = ENOBUFS;
    return -1;
  }
  return next(fd, message, size, flags);
}

namespace {

constexpr char kScript[] = "/etc/sysconfig/network-scripts/ifcfg-net0";

NETINFO Static(const char* szIp, const char* szMask) {
  NETINFO netInfo{};
  netInfo.blManual = TRUE;
  CopyText(netInfo.szInterface, "net0");
  CopyText(netInfo.szIp, szIp);
  CopyText(netInfo.szMask, szMask);
  return netInfo;
}

int Set(const NETINFO& netInfo) {
  return MERONetSetCard1(&netInfo, 0);
}

class ACard : public PlatformTest {
 protected:
  void SetUp() override {
    PlatformTest::SetUp();
    std::filesystem::remove_all("/etc/sysconfig");
    Shell("ip link set net0 up");
  }

  // All that the kernel tells of its addresses, in order of their texts.
  static std::string Told() {
    return Shell("ip -4 -o address show dev net0 | sed 's/^[0-9]*: //; s/ *\\\\.*//; s/  */ /g' | sort");
  }

  const NetworkInterface interface_{"net0"};
};

// It got the mask of its class, another address got the wanted one, and the result was success.
TEST_F(ACard, ThatHasOtherAddressesIsLeftWithTheWantedOneAlone) {
  const char* const others[] = {
      "10.9.0.1/24",
      "10.9.0.2/8",
      "10.9.0.2/24 broadcast 10.9.0.7",
      "10.9.0.2/24 broadcast + label net0:1",
      "10.9.0.2/32",
      "192.0.2.1 peer 192.0.2.2",
  };
  for (const char* szFirst : others) {
    for (const char* szSecond : others) {
      for (const bool promotes : {false, true}) {
        Shell("ip -4 address flush dev net0; echo " + std::to_string(promotes) +
              " >/proc/sys/net/ipv4/conf/net0/promote_secondaries");
        Shell(std::string("ip address add dev net0 ") + szFirst);
        Shell(std::string("ip address replace dev net0 ") + szSecond);
        EXPECT_EQ(Set(Static("10.9.0.2", "255.255.255.0")), 0);
        EXPECT_EQ(Told(), "net0 inet 10.9.0.2/24 brd 10.9.0.255 scope global net0\n") << szFirst << ", " << szSecond;
      }
    }
  }
}

TEST_F(ACard, KeepsTheAddressThatItHasAndTheRoutesThatGoWithIt) {
  Shell(
      "ip address add 10.9.0.2/24 broadcast + dev net0 && ip route add default via 10.9.0.1 &&"
      " ip address add 10.9.0.7/24 dev net0 && ip address add 10.1.1.1/16 dev net0");
  EXPECT_EQ(Set(Static("10.9.0.2", "255.255.255.0")), 0);
  EXPECT_EQ(interface_.addresses(), "10.9.0.2/24 ");
  EXPECT_THAT(Shell("ip route show default"), HasSubstr("via 10.9.0.1 dev net0"));
}

TEST_F(ACard, WhoseScriptHasNoDirectoryIsReported) {
  WriteText("/etc/sysconfig", "no directory");
  EXPECT_EQ(Set(Static("10.9.0.2", "255.255.255.0")), -1);
  ExpectFailure(ERR_FILE_NOT_FOUND, "Failed to make /etc/sysconfig/network-scripts: Not a directory");
  std::filesystem::remove("/etc/sysconfig");
}

TEST_F(ACard, KeepsForGoodAnAddressThatWasLent) {
  Shell("ip address add 10.9.0.2/24 broadcast + dev net0 valid_lft 100 preferred_lft 100");
  EXPECT_EQ(Set(Static("10.9.0.2", "255.255.255.0")), 0);
  EXPECT_THAT(Shell("ip address show dev net0"), HasSubstr("valid_lft forever"));
}

TEST_F(ACard, HasABroadcastAddressWhereItsSubnetHasOne) {
  const struct {
    const char* szMask;
    const char* szTold;
  } rows[] = {
      {"255.0.0.0", "10.9.0.2/8 brd 10.255.255.255"},
      {"255.255.255.252", "10.9.0.2/30 brd 10.9.0.3"},
      {"255.255.255.254", "10.9.0.2/31"},
      {"255.255.255.255", "10.9.0.2/32"},
  };
  for (const auto& row : rows) {
    EXPECT_EQ(Set(Static("10.9.0.2", row.szMask)), 0);
    EXPECT_EQ(Told(), std::string("net0 inet ") + row.szTold + " scope global net0\n");
  }
}

TEST_F(ACard, IsBroughtUpAndNotedDown) {
  Shell("ip link set net0 down");
  EXPECT_EQ(Set(Static("10.9.0.2", "255.255.255.0")), 0);
  EXPECT_EQ(interface_.flags() & 1u, 1u);
  EXPECT_EQ(ReadText(kScript), "DEVICE=net0\nBOOTPROTO=static\nIPADDR=10.9.0.2\nNETMASK=255.255.255.0\n");
}

TEST_F(ACard, IsNotedDownInDirectoriesOfTheSameModeWhateverTheUmask) {
  for (const mode_t mask : {0u, 077u}) {
    std::filesystem::remove_all("/etc/sysconfig");
    ::umask(mask);
    EXPECT_EQ(Set(Static("10.9.0.2", "255.255.255.0")), 0);
    ::umask(022);
    EXPECT_EQ(ModeOf("/etc/sysconfig"), 0755u) << mask;
    EXPECT_EQ(ModeOf("/etc/sysconfig/network-scripts"), 0755u) << mask;
  }
}

TEST_F(ACard, StaysAsItIsWhenTheAddressIsNone) {
  Shell("ip address add 10.1.1.1/16 dev net0");
  const struct {
    const char* szIp;
    const char* szMask;
    const char* szReport;
  } rows[] = {
      {"10.9.0.0", "255.255.255.0", "'10.9.0.0' is no address for net0"},
      {"10.9.0.255", "255.255.255.0", "'10.9.0.255' is no address for net0"},
      {"0.0.0.0", "255.255.255.0", "'0.0.0.0' is no address for net0"},
      {"10.9.0.2", "0.0.0.0", "'0.0.0.0' is no netmask for net0"},
      {"10.9.0.2", "255.0.255.0", "'255.0.255.0' is no netmask for net0"},
  };
  for (const auto& row : rows) {
    EXPECT_EQ(Set(Static(row.szIp, row.szMask)), -1);
    ExpectFailure(ERR_BAD_PARAMETERS, row.szReport);
    EXPECT_EQ(interface_.addresses(), "10.1.1.1/16 ");
  }
}

TEST_F(ACard, ThatCannotBeAddressedHasTheAddressesThatItHad) {
  const char* const given[] = {
      "10.1.1.1/16 broadcast +", "10.9.0.2/8", "10.9.0.2/24", "10.9.0.9/24 label net0:1", "192.0.2.1 peer 192.0.2.2",
  };
  int refused = 1;
  while (true) {
    Shell("ip -4 address flush dev net0; echo 0 >/proc/sys/net/ipv4/conf/net0/promote_secondaries");
    for (const char* szAddress : given) Shell(std::string("ip address add dev net0 ") + szAddress);
    const std::string before = Told();
    g_refused = refused;
    const int result = Set(Static("10.9.0.2", "255.255.255.0"));
    const bool wasRefused = g_refused == 0;
    g_refused = 0;
    if (!wasRefused) {
      EXPECT_EQ(result, 0);
      break;
    }
    EXPECT_EQ(result, -1);
    ExpectFailure(ERR_UNKNOWN, "Failed to address net0: No buffer space available");
    EXPECT_EQ(Told(), before) << refused;
    ++refused;
  }
  EXPECT_EQ(refused, 8);  // the wanted one twice, the five that were there, and one more that was not reached
}

TEST_F(ACard, ThatKeepsAnAddressWhenItIsDisconnectedIsReported) {
  const ShownInterfaces shown({{"lo", ""}, {"net0", "phy80211"}});
  const SimulatedDriver driver("net0");
  Shell("ip address add 10.1.1.1/16 dev net0");
  g_refused = 1;
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), -1);
  ExpectFailure(ERR_UNKNOWN, "Failed to remove the addresses of net0: No buffer space available");
}

TEST_F(ACard, ThatKeepsItsDhcpClientIsReported) {
  const std::filesystem::path pidFile = "/var/run/udhcpc-net0.pid";
  std::filesystem::create_directory(pidFile);
  EXPECT_EQ(Set(Static("10.9.0.2", "255.255.255.0")), -1);
  ExpectFailure(ERR_BAD_PARAMETERS, "Failed to end the DHCP client of net0: Invalid argument");
  EXPECT_EQ(interface_.addresses(), "");
  std::filesystem::remove(pidFile);
}

TEST_F(ACard, ThatIsNotThereIsReported) {
  NETINFO netInfo{};  // for DHCP
  CopyText(netInfo.szInterface, "none0");
  EXPECT_EQ(Set(netInfo), -1);
  ExpectFailure(ERR_NO_DEVICE, "Failed to bring up none0: No such device");
  netInfo = Static("10.9.0.2", "255.255.255.0");
  for (const char* szName : {"none0", "", "fifteen-letters"}) {
    CopyText(netInfo.szInterface, szName);
    EXPECT_EQ(Set(netInfo), -1);
    ExpectFailure(ERR_NO_DEVICE, "Failed to address " + std::string(szName) + ": No such device");
  }
}

}  // namespace
