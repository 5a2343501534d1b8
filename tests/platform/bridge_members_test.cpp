// The bridges that the kernel has.
#include <deque>

#include "tests/platform/containers.h"
#include "tests/platform/network_interfaces.h"
#include "tests/platform/platform_test.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class KernelBridge : public PlatformTest {
 protected:
  void SetUp() override {
    PlatformTest::SetUp();
    Shell("ip link add br7 type bridge");
  }
  void TearDown() override {
    Shell("ip link delete br7");
    PlatformTest::TearDown();
  }
};

TEST_F(KernelBridge, ListsItsMembersInOrder) {
  const NetworkInterface interfaces[] = {NetworkInterface("net10"), NetworkInterface("net2"), NetworkInterface("other"),
                                         NetworkInterface("eth9")};
  TextList list;
  EXPECT_EQ(PLIBNetBridgeSlaveEnum("br7", list.address()), 0);
  EXPECT_THAT(list.items(), IsEmpty());

  for (const char* szMember : {"net10", "eth9", "net2"}) Shell(std::string("ip link set master br7 ") + szMember);
  EXPECT_EQ(PLIBNetBridgeSlaveEnum("br7", list.address()), 3);
  EXPECT_THAT(list.items(), ElementsAre("eth9", "net2", "net10"));

  Shell("ip link set nomaster net2");
  TextList after;
  EXPECT_EQ(PLIBNetBridgeSlaveEnum("br7", after.address()), 2);
  EXPECT_THAT(after.items(), ElementsAre("eth9", "net10"));
}

TEST_F(KernelBridge, AppendsToWhatTheListHolds) {
  const NetworkInterface interfaces[] = {NetworkInterface("net2"), NetworkInterface("net1")};
  for (const char* szMember : {"net1", "net2"}) Shell(std::string("ip link set master br7 ") + szMember);
  WriteText(kFile, "[zebra]\n[apple]\n");
  TextList list;
  ASSERT_EQ(PLIBCFileEnumSection(kFile, list.address()), 2);
  EXPECT_EQ(PLIBNetBridgeSlaveEnum("br7", list.address()), 2);
  EXPECT_THAT(list.items(), ElementsAre("zebra", "apple", "net1", "net2"));
}

TEST_F(KernelBridge, ListsMoreMembersThanTheListHasRoomForAtFirst) {
  std::vector<std::string> names;
  std::deque<NetworkInterface> interfaces;
  for (int i = 0; i < 10; ++i) {
    names.push_back("m" + std::to_string(i));
    interfaces.emplace_back(names.back());
    Shell("ip link set master br7 " + names.back());
  }
  PPLIBSZLIST list = PLIBCSzListAlloc(0);
  EXPECT_EQ(PLIBNetBridgeSlaveEnum("br7", &list), 10);
  EXPECT_EQ(list->nItem, 10);
  for (int i = 0; i < 10; ++i) EXPECT_EQ(PLIBCSzListGet(list, i), names[static_cast<size_t>(i)]);
  PLIBCSzListFree(list);
}

// It was a failure, so that an access point's bridge that was gone from the kernel stayed one of those made at boot.
TEST_F(KernelBridge, ThatTheKernelDoesNotKnowHasNoMembers) {
  const NetworkInterface interface("net2");
  TextList list;
  for (const char* szName : {"br8", "net2", "lo", "fifteen-letters"}) {
    EXPECT_EQ(PLIBNetBridgeSlaveEnum(szName, list.address()), 0) << szName;
  }
  EXPECT_THAT(list.items(), IsEmpty());
}

TEST_F(KernelBridge, IsNoneWhenTheKernelCanHaveNoneOfThatName) {
  TextList list;
  for (const char* szName : {"", ".", "..", "br7/", "../net/br7", "br7 ", "br7:1", "a-name-of-sixteen-or-more"}) {
    EXPECT_EQ(PLIBNetBridgeSlaveEnum(szName, list.address()), -1) << szName;
    ExpectFailure(ERR_NO_DEVICE, "Failed to list the members of " + std::string(szName) + ": No such device");
  }
  EXPECT_THAT(list.items(), IsEmpty());
}

TEST_F(KernelBridge, WithoutANameOrAListIsRefused) {
  TextList list;
  PPLIBSZLIST none = nullptr;
  EXPECT_EQ(PLIBNetBridgeSlaveEnum(nullptr, list.address()), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBNetBridgeSlaveEnum("br7", nullptr), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBNetBridgeSlaveEnum("br7", &none), -1);
  ExpectNullRefused();
}

}  // namespace
