// The promises of both listings of the known networks: the one in file order, and the one by the time of the last save.
#include <cstring>
#include <filesystem>

#include "known_networks.h"
#include "unit_test.h"

namespace {

using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;

struct Listing {
  const char* szTestName;
  int (*list)(WIRELESS_LIST* pHead);
  const char* szUnit;
  int lineOfRecordAlloc;

  friend void PrintTo(const Listing& listing, std::ostream* to) { *to << listing.szTestName; }
};

constexpr Listing kListings[] = {
    {"InFileOrder", MEROWirelessConfEnum, "wireless_conf_enum", 47},
    {"ByLastSave", MEROWirelessConfEnumByAtime, "wireless_conf_enum_by_atime", 48},
};

class KnownNetworks : public UnitTest, public testing::WithParamInterface<Listing> {
 protected:
  KnownNetworks() { std::filesystem::remove_all(kStore); }

  int List(int failingAllocation = 0) {
    return memory::Run(failingAllocation, [this] { return GetParam().list(ring_.head()); });
  }

  static std::string Message(int line, const std::string& text) {
    return std::string(GetParam().szUnit) + ":" + std::to_string(line) + " " + text;
  }

  // Makes the platform list sections that the file need not have.
  static void SectionsAre(std::vector<std::string> names) {
    fake::PLIBCFileEnumSection.Returns(names.size());
    fake::PLIBCSzListGet.Does([names = std::move(names)](const PLIBSZLIST*, int index) {
      return names.at(static_cast<size_t>(index)).c_str();
    });
  }

  // The names of the networks listed.
  std::vector<std::string> Names() {
    std::vector<std::string> names;
    for (const WIRELESS_NETWORK_CONFIG* config : ring_.Records()) names.push_back(config->network.szEssid);
    return names;
  }

