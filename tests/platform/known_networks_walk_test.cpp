// Reading the known networks one after another, from the first to the last, while others may write to the file.
#include <fcntl.h>
#include <sys/inotify.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <ctime>
#include <filesystem>
#include <thread>
#include <utility>

#include "common/known_networks_file.h"
#include "common/paths.h"
#include "tests/platform/containers.h"
#include "tests/platform/platform_test.h"
#include "tests/support/processes.h"

namespace {

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

class Walk : public PlatformTest {
 protected:
  void SetUp() override {
    PlatformTest::SetUp();
    std::filesystem::remove_all(kKnownNetworksPath);
  }

  static std::string EssidOf(int i) {
    WIRELESS_NETWORK_CONFIG config = {};
    return MEROWirelessConfGet(NameOf(i).c_str(), &config) == 0 ? config.network.szEssid : "(none)";
  }

  static void WalkOver(int count) {
    for (int i = 0; i < count; ++i) ASSERT_EQ(EssidOf(i), "old") << i;
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
};

TEST_F(Walk, SeesEveryNetworkOnce) {
  WriteText(kKnownNetworksPath, Networks(100));
  LetSettle(kKnownNetworksPath);
  for (int round = 0; round < 3; ++round) WalkOver(100);
}

TEST_F(Walk, ReadsTheFileOnceAndKeepsNothingOfItBehindTheLastNetwork) {
  for (const int count : {1, 2, 100}) {
    WriteText(kKnownNetworksPath, Networks(count));
    LetSettle(kKnownNetworksPath);
    for (int round = 0; round < 3; ++round) {
      OpenCounter opens(kKnownNetworksPath);
      WalkOver(count);
      EXPECT_EQ(opens.Take(), 1) << count << " networks, round " << round;
    }
  }
}

TEST_F(Walk, KeepsNothingBehindTheLastNetworkOfAnyFile) {
  const std::string_view contents[] = {
      "[a]\n[b]\n[a]\n",          "[a]\n[a]\n[a]\n", "[a]\n[b]\n[B]\n", "junk\nKEY=value\n[a]\n[]\n[ b ]\n",
      {"[a]\n[b\0c]\n[d]\n", 14},
  };
  for (const std::string_view content : contents) {
    WriteText(kKnownNetworksPath, content);
    LetSettle(kKnownNetworksPath);
    for (int round = 0; round < 3; ++round) {
      TextList names;
      ASSERT_EQ(PLIBCFileEnumSection(kKnownNetworksPath, names.address()), names.get()->nItem);
      OpenCounter opens(kKnownNetworksPath);
      for (int i = 0; i < names.get()->nItem; ++i) {
        WIRELESS_NETWORK_CONFIG config;
        (void)MEROWirelessConfGet(PLIBCSzListGet(names.get(), i), &config);
        if (i > 0) continue;
        EXPECT_EQ(opens.Take(), 1) << "nothing was there to take the first from: " << content << ", round " << round;
      }
    }
  }
}

TEST_F(Walk, SeesAFileThatAnotherProcessPutInPlace) {
  WriteText(kKnownNetworksPath, Networks(4));
  LetSettle(kKnownNetworksPath);
  WalkOver(2);
  Elsewhere(
      [] { return PLIBCFileSetSectionValue(kKnownNetworksPath, NameOf(2).c_str(), "ESSID", "new", "\t%s=%s\n") == 0; });
  EXPECT_EQ(EssidOf(2), "new");
  EXPECT_EQ(EssidOf(3), "old");
}

TEST_F(Walk, SeesAnEditOfTheFileByAnotherProcess) {
  WriteText(kKnownNetworksPath, Networks(4));
  LetSettle(kKnownNetworksPath);
  WalkOver(2);
  const auto essid = static_cast<off_t>(Networks(2).size() + TextOf(2, "").find("ESSID=") + 6);
  Elsewhere([&] { return Overwrite(essid, "new"); });
  EXPECT_EQ(EssidOf(2), "new");
  EXPECT_EQ(EssidOf(3), "old");
}

// Two files may well have been written in one tick, and be equal in everything but what they hold.
TEST_F(Walk, SeesThatALinkWasTurnedToAnotherFile) {
  const auto changed = [](const char* szPath) {
    struct stat info = {};
    EXPECT_EQ(::stat(szPath, &info), 0);
    return std::pair(info.st_ctim.tv_sec, info.st_ctim.tv_nsec);
  };
  constexpr char kOld[] = "/tmp/platform/old";
  constexpr char kNew[] = "/tmp/platform/new";
  do {
    std::filesystem::remove(kOld);
    std::filesystem::remove(kNew);
    WriteText(kOld, Networks(4, "old"));
    WriteText(kNew, Networks(4, "new"));
  } while (changed(kOld) != changed(kNew));
  std::filesystem::create_symlink(kOld, kKnownNetworksPath);
  LetSettle(kKnownNetworksPath);
  WalkOver(2);
  std::filesystem::remove(kKnownNetworksPath);
  std::filesystem::create_symlink(kNew, kKnownNetworksPath);
  EXPECT_EQ(EssidOf(2), "new");
}

// File times advance in ticks, so that of two edits within one the second may not show in them.
TEST_F(Walk, SeesAnEditThatComesRightBehindAnother) {
  const auto essid = static_cast<off_t>(Networks(1).size() + TextOf(1, "").find("ESSID=") + 6);
  for (int round = 0; round < 200; ++round) {
    WriteText(kKnownNetworksPath, Networks(4));
    ASSERT_EQ(EssidOf(0), "old");
    ASSERT_TRUE(Overwrite(essid, "new"));
    ASSERT_EQ(EssidOf(1), "new") << round;
  }
}

TEST_F(Walk, SeesThatTheFileWasRemovedOrEmptied) {
  WriteText(kKnownNetworksPath, Networks(4));
  LetSettle(kKnownNetworksPath);
  WalkOver(2);
  std::filesystem::rename(kKnownNetworksPath, "/usr/mero/etc/aside");
  EXPECT_EQ(EssidOf(2), "(none)");
  std::filesystem::rename("/usr/mero/etc/aside", kKnownNetworksPath);
  WalkOver(2);
  WriteText(kKnownNetworksPath, "");
  EXPECT_EQ(EssidOf(2), "(none)");
}

TEST_F(Walk, FindsASectionWhateverItsCaseAndTheFirstOfItsName) {
  WriteText(kKnownNetworksPath,
            TextOf(0, "old") + "[NETWORK 1]\n\tESSID=old\n" + TextOf(1, "second") + TextOf(2, "old"));
  LetSettle(kKnownNetworksPath);
  WalkOver(3);
}

TEST_F(Walk, FindsNetworksInAnyOrderAndNoneThatIsNotThere) {
  WriteText(kKnownNetworksPath, Networks(10));
  LetSettle(kKnownNetworksPath);
  for (const int i : {0, 5, 3, 3, 0, 11, 9, 2, 10, 1, 9, 9, 0, 4})
    EXPECT_EQ(EssidOf(i), i < 10 ? "old" : "(none)") << i;
}

TEST_F(Walk, TakesTimeInProportionToTheNumberOfNetworks) {
  const auto seconds = [](int count) {
    WriteText(kKnownNetworksPath, Networks(count));
    LetSettle(kKnownNetworksPath);
    double least = 1e9;
    for (int round = 0; round < 3; ++round) {
      timespec begin;
      timespec end;
      ::clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &begin);
      WalkOver(count);
      ::clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &end);
      least = std::min(least, static_cast<double>(end.tv_sec - begin.tv_sec) +
                                  static_cast<double>(end.tv_nsec - begin.tv_nsec) / 1e9);
    }
    return least;
  };
  EXPECT_LT(seconds(10'000), 40 * seconds(1'000));  // a hundred times as long, were each a reading of its own
}

}  // namespace
