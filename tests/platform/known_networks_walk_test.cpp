// Reading the known networks one after another, by the names of a list of them, while others may write to the file.
#include <fcntl.h>
#include <sys/inotify.h>
#include <unistd.h>

#include <filesystem>
#include <memory>

#include "common/known_networks_file.h"
#include "common/paths.h"
#include "tests/platform/containers.h"
#include "tests/platform/platform_test.h"
#include "tests/support/processes.h"

namespace {

using namespace std::string_literals;

std::string NameOf(int i) {
  return "network " + std::to_string(i);
}

std::string TextOf(int i, const std::string& essid) {
  return "[" + NameOf(i) + "]\n\tESSID=" + essid + "\n\tACCESS_TIME=" + std::to_string(i) + "\n";
}

std::string Networks(int count, const std::string& essid = "old") {
  std::string text;
  for (int i = 0; i < count; ++i) text += TextOf(i, essid);
  return text;
}

// Counts how often a file is opened.
class OpenCounter {
 public:
  explicit OpenCounter(const char* szPath) {
    // With what lies between, since equal events in a row become one.
    EXPECT_GE(::inotify_add_watch(watch_, szPath, IN_OPEN | IN_CLOSE), 0) << szPath;
  }
  ~OpenCounter() { ::close(watch_); }

  int Take() {
    int count = 0;
    inotify_event event;  // without a name, as of a file that is watched itself
    while (::read(watch_, &event, sizeof event) == sizeof event) count += (event.mask & IN_OPEN) != 0 ? 1 : 0;
    return count;
  }

 private:
  int watch_ = ::inotify_init1(IN_NONBLOCK | IN_CLOEXEC);
};

// The known networks, as a list of their names has them.
class ListedNetworks {
 public:
  ListedNetworks() : count_(PLIBCFileEnumSection(kKnownNetworksPath, names_.address())) {}

  int count() const { return count_; }
  PPLIBSZLIST names() const { return names_.get(); }
  const char* NameOf(int i) const { return PLIBCSzListGet(names_.get(), i); }
  std::string EssidOf(int i) const { return EssidOfName(NameOf(i)); }

  static std::string EssidOfName(const char* szName) {
    WIRELESS_NETWORK_CONFIG config = {};
    return MEROWirelessConfGet(szName, &config) == 0 ? config.network.szEssid : "(none)";
  }

 private:
  TextList names_;
  int count_;
};

class Walk : public PlatformTest {
 protected:
  void SetUp() override {
    PlatformTest::SetUp();
    std::filesystem::remove_all(kKnownNetworksPath);
  }

  static std::string EssidOf(int i) { return ListedNetworks::EssidOfName(NameOf(i).c_str()); }

  static void WalkOver(int count) {
    const ListedNetworks networks;
    ASSERT_EQ(networks.count(), count);
    for (int i = 0; i < count; ++i) ASSERT_EQ(networks.EssidOf(i), "old") << i;
  }

  // As another process.
  template <class Action>
  static void Elsewhere(Action action) {
    ASSERT_EQ(RunInChild([&] { return action() ? 0 : 1; }), 0);
  }

  static bool Overwrite(off_t offset, std::string_view text) {
    const int fd = ::open(kKnownNetworksPath, O_WRONLY | O_CLOEXEC);
    const ssize_t put = ::pwrite(fd, text.data(), text.size(), offset);
    return ::close(fd) == 0 && put == static_cast<ssize_t>(text.size());
  }