  Ring<WIRELESS_NETWORK_CONFIG> ring_;
};

INSTANTIATE_TEST_SUITE_P(, KnownNetworks, testing::ValuesIn(kListings),
                         [](const auto& listing) { return listing.param.szTestName; });

TEST_P(KnownNetworks, AreNotListedIntoANullHead) {
  EXPECT_EQ(GetParam().list(nullptr), -1);
  EXPECT_THAT(fake::Effects(), ElementsAre(fake::Report(Message(26, "Bad parameters"))));
}

TEST_P(KnownNetworks, AreNoneWithoutMemoryForTheirNames) {
  fake::PLIBCSzListAlloc.Returns(nullptr);
  EXPECT_EQ(List(), -1);
  EXPECT_THAT(fake::Effects(),
              ElementsAre("PLIBCSzListAlloc(1024)", fake::Report(Message(30, "Failed to alloc memory"))));
  EXPECT_THAT(ring_.Records(), IsEmpty());
}

TEST_P(KnownNetworks, AreNoneWhenTheirFileCannotBeRead) {
  for (const int result : {-1, -9}) {
    fake::Begin();
    fake::PLIBCFileEnumSection.Returns(result);
    EXPECT_EQ(List(), -1);
    EXPECT_THAT(fake::Effects(),
                ElementsAre("PLIBCSzListAlloc(1024)", "PLIBCFileEnumSection(" + kStore + ", &)",
                            fake::Report(Message(35, "Failed to enumerate sections in '" + kStore + "'")),
                            "PLIBCSzListFree(&)"));
    EXPECT_THAT(ring_.Records(), IsEmpty());
    ring_.Clear();
  }
}

TEST_P(KnownNetworks, AreNoneWithoutSections) {
  fake::PLIBCFileEnumSection.Returns(0);
  EXPECT_EQ(List(), 0);
  EXPECT_THAT(fake::Effects(),
              ElementsAre("PLIBCSzListAlloc(1024)", "PLIBCFileEnumSection(" + kStore + ", &)", "PLIBCSzListFree(&)"));
  EXPECT_THAT(ring_.Records(), IsEmpty());
}

TEST_P(KnownNetworks, AreReadSectionBySection) {
  SectionsAre({"one", "two", "three"});
  fake::MEROWirelessConfGet.Returns(0);
  EXPECT_EQ(List(), 0);
  EXPECT_THAT(fake::Effects(),
              ElementsAre("PLIBCSzListAlloc(1024)", "PLIBCFileEnumSection(" + kStore + ", &)", "PLIBCSzListGet(&, 0)",
                          "MEROWirelessConfGet(one, &)", "PLIBCSzListGet(&, 1)", "MEROWirelessConfGet(two, &)",
                          "PLIBCSzListGet(&, 2)", "MEROWirelessConfGet(three, &)", "PLIBCSzListFree(&)"));
  EXPECT_EQ(ring_.Records().size(), 3u);
}

TEST_P(KnownNetworks, AreReadIntoRecordsOfZeros) {
  SectionsAre({"one", "two"});
  fake::MEROWirelessConfGet.Does([](const char*, WIRELESS_NETWORK_CONFIG* pNetCfg) {
    WIRELESS_NETWORK_CONFIG zeros;
    std::memset(&zeros, 0, sizeof zeros);
    EXPECT_EQ(std::memcmp(pNetCfg, &zeros, sizeof zeros), 0);
    std::memset(pNetCfg, 0xff, offsetof(WIRELESS_NETWORK_CONFIG, list));  // for the next to find, were it the same
    return 0;
  });
  EXPECT_EQ(List(), 0);
}

TEST_P(KnownNetworks, LeaveOutThoseThatCannotBeReadAndSayNothing) {
  SectionsAre({"bad", "good", "bad", "fine", "bad"});
  fake::MEROWirelessConfGet.Does([](const char* szSection, WIRELESS_NETWORK_CONFIG* pNetCfg) {
    std::strcpy(pNetCfg->network.szEssid, szSection);
    return szSection[0] == 'b' ? -1 : szSection[0] == 'g' ? 0 : 1;
  });
  EXPECT_EQ(List(), 0);
  EXPECT_THAT(Names(), ElementsAre("good", "fine"));
  EXPECT_THAT(fake::Messages(), IsEmpty());
  EXPECT_EQ(memory::Held(), 2u);
}

TEST_P(KnownNetworks, KeepThoseListedBeforeMemoryRanOut) {
  SectionsAre({"one", "two", "three"});
  fake::MEROWirelessConfGet.Does([](const char* szSection, WIRELESS_NETWORK_CONFIG* pNetCfg) {
    std::strcpy(pNetCfg->network.szEssid, szSection);
    return 0;
  });
  const std::vector<std::vector<std::string>> kept = {{}, {"one"}, {"one", "two"}};
  // Memory of the fakes does not count: what fails are the records.
  fake::PLIBCSzListAlloc.Does([](int cbSize) { return fake::PLIBCSzListAlloc.Real(cbSize); });
  for (size_t n = 0; n < kept.size(); ++n) {
    EXPECT_EQ(List(static_cast<int>(n) + 1), -1);
    EXPECT_THAT(Names(), ElementsAreArray(kept[n]));
    EXPECT_EQ(fake::Messages().back(), Message(GetParam().lineOfRecordAlloc, "Failed to alloc memory"));
    EXPECT_EQ(fake::PLIBCSzListFree.calls(), fake::PLIBCSzListAlloc.calls());
    ring_.Clear();
  }
  EXPECT_EQ(fake::Messages().size(), kept.size());
}

// A list moves when it grows, and a platform may hand out another one.
TEST_P(KnownNetworks, AreTakenFromTheListThatThePlatformLeaves) {
  PPLIBSZLIST pslMoved = nullptr;
  fake::PLIBCFileEnumSection.Does([&](const char*, PPLIBSZLIST* ppslList) {
    fake::PLIBCSzListFree.Real(*ppslList);
    pslMoved = *ppslList = fake::PLIBCSzListAlloc.Real(1024);
    return 1;
  });
  fake::PLIBCSzListGet.Does([&](const PLIBSZLIST* pslList, int) {
    EXPECT_EQ(pslList, pslMoved);
    return "one";
  });
  fake::PLIBCSzListFree.Does([&](PPLIBSZLIST pslList) {
    EXPECT_EQ(pslList, pslMoved);
    fake::PLIBCSzListFree.Real(pslList);
  });
  fake::MEROWirelessConfGet.Returns(0);
  EXPECT_EQ(List(), 0);
  EXPECT_EQ(fake::PLIBCSzListFree.calls(), 1);
}

TEST_P(KnownNetworks, AreNoneWhenTheFileIsMissingOrEmptyOrHasNoSections) {
  EXPECT_EQ(List(), 0);
  EXPECT_THAT(ring_.Records(), IsEmpty());
  ring_.Clear();
  for (const char* szText : {"", "\n\n", "# nothing yet\n", "KEY=value\n", "[", "]\n[broken\n"}) {
    WriteText(kStore, szText);
    EXPECT_EQ(List(), 0) << szText;
    EXPECT_THAT(ring_.Records(), IsEmpty()) << szText;
    ring_.Clear();
  }
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_P(KnownNetworks, AreReadBackAsTheyWereSaved) {
  const WIRELESS_NETWORK_CONFIG saved = HomeNetwork();
  fake::NowIs(1700000000);
  ASSERT_EQ(MEROWirelessConfSet(&saved), 0);
  EXPECT_EQ(List(), 0);
  ASSERT_EQ(ring_.Records().size(), 1u);

  const WIRELESS_NETWORK_CONFIG& read = *ring_.Records()[0];
  EXPECT_STREQ(read.szKey, saved.szKey);
  EXPECT_STREQ(read.szIp, saved.szIp);
  EXPECT_STREQ(read.szMask, saved.szMask);
  EXPECT_STREQ(read.szGateway, saved.szGateway);
  EXPECT_EQ(read.atime, 1700000000);
  EXPECT_STREQ(read.network.szEssid, saved.network.szEssid);
  EXPECT_EQ(std::memcmp(read.network.bssid, saved.network.bssid, sizeof read.network.bssid), 0);
  EXPECT_EQ(read.network.opmode, saved.network.opmode);
  EXPECT_EQ(read.network.auth, saved.network.auth);
  EXPECT_EQ(read.network.encrypt, saved.network.encrypt);
  EXPECT_EQ(read.network.list.q_forw, nullptr);
  EXPECT_EQ(read.network.list.q_back, nullptr);
  EXPECT_EQ(read.network.channel + read.network.signal + read.network.protocol + read.noneBssid, 0);
  EXPECT_STREQ(read.szUser, "");
}

TEST_P(KnownNetworks, AreNotConfusedByWhateverElseStandsInTheFile) {
  WriteText(kStore, "stray=1\n# comment\n" + NthSection(1, "7") +
                        "\tESSID\n\t=\n[ 02:00:00:00:00:02 ]\r\n\tESSID=two\r\n\tSIGNAL=" + std::string(5000, 'x') +
                        "\n[no network at all]\n\n" + NthSection(3, "7") + "\tBSSID=not an address\n[]\n[[\n");
  EXPECT_EQ(List(), 0);
  EXPECT_THAT(Names(), testing::IsSupersetOf({"net 1", "two", "net 3"}));
}

// Where memory runs out while one network is read, that one is left out; where there is none for the list, it ends.
TEST_P(KnownNetworks, AreEachWholeAndInOrderWheneverMemoryRunsOut) {
  WriteText(kStore, NthSection(1, "9") + NthSection(2, "9") + NthSection(3, "9"));
  const std::vector<std::string> all = {"net 1", "net 2", "net 3"};
  int failures = 0;
  const auto list = [this] { return GetParam().list(ring_.head()); };
  memory::FailEach(list, [&](int n, int result) {
    const std::vector<std::string> names = Names();
    EXPECT_TRUE(std::ranges::includes(all, names)) << n;
    if (result == 0) {
      EXPECT_GE(names.size(), memory::HasFailed() ? 2u : 3u) << n;
    } else {
      EXPECT_EQ(result, -1) << n;
      ++failures;
    }
    EXPECT_EQ(fake::Messages().empty(), names.size() == all.size()) << n;

    // A whole walk ends what the platform may keep of one that was cut short.
    ring_.Clear();
    EXPECT_EQ(list(), 0);
    ring_.Clear();
    EXPECT_EQ(memory::Held(), 0u) << n;
    fake::Begin();
  });
  EXPECT_GE(failures, 5);  // the list and its array, and three records
}

TEST(ConfEnum, ListsInFileOrder) {
  fake::Begin();
  WriteText(kStore, NthSection(1, "5") + NthSection(2, "9") + NthSection(3, "5") + NthSection(0, "1"));
  Ring<WIRELESS_NETWORK_CONFIG> ring;
  EXPECT_EQ(MEROWirelessConfEnum(ring.head()), 0);
  EXPECT_THAT(ring.Each(&WIRELESS_NETWORK_CONFIG::atime), ElementsAre(5, 9, 5, 1));
  fake::End();
}

}  // namespace
