// A save on a disk that is full.
#include <filesystem>

#include "tests/fault/saving.h"
#include "tests/platform/platform_test.h"

namespace {

using testing::ElementsAre;

constexpr char kReason[] = "Failed to write /usr/mero/etc/wireless.conf: No space left on device";

class AFullDisk : public PlatformTest {
 protected:
  // Fills what is left of the disk, and gives the store as it is then.
  static std::string Fill() {
    const auto left = std::filesystem::space(kStoreDirectory).available;
    WriteText("/usr/mero/etc/ballast", std::string(static_cast<size_t>(left), 'x'));
    return ReadText(kStore);
  }

  static int Save(const WIRELESS_NETWORK_CONFIG& network) { return MEROWirelessConfSet(&network); }
};

TEST_F(AFullDisk, LetsNoKnownNetworkBeSavedAndKeepsWhatIsThere) {
  const MemoryFileSystem disk(kStoreDirectory, "size=16k");
  Prepare(Savings().front());
  const std::string before = Fill();
  EXPECT_EQ(Save(NetworkOf(2, "new secret")), -1);
  EXPECT_THAT(TakeLog(), ElementsAre(Says(kReason), SaysAt("wireless_conf_set", 67,
                                                           "Failed to set section: " + SectionOf(2) +
                                                               " from /usr/mero/etc/wireless.conf, errno=0x500")));
  EXPECT_EQ(ReadText(kStore), before);
  EXPECT_THAT(NamesIn(kStoreDirectory), ElementsAre("ballast", "wireless.conf"));
}

TEST_F(AFullDisk, LetsNoOtherNetworkBeSavedAndKeepsWhatIsThere) {
  const MemoryFileSystem disk(kStoreDirectory, "size=16k");
  Prepare(Savings().front());
  const std::string before = Fill();
  EXPECT_EQ(Save(NetworkOf(4)), -1);
  EXPECT_THAT(TakeLog(), ElementsAre(Says(kReason), SaysAt("wireless_conf_set", 72,
                                                           "Failed to add section: " + SectionOf(4) +
                                                               " from /usr/mero/etc/wireless.conf, errno=0x500")));
  EXPECT_EQ(ReadText(kStore), before);
  EXPECT_THAT(NamesIn(kStoreDirectory), ElementsAre("ballast", "wireless.conf"));
}

TEST_F(AFullDisk, LetsAStoreBeSavedToAgainOnceThereIsRoom) {
  const MemoryFileSystem disk(kStoreDirectory, "size=16k");
  Prepare(Savings().front());
  Fill();
  EXPECT_EQ(Save(NetworkOf(4)), -1);
  TakeLog();
  EXPECT_EQ(PLIBCSysUnlink("/usr/mero/etc/ballast"), 0);
  EXPECT_EQ(Save(NetworkOf(4)), 0);
  EXPECT_THAT(NamesIn(kStoreDirectory), ElementsAre("wireless.conf"));
}

TEST_F(AFullDisk, FillsUpWithoutLosingANetwork) {
  const MemoryFileSystem disk(kStoreDirectory, "size=32k");
  std::string before;
  int saved = 0;
  while (Save(NetworkOf(saved)) == 0) {
    before = ReadText(kStore);
    ++saved;
    ASSERT_LT(saved, 1000);
  }
  EXPECT_GT(saved, 10);
  EXPECT_EQ(TakeLog().size(), 2u);
  EXPECT_EQ(PLIBCErrGet(), ERR_NO_SPACE);
  EXPECT_EQ(ReadText(kStore), before);
  EXPECT_THAT(NamesIn(kStoreDirectory), ElementsAre("wireless.conf"));
}

TEST_F(AFullDisk, LetsNoStoreBeMade) {
  const MemoryFileSystem disk(kStoreDirectory, "nr_inodes=1");
  EXPECT_EQ(Save(NetworkOf(1)), -1);
  EXPECT_THAT(TakeLog(), ElementsAre(Says("Failed to create /usr/mero/etc/wireless.conf: No space left on device"),
                                     SaysAt("wireless_conf_set", 47, "Failed to touch /usr/mero/etc/wireless.conf")));
  EXPECT_THAT(NamesIn(kStoreDirectory), ElementsAre());
}

}  // namespace
