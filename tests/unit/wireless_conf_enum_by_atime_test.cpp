// The order of the known networks. All other promises of this listing are tested with the listing in file order.
#include <algorithm>
#include <filesystem>
#include <limits>
#include <numeric>
#include <random>

#include "known_networks.h"
#include "unit_test.h"

namespace {

using testing::ElementsAre;

std::vector<std::string> g_links;  // what was called to link and unlink

void Note(const char* szFunction) {
  const memory::Pause pause;
  g_links.push_back(szFunction);
}

}  // namespace

// In the place of libc's.
extern "C" void insque(void* node, void* before) noexcept {
  Note("insque");
  auto* list = static_cast<WIRELESS_LIST*>(node);
  list->q_back = static_cast<WIRELESS_LIST*>(before);
  list->q_forw = list->q_back->q_forw;
  list->q_back->q_forw = list->q_forw->q_back = list;
}

extern "C" void remque(void* node) noexcept {
  Note("remque");
  auto* list = static_cast<WIRELESS_LIST*>(node);
  list->q_back->q_forw = list->q_forw;
  list->q_forw->q_back = list->q_back;
}

namespace {

class LastSaved : public UnitTest {
 protected:
  // The networks, each told by its place in the file, as the listing orders networks saved at these times.
  static std::vector<unsigned> Listed(const std::vector<int32_t>& times) {
    std::string text;
    for (unsigned i = 0; i < times.size(); ++i) text += NthSection(i, std::to_string(times[i]));
    WriteText(kStore, text);

    Ring<WIRELESS_NETWORK_CONFIG> ring;
    EXPECT_EQ(memory::Run(0, [&] { return MEROWirelessConfEnumByAtime(ring.head()); }), 0);
    std::vector<unsigned> places;
    for (const WIRELESS_NETWORK_CONFIG* config : ring.Records()) {
      places.push_back(static_cast<unsigned>(std::stoul(config->network.szEssid + 4)));  // behind "net "
      EXPECT_EQ(config->atime, times[places.back()]);
    }
    return places;
  }

  static std::vector<unsigned> Sorted(const std::vector<int32_t>& times) {
    std::vector<unsigned> places(times.size());
    std::iota(places.begin(), places.end(), 0u);
    std::ranges::stable_sort(places, [&](unsigned a, unsigned b) { return times[a] > times[b]; });
    return places;
  }
};

TEST_F(LastSaved, ComesFirstAndEqualTimesKeepTheirOrderInTheFile) {
  EXPECT_THAT(Listed({5, 9, 5}), ElementsAre(1, 0, 2));
}

TEST_F(LastSaved, IsTakenAsSigned32BitTime) {
  constexpr int32_t kLeast = std::numeric_limits<int32_t>::min();
  constexpr int32_t kGreatest = std::numeric_limits<int32_t>::max();
  EXPECT_THAT(Listed({0, kLeast, -1, kGreatest, 1}), ElementsAre(3, 4, 0, 2, 1));
}

TEST_F(LastSaved, IsFirstWhateverTheOrderInTheFileAndHoweverManyThereAre) {
  for (int count = 0; count <= 70; ++count) {
    std::vector<int32_t> rising;
    for (int i = 0; i < count; ++i) rising.push_back(i);
    const std::vector<int32_t> falling(rising.rbegin(), rising.rend());
    const std::vector<int32_t> equal(rising.size(), 7);
    for (const auto& times : {rising, falling, equal}) EXPECT_EQ(Listed(times), Sorted(times)) << count;
  }
}

TEST_F(LastSaved, IsFirstAmongAThousandAndEqualTimesKeepTheirOrder) {
  std::mt19937 random(20240611);
  for (const int32_t spread : {3, 300, std::numeric_limits<int32_t>::max()}) {
    std::uniform_int_distribution<int32_t> time(-spread, spread);
    std::vector<int32_t> times(1000);
    std::ranges::generate(times, [&] { return time(random); });
    EXPECT_EQ(Listed(times), Sorted(times)) << spread;
  }
}

// Sorting wrote the links of the head by itself.
TEST_F(LastSaved, IsPutInItsPlaceByLinkingAndUnlinkingAlone) {
  g_links.clear();
  EXPECT_EQ(Listed({5, 9, 7}), Sorted({5, 9, 7}));
  EXPECT_THAT(g_links, ElementsAre("insque", "insque", "insque",  // as they stand in the file
                                   "remque", "insque", "remque", "insque", "remque", "insque", "remque", "remque",
                                   "remque"));  // by the caller
}

TEST_F(LastSaved, IsFirstAmongThoseListedBeforeMemoryRanOut) {
  const std::vector<int32_t> times = {5, 9, 5, 11, 1};
  fake::PLIBCFileEnumSection.Returns(times.size());
  // Memory of the fakes does not count: what fails is the fourth record.
  fake::PLIBCSzListAlloc.Does([](int cbSize) { return fake::PLIBCSzListAlloc.Real(cbSize); });
  fake::PLIBCSzListGet.Does([](const PLIBSZLIST*, int index) {
    static std::string s_name;
    return (s_name = std::to_string(index)).c_str();
  });
  fake::MEROWirelessConfGet.Does([&](const char* szSection, WIRELESS_NETWORK_CONFIG* pNetCfg) {
    pNetCfg->atime = times[std::stoul(szSection)];
    return 0;
  });
  Ring<WIRELESS_NETWORK_CONFIG> ring;
  EXPECT_EQ(memory::Run(4, [&] { return MEROWirelessConfEnumByAtime(ring.head()); }), -1);
  EXPECT_THAT(ring.Each(&WIRELESS_NETWORK_CONFIG::atime), ElementsAre(9, 5, 5));
  EXPECT_THAT(fake::Messages(), ElementsAre("wireless_conf_enum_by_atime:48 Failed to alloc memory"));
}

TEST_F(LastSaved, IsTheOneSavedAgain) {
  std::filesystem::remove(kStore);
  WIRELESS_NETWORK_CONFIG config = HomeNetwork();
  int64_t now = 1700000000;
  for (const int last : {1, 2, 3, 2}) {
    fake::NowIs(++now);
    config.network.bssid[5] = static_cast<unsigned char>(last);
    ASSERT_EQ(MEROWirelessConfSet(&config), 0);
  }
  Ring<WIRELESS_NETWORK_CONFIG> ring;
  EXPECT_EQ(MEROWirelessConfEnumByAtime(ring.head()), 0);
  std::vector<int> order;
  for (const WIRELESS_NETWORK_CONFIG* known : ring.Records()) order.push_back(known->network.bssid[5]);
  EXPECT_THAT(order, ElementsAre(2, 3, 1));
}

}  // namespace