  // Where the name of a network stands in a file of old ones.
  static off_t PlaceOfEssid(int i) { return static_cast<off_t>(Networks(i).size() + TextOf(i, "").find("ESSID=") + 6); }
};

TEST_F(Walk, SeesEveryNetworkOnce) {
  WriteText(kKnownNetworksPath, Networks(100));
  for (int round = 0; round < 3; ++round) WalkOver(100);
}

TEST_F(Walk, ReadsTheFileOnceHoweverManyNetworksThereAre) {
  for (const int count : {1, 2, 100, 10'000}) {
    WriteText(kKnownNetworksPath, Networks(count));
    for (int round = 0; round < 3; ++round) {
      OpenCounter opens(kKnownNetworksPath);
      WalkOver(count);
      EXPECT_EQ(opens.Take(), 1) << count << " networks, round " << round;
    }
  }
}

// Each name that repeats another had the file read, which took seconds for some thousands of them.
TEST_F(Walk, ReadsTheFileOnceHoweverOftenANameRepeats) {
  std::string text;
  for (int i = 0; i < 100; ++i) text += TextOf(0, i == 0 ? "old" : "second");
  WriteText(kKnownNetworksPath, text);
  OpenCounter opens(kKnownNetworksPath);
  WalkOver(100);
  EXPECT_EQ(opens.Take(), 1);
}

TEST_F(Walk, ReadsTheFileForANameThatIsNotTheListsOwn) {
  WriteText(kKnownNetworksPath, Networks(4));
  const ListedNetworks networks;
  OpenCounter opens(kKnownNetworksPath);
  EXPECT_EQ(EssidOf(2), "old");
  EXPECT_EQ(opens.Take(), 1);
  EXPECT_EQ(ListedNetworks::EssidOfName(networks.NameOf(2) + 1), "(none)");
  EXPECT_EQ(opens.Take(), 1);
}

// It was kept until as many networks were asked for as there are, whatever became of the list.
TEST_F(Walk, KeepsNothingOfTheFileBehindTheList) {
  WriteText(kKnownNetworksPath, Networks(4));
  OpenCounter opens(kKnownNetworksPath);
  std::string name;
  {
    const ListedNetworks networks;
    name = networks.NameOf(1);
    EXPECT_EQ(networks.EssidOf(0), "old");
  }
  EXPECT_EQ(opens.Take(), 1);
  EXPECT_EQ(ListedNetworks::EssidOfName(name.c_str()), "old");
  EXPECT_EQ(opens.Take(), 1);
}

TEST_F(Walk, SeesOneAndTheSameFileThroughoutWhateverAnotherProcessWrites) {
  WriteText(kKnownNetworksPath, Networks(4));
  Elsewhere([] { return Overwrite(PlaceOfEssid(0), "new"); });
  const ListedNetworks networks;
  EXPECT_EQ(networks.EssidOf(0), "new") << "written before the list was made";
  Elsewhere([] { return Overwrite(PlaceOfEssid(1), "new"); });
  EXPECT_EQ(networks.EssidOf(1), "old") << "written over since";
  Elsewhere(
      [] { return PLIBCFileSetSectionValue(kKnownNetworksPath, NameOf(2).c_str(), "ESSID", "new", "\t%s=%s\n") == 0; });
  EXPECT_EQ(networks.EssidOf(2), "old") << "replaced since";
  std::filesystem::remove(kKnownNetworksPath);
  EXPECT_EQ(networks.EssidOf(3), "old") << "removed since";
  EXPECT_EQ(EssidOf(3), "(none)");
}

TEST_F(Walk, IsOfTheFileAsItWasWhenItsOwnListWasMade) {
  WriteText(kKnownNetworksPath, Networks(2, "old"));
  auto before = std::make_unique<ListedNetworks>();
  WriteText(kKnownNetworksPath, Networks(2, "new"));
  const ListedNetworks behind;
  EXPECT_EQ(before->EssidOf(0), "old");
  EXPECT_EQ(behind.EssidOf(0), "new");
  EXPECT_EQ(before->EssidOf(1), "old");
  before.reset();
  EXPECT_EQ(behind.EssidOf(1), "new");
}

TEST_F(Walk, GoesOnBehindANameThatIsTakenOutOfTheList) {
  WriteText(kKnownNetworksPath, Networks(4));
  const ListedNetworks networks;
  EXPECT_EQ(networks.EssidOf(0), "old");
  ASSERT_EQ(PLIBCSzListRemove(networks.names(), 1), 0);
  WriteText(kKnownNetworksPath, "");
  for (const int i : {1, 2, 0}) EXPECT_EQ(networks.EssidOf(i), "old") << i;
}

TEST_F(Walk, ReadsTheFileForNamesThatWereAddedToAList) {
  WriteText(kKnownNetworksPath, Networks(2, "old"));
  const ListedNetworks networks;
  WriteText(kKnownNetworksPath, Networks(2, "new"));
  PPLIBSZLIST list = networks.names();
  ASSERT_EQ(PLIBCFileEnumSection(kKnownNetworksPath, &list), 2);
  const char* const essids[] = {"old", "old", "new", "new"};
  for (int i = 0; i < 4; ++i) EXPECT_EQ(networks.EssidOf(i), essids[i]) << i;
}

// A list that had kept an empty file kept the next one beside it, and looking into it never came to an end.
TEST_F(Walk, IsOfTheFileThatHasNetworksWhereTheSameListWasOfAnEmptyOne) {
  WriteText(kKnownNetworksPath, "");
  const ListedNetworks networks;
  ASSERT_EQ(networks.count(), 0);
  WriteText(kKnownNetworksPath, Networks(2, "old"));
  PPLIBSZLIST list = networks.names();
  ASSERT_EQ(PLIBCFileEnumSection(kKnownNetworksPath, &list), 2);
  WriteText(kKnownNetworksPath, Networks(2, "new"));
  ::alarm(10);  // a walk without an end is to fail, and not to last
  EXPECT_EQ(networks.EssidOf(1), "old");
  EXPECT_EQ(EssidOf(1), "new");
  ::alarm(0);
}

TEST_F(Walk, IsNotLedAstrayByTheNamesOfAnotherFile) {
  constexpr char kOther[] = "/tmp/platform/other";
  WriteText(kOther, Networks(2, "other"));
  WriteText(kKnownNetworksPath, Networks(2));
  TextList names;
  ASSERT_EQ(PLIBCFileEnumSection(kOther, names.address()), 2);
  EXPECT_EQ(ListedNetworks::EssidOfName(PLIBCSzListGet(names.get(), 1)), "old");
}

TEST_F(Walk, FindsTheFirstSectionOfANameWhateverItsCase) {
  WriteText(kKnownNetworksPath, TextOf(0, "old") + "[NETWORK 1]\n\tESSID=old\n" + TextOf(1, "second"));
  WalkOver(3);
}

// Such a name was listed up to its NUL, and then found the section that really bears that name: a network was there
// twice.
TEST_F(Walk, LeavesOutANameThatNoneCanAskFor) {
  WriteText(kKnownNetworksPath, "[c\0b]\n\tESSID=other\n[c]\n\tESSID=old\n"s);
  TextList names;
  ASSERT_EQ(PLIBCFileEnumSection(kKnownNetworksPath, names.address()), 1);
  EXPECT_EQ(ListedNetworks::EssidOfName(PLIBCSzListGet(names.get(), 0)), "old");
}

TEST_F(Walk, FindsNetworksInAnyOrderAndNoneThatIsNotThere) {
  WriteText(kKnownNetworksPath, Networks(10));
  const ListedNetworks networks;
  for (const int i : {0, 5, 3, 3, 0, 9, 2, 1, 9, 9, 0, 4}) EXPECT_EQ(networks.EssidOf(i), "old") << i;
  for (const int i : {0, 5, 3, 3, 0, 11, 9, 2, 10}) EXPECT_EQ(EssidOf(i), i < 10 ? "old" : "(none)") << i;
}

}  // namespace
