// IPv4 addresses as text.
#include <arpa/inet.h>

#include "tests/platform/platform_test.h"

namespace {

class Address : public PlatformTest {};

TEST_F(Address, IsAHostOfTheSubnetOfAnother) {
  const struct {
    const char* szAddress;
    const char* szReference;
    const char* szMask;
    int same;
  } rows[] = {
      {"10.1.14.2", "10.1.14.1", "255.255.255.0", 1},
      {"10.1.14.1", "10.1.14.1", "255.255.255.0", 1},
      {"10.1.14.254", "10.1.14.0", "255.255.255.0", 1},
      {"10.1.15.2", "10.1.14.1", "255.255.255.0", 0},
      {"10.1.14.0", "10.1.14.1", "255.255.255.0", 0},
      {"10.1.14.255", "10.1.14.1", "255.255.255.0", 0},
      {"10.1.15.255", "10.1.14.1", "255.255.254.0", 0},
      {"10.1.14.255", "10.1.14.1", "255.255.254.0", 1},
      {"10.1.15.0", "10.1.14.1", "255.255.254.0", 1},
      {"192.168.1.129", "192.168.1.130", "255.255.255.128", 1},
      {"192.168.1.127", "192.168.1.130", "255.255.255.128", 0},
      {"192.168.1.128", "192.168.1.130", "255.255.255.128", 0},
      {"192.168.1.5", "192.168.1.6", "255.255.255.252", 1},
      {"192.168.1.4", "192.168.1.6", "255.255.255.252", 0},
      {"192.168.1.7", "192.168.1.6", "255.255.255.252", 0},
      {"192.168.1.4", "192.168.1.5", "255.255.255.254", 1},
      {"192.168.1.5", "192.168.1.4", "255.255.255.254", 1},
      {"192.168.1.6", "192.168.1.5", "255.255.255.254", 0},
      {"192.168.1.5", "192.168.1.5", "255.255.255.255", 1},
      {"192.168.1.4", "192.168.1.5", "255.255.255.255", 0},
      {"8.8.8.8", "10.0.0.1", "0.0.0.0", 1},
      {"0.0.0.0", "10.0.0.1", "0.0.0.0", 0},
      {"255.255.255.255", "10.0.0.1", "0.0.0.0", 0},
      {"200.1.1.1", "200.2.2.2", "255.0.0.0", 1},
  };
  for (const auto& row : rows) {
    EXPECT_EQ(MERONetIsSameSubnet(row.szAddress, row.szReference, row.szMask), row.same)
        << row.szAddress << " " << row.szReference << " " << row.szMask;
  }
}

TEST_F(Address, IsNoHostWhenATextIsNoAddress) {
  for (const char* szJunk :
       {"", " ", "10.1.14", "10.1", "10", "10.1.14.256", "10.1.14.-2", "10.1.14.2 ", " 10.1.14.2", "10.1.14.2.3",
        "10..14.2", "10.1.14.2/24", "0x0a.1.14.2", "010.1.14.2", "host", "::1", "10.1.14.2\n", "99999999999.1.1.1"}) {
    EXPECT_EQ(MERONetIsSameSubnet(szJunk, "10.1.14.1", "255.255.255.0"), 0) << szJunk;
    EXPECT_EQ(MERONetIsSameSubnet("10.1.14.2", szJunk, "255.255.255.0"), 0) << szJunk;
    EXPECT_EQ(MERONetIsSameSubnet("10.1.14.2", "10.1.14.1", szJunk), 0) << szJunk;
  }
}

TEST_F(Address, IsNoHostUnderAMaskWithHoles) {
  for (const char* szMask : {"255.0.255.0", "0.255.255.255", "255.255.255.1", "0.0.0.1", "255.255.253.0"}) {
    EXPECT_EQ(MERONetIsSameSubnet("10.1.14.2", "10.1.14.2", szMask), 0) << szMask;
  }
}

TEST_F(Address, ThatIsNullIsNoHost) {
  EXPECT_EQ(MERONetIsSameSubnet(nullptr, "10.1.14.1", "255.255.255.0"), 0);
  EXPECT_EQ(MERONetIsSameSubnet("10.1.14.2", nullptr, "255.255.255.0"), 0);
  EXPECT_EQ(MERONetIsSameSubnet("10.1.14.2", "10.1.14.1", nullptr), 0);
  TakeLog();  // reported or not, as the refusal of null or as what is no address
}

TEST_F(Address, IsWrittenInDottedForm) {
  for (const char* szAddress : {"0.0.0.0", "10.1.14.1", "255.255.255.255", "1.2.3.4"}) {
    in_addr address;
    ASSERT_EQ(::inet_pton(AF_INET, szAddress, &address), 1);
    EXPECT_STREQ(MERONetNtoa(address), szAddress);
  }
}

}  // namespace
