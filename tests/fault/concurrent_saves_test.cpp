// Many processes that save at once.
#include <sys/wait.h>
#include <unistd.h>

#include <functional>
#include <set>

#include "tests/fault/saving.h"
#include "tests/platform/containers.h"
#include "tests/platform/platform_test.h"

namespace {

using testing::ElementsAre;

// Processes that begin together, once all of them are there.
class Crowd {
 public:
  Crowd(int count, const std::function<bool(int)>& act) {
    int gate[2];
    EXPECT_EQ(::pipe(gate), 0);
    for (int i = 0; i < count; ++i) {
      const pid_t pid = ::fork();
      if (pid == 0) {
        ::close(gate[1]);
        char none;
        (void)::read(gate[0], &none, 1);  // ends when the gate is opened for all
        ::_exit(act(i) ? 0 : 1);
      }
      EXPECT_GT(pid, 0);
      pids_.insert(pid);
    }
    ::close(gate[0]);
    ::close(gate[1]);
  }

  bool busy() const { return !pids_.empty(); }
  // Waits for those that have ended, or for all.
  void Collect(int options) {
    int state = 0;
    for (pid_t pid; busy() && (pid = ::waitpid(-1, &state, options)) > 0;) {
      EXPECT_EQ(state, 0);
      pids_.erase(pid);
    }
  }

 private:
  std::set<pid_t> pids_;
};

bool Save(const WIRELESS_NETWORK_CONFIG& network) {
  return MEROWirelessConfSet(&network) == 0;
}

std::vector<std::string> StoredSections() {
  TextList list;
  EXPECT_GE(PLIBCFileEnumSection(kStore, list.address()), 0);
  return list.items();
}

class SavesAtOnce : public PlatformTest {
 protected:
  void SetUp() override {
    PlatformTest::SetUp();
    Prepare({"nothing", {}, {}});
  }
};

TEST_F(SavesAtOnce, LoseNoneOfTwoHundredNetworks) {
  constexpr int kProcesses = 200;
  Crowd crowd(kProcesses, [](int i) { return Save(NetworkOf(i)); });
  crowd.Collect(0);
  std::set<std::string> expected;
  for (int i = 0; i < kProcesses; ++i) expected.insert(SectionOf(i));
  const std::vector<std::string> stored = StoredSections();
  EXPECT_EQ(stored.size(), expected.size());
  EXPECT_EQ(std::set(stored.begin(), stored.end()), expected);
  EXPECT_THAT(NamesIn(kStoreDirectory), ElementsAre("wireless.conf"));
  for (int i = 0; i < kProcesses; ++i) {
    WIRELESS_NETWORK_CONFIG config;
    ASSERT_EQ(MEROWirelessConfGet(SectionOf(i).c_str(), &config), 0);
    EXPECT_EQ(config.network.szEssid, "network " + std::to_string(i));
  }
}

TEST_F(SavesAtOnce, OfOneNetworkMakeOneSection) {
  Crowd crowd(50, [](int i) { return Save(NetworkOf(7, "secret " + std::to_string(i))); });
  crowd.Collect(0);
  EXPECT_THAT(StoredSections(), ElementsAre(SectionOf(7)));
}

TEST_F(SavesAtOnce, LoseNoKeyThatOtherProgramsSet) {
  Prepare(Savings().front());
  Crowd crowd(40, [](int i) {
    const std::string key = "OTHER" + std::to_string(i);
    if (i % 2 == 0) return Save(NetworkOf(100 + i));
    return PLIBCFileSetSectionValue(kStore, SectionOf(1).c_str(), key.c_str(), "kept", "\t%s=%s\n") == 0;
  });
  crowd.Collect(0);
  EXPECT_EQ(StoredSections().size(), 3u + 20u);
  TextHash hash;
  ASSERT_EQ(PLIBCFileGetSection(kStore, SectionOf(1).c_str(), hash.address()), 1);
  for (int i = 1; i < 40; i += 2) EXPECT_EQ(hash[("OTHER" + std::to_string(i)).c_str()], "kept") << i;
}

TEST_F(SavesAtOnce, NeverShowAReaderAPartOfTheStore) {
  ASSERT_TRUE(Save(NetworkOf(0)));
  Crowd crowd(100, [](int i) { return Save(NetworkOf(i + 1)); });
  size_t least = 1;
  for (int reads = 0; crowd.busy() || reads == 0; ++reads) {
    crowd.Collect(WNOHANG);
    const std::string text = ReadText(kStore);
    size_t ends = 0;
    for (size_t at = 0; (at = text.find("\tENCRYPT=AES\n", at)) != std::string::npos; ++at) ++ends;
    size_t begins = 0;
    for (size_t at = 0; (at = text.find("[00:", at)) != std::string::npos; ++at) ++begins;
    EXPECT_EQ(begins, ends);
    EXPECT_GE(begins, least);
    least = begins;
  }
  EXPECT_EQ(StoredSections().size(), 101u);
}

}  // namespace
