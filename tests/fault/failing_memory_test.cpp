// Operations for which memory runs out, at each allocation that they make.
#include "tests/fault/failing_memory.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>

#include "common/text.h"
#include "tests/fault/saving.h"
#include "tests/platform/containers.h"
#include "tests/platform/platform_test.h"
#include "tests/support/ring.h"
#include "tests/support/shell.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr char kSettings[] = "/tmp/platform/settings";
constexpr char kFormat[] = "\t%s=%s\n";

std::string Sections(int count) {
  std::string text;
  for (int i = 0; i < count; ++i) text += "[" + std::to_string(i) + "]\n\tKEY=" + std::string(100, 'v') + "\n";
  return text;
}

class WithoutMemory : public PlatformTest {
 protected:
  void SetUp() override {
    PlatformTest::SetUp();
    Prepare(Savings().front());
    WriteText(kSettings, Sections(100));
  }

  // Runs an operation with each of its allocations failing. It must fail with `failure` and its one report, leave no
  // memory in use and the settings as they were. Ends when it makes no more allocations.
  template <class Operation>
  static void ExpectEachToFail(int failure, Operation operation) {
    const std::string before = ReadText(kSettings);
    int n = 1;
    for (;; ++n) {
      const MemoryOutcome outcome = RunWithoutMemory(n, operation);
      EXPECT_EQ(outcome.blocksLeft, 0) << "allocation " << n;
      if (!outcome.failed) break;
      EXPECT_EQ(outcome.result, failure) << "allocation " << n;
      EXPECT_EQ(PLIBCErrGet(), ERR_OUT_OF_MEMORY) << "allocation " << n;
      EXPECT_THAT(TakeLog(), ElementsAre(testing::Field(&LogLine::text, testing::EndsWith("Cannot allocate memory"))));
      EXPECT_EQ(ReadText(kSettings), before) << "allocation " << n;
      EXPECT_THAT(NamesIn(kDirectory), ElementsAre("settings")) << "allocation " << n;
      PLIBCErrSet(ERR_NONE);
    }
    EXPECT_GT(n, 1) << "it makes no allocation";
  }
};

TEST_F(WithoutMemory, NoHashAndNoListIsMade) {
  RunWithoutMemory(1, [] { return PLIBCSzHashAlloc(1024) != nullptr; });
  ExpectFailure(ERR_OUT_OF_MEMORY, "Failed to make a text hash: Cannot allocate memory");
  RunWithoutMemory(1, [] { return PLIBCSzListAlloc(1024) != nullptr; });
  ExpectFailure(ERR_OUT_OF_MEMORY, "Failed to make a text list: Cannot allocate memory");
  ExpectEachToFail(-1, [] {
    PPLIBSZHASH hash = PLIBCSzHashAlloc(1024);
    PLIBCSzHashFree(hash);
    return hash != nullptr ? 0 : -1;
  });
  ExpectEachToFail(-1, [] {
    PPLIBSZLIST list = PLIBCSzListAlloc(1024);
    PLIBCSzListFree(list);
    return list != nullptr ? 0 : -1;
  });
}

TEST_F(WithoutMemory, AHashStaysAsItWas) {
  TextHash hash{{"OLD", "value"}};
  for (int n = 1; n <= 3; ++n) {  // the entry, its key, its value
    const MemoryOutcome outcome = RunWithoutMemory(n, [&] { return PLIBCSzHashSetValue(hash.address(), "NEW", "x"); });
    EXPECT_EQ(outcome.result, -1);
    EXPECT_EQ(outcome.blocksLeft, 0);
    ExpectFailure(ERR_OUT_OF_MEMORY, "Failed to set NEW: Cannot allocate memory");
  }
  EXPECT_EQ(RunWithoutMemory(1, [&] { return PLIBCSzHashSetValue(hash.address(), "OLD", "x"); }).result, -1);
  ExpectFailure(ERR_OUT_OF_MEMORY, "Failed to set OLD: Cannot allocate memory");
  EXPECT_EQ(hash["OLD"], "value");
  EXPECT_EQ(hash["NEW"], "(none)");
}

// A caller that ignored the result of setting a pair saved the other pairs as if they were all.
TEST_F(WithoutMemory, AHashThatLacksAPairIsNotWritten) {
  const std::string before = ReadText(kSettings);
  const auto lacking = [](TextHash& hash, const char* szKey) {
    const auto set = [&] { return PLIBCSzHashSetValue(hash.address(), szKey, "x"); };
    EXPECT_EQ(RunWithoutMemory(1, set).result, -1);
    TakeLog();
  };
  for (const char* szKey : {"OLD", "NEW"}) {
    TextHash hash{{"OLD", "value"}};
    lacking(hash, szKey);
    ASSERT_EQ(PLIBCSzHashSetValue(hash.address(), "NEXT", "found room"), 1);
    EXPECT_EQ(PLIBCFileAddSection(kSettings, "new", hash.get(), kFormat), -1) << szKey;
    ExpectFailure(ERR_OUT_OF_MEMORY, "/tmp/platform/settings is not written: a pair of [new] found no memory");
    EXPECT_EQ(PLIBCFileSetSection(kSettings, "7", nullptr, hash.get(), kFormat), -1) << szKey;
    ExpectFailure(ERR_OUT_OF_MEMORY, "/tmp/platform/settings is not written: a pair of [7] found no memory");
    EXPECT_EQ(ReadText(kSettings), before) << szKey;
  }
}

TEST_F(WithoutMemory, AHashThatCannotGrowHoldsItsKeysAllTheSame) {
  PPLIBSZHASH hash = PLIBCSzHashAlloc(0);
  int unset = 0;
  for (int i = 0; i < 1000; ++i) {
    // The fourth allocation of a setting is that of growing, which is no part of what was asked for.
    const auto set = [&] { return PLIBCSzHashSetValue(&hash, std::to_string(i).c_str(), "value"); };
    unset += RunWithoutMemory(4, set).result == 1 ? 0 : 1;
  }
  EXPECT_EQ(unset, 0);
  for (int i = 0; i < 1000; ++i) EXPECT_STREQ(PLIBCSzHashGetValue(hash, std::to_string(i).c_str()), "value") << i;
  PLIBCSzHashFree(hash);
}

TEST_F(WithoutMemory, SettingsAreNotReadAndOutputsStay) {
  char szValue[8] = "as was";
  ExpectEachToFail(-1, [&] { return PLIBCFileGetKeyValue(kSettings, "NONE", szValue, sizeof szValue, 0); });
  EXPECT_STREQ(szValue, "as was");
  ExpectEachToFail(0, [] { return PLIBCFileCheckKeyValue(kSettings, "NONE", "", 0); });
  ExpectEachToFail(-1, [] {
    PPLIBSZHASH of = PLIBCSzHashAlloc(1024);
    const int result = of != nullptr ? PLIBCFileGetSection(kSettings, "7", &of) : -1;
    PLIBCSzHashFree(of);
    return result;
  });
}

TEST_F(WithoutMemory, AListOfSectionsIsAsItWas) {
  WriteText(kFile, "[first]\n");
  TextList list;
  ASSERT_EQ(PLIBCFileEnumSection(kFile, list.address()), 1);
  ASSERT_EQ(PLIBCSysUnlink(kFile), 0);
  for (int n = 1; n <= 10; ++n) {
    const MemoryOutcome outcome = RunWithoutMemory(n, [&] { return PLIBCFileEnumSection(kSettings, list.address()); });
    EXPECT_EQ(outcome.result, -1) << n;
    EXPECT_EQ(outcome.blocksLeft, 0) << n;
    EXPECT_THAT(list.items(), ElementsAre("first")) << n;
    ExpectFailure(ERR_OUT_OF_MEMORY, "Failed to read /tmp/platform/settings: Cannot allocate memory");
  }
  ExpectEachToFail(-1, [] {
    PPLIBSZLIST of = PLIBCSzListAlloc(1024);
    const int result = of != nullptr ? PLIBCFileEnumSection(kSettings, &of) : -1;
    PLIBCSzListFree(of);
    return result;
  });
}

TEST_F(WithoutMemory, SettingsStayAsTheyWere) {
  const std::string before = ReadText(kSettings);
  const TextHash hash{{"A", "1"}, {"B", "2"}};
  // Each succeeds in the end, so that it is undone for the next.
  ExpectEachToFail(-1, [] { return PLIBCFileSetKeyValue(kSettings, "KEY", "value", kFormat); });
  WriteText(kSettings, before);
  ExpectEachToFail(-1, [] { return PLIBCFileRemoveKey(kSettings, "KEY"); });
  WriteText(kSettings, before);
  ExpectEachToFail(-1, [&] { return PLIBCFileAddSection(kSettings, "new", hash.get(), kFormat); });
  WriteText(kSettings, before);
  ExpectEachToFail(-1, [&] { return PLIBCFileSetSection(kSettings, "7", "new", hash.get(), kFormat); });
  WriteText(kSettings, before);
  ExpectEachToFail(-1, [] { return PLIBCFileSetSectionValue(kSettings, "7", "NEW", "value", kFormat); });
}

TEST_F(WithoutMemory, AKnownNetworkIsNotRead) {
  WIRELESS_NETWORK_CONFIG config;
  const std::string section = SectionOf(2);
  ExpectEachToFail(-1, [&] { return MEROWirelessConfGet(section.c_str(), &config); });
}

// A list keeps the text of the file for those who ask by its names, while there is memory for that.
TEST_F(WithoutMemory, AWalkOverTheKnownNetworksGoesOnAndKeepsNothing) {
  const auto walk = [] {
    int read = 0;
    PPLIBSZLIST names = PLIBCSzListAlloc(1024);
    const int count = names != nullptr ? PLIBCFileEnumSection(kStore, &names) : -1;
    WIRELESS_NETWORK_CONFIG config;
    for (int i = 0; i < count; ++i) read += MEROWirelessConfGet(PLIBCSzListGet(names, i), &config) == 0 ? 1 : 0;
    PLIBCSzListFree(names);
    return read;
  };
  const int known = RunWithoutMemory(0, walk).result;
  EXPECT_GT(known, 1);
  int n = 1;
  for (;; ++n) {
    const MemoryOutcome outcome = RunWithoutMemory(n, walk);
    EXPECT_EQ(outcome.result, TakeLog().empty() ? known : 0) << "allocation " << n;
    EXPECT_EQ(outcome.blocksLeft, 0) << "allocation " << n;
    if (!outcome.failed) break;
  }
  EXPECT_GT(n, 3);
}

TEST(FreedMemory, HoldsNoSecretOfTheKnownNetworksThatWereListedOrRead) {
  Prepare(Savings().front());
  ASSERT_THAT(ReadText(kStore), testing::HasSubstr("secret"));
  const std::string section = SectionOf(1);
  static WIRELESS_NETWORK_CONFIG config;  // the caller's
  EXPECT_EQ(CountFreedWith("secret",
                           [] {
                             TextList names;
                             ASSERT_GT(PLIBCFileEnumSection(kStore, names.address()), 0);
                             EXPECT_EQ(MEROWirelessConfGet(PLIBCSzListGet(names.get(), 0), &config), 0);
                           }),
            0);
  EXPECT_EQ(CountFreedWith("secret", [&] { EXPECT_EQ(MEROWirelessConfGet(section.c_str(), &config), 0); }), 0);
}

TEST_F(WithoutMemory, NoProgramIsRun) {
  const auto outcome = RunWithoutMemory(1, [] { return PLIBCExec("/bin/true", nullptr, nullptr, nullptr, nullptr); });
  EXPECT_TRUE(outcome.failed);
  EXPECT_EQ(outcome.result, -1);
  EXPECT_EQ(outcome.blocksLeft, 0);
  ExpectFailure(ERR_COMMAND_FAILED, "Failed to run /bin/true: Cannot allocate memory");
}

TEST_F(WithoutMemory, NoAdapterIsSeen) {
  RunWithoutMemory(1, [] { return MEROWirelessAdapterNum(); });
  ExpectFailure(ERR_OUT_OF_MEMORY, "Failed to list /sys/class/net: Cannot allocate memory");
  ExpectEachToFail(0, [] { return MEROWirelessAdapterNum(); });
}

TEST_F(WithoutMemory, AListOfABridgesMembersIsAsItWas) {
  Shell("ip link add br7 type bridge && ip link add net1 type veth && ip link set master br7 net1");
  ExpectEachToFail(-1, [] {
    PPLIBSZLIST list = PLIBCSzListAlloc(0);
    const int result = list != nullptr ? PLIBNetBridgeSlaveEnum("br7", &list) : -1;
    EXPECT_TRUE(list == nullptr || list->nItem == std::max(result, 0));
    PLIBCSzListFree(list);
    return result;
  });
  Shell("ip link delete net1 && ip link delete br7");
}

TEST_F(WithoutMemory, TheFilesOfADhcpServerAreNeitherWrittenNorRead) {
  MERO_DHCPD_CONF conf{};
  CopyText(conf.szInterface, "lbr0");
  CopyText(conf.szTag, "lbr0");
  CopyText(conf.szRouter, "10.1.14.1");
  ExpectEachToFail(0, [&] { return MERONetSetDhcpServerConfigFiles(&conf, 1); });
  MERO_DHCPD_CONF read{};
  ExpectEachToFail(0, [&] {
    const int result = MERONetGetDhcpServerConf("lbr0", "lbr0", &read);
    EXPECT_EQ(read.szRouter[0] != '\0', result != 0);
    return result;
  });
  EXPECT_STREQ(read.szRouter, "10.1.14.1");
}

TEST_F(WithoutMemory, AKnownNetworkIsNotSavedAndTheStoreStays) {
  for (const Saving& saving : Savings()) {
    SCOPED_TRACE(saving.szName);
    Prepare(saving);
    const std::string before = StoredText();
    int n = 1;
    for (;; ++n) {
      const MemoryOutcome outcome = RunWithoutMemory(n, [&] { return MEROWirelessConfSet(&saving.network); });
      EXPECT_EQ(outcome.blocksLeft, 0) << "allocation " << n;
      if (!outcome.failed) break;
      EXPECT_EQ(outcome.result, -1) << "allocation " << n;
      EXPECT_EQ(PLIBCErrGet(), ERR_OUT_OF_MEMORY) << "allocation " << n;
      const std::vector<LogLine> log = TakeLog();
      ASSERT_GE(log.size(), 2u) << "allocation " << n;
      EXPECT_THAT(log.front().text, testing::EndsWith("Cannot allocate memory")) << "allocation " << n;
      EXPECT_EQ(log.back().unit, "wireless_conf_set") << "allocation " << n;
      EXPECT_THAT(StoredText(), IsStillThe(before)) << "allocation " << n;
      for (const std::string& name : NamesIn(kStoreDirectory)) EXPECT_EQ(name, "wireless.conf");
    }
    EXPECT_GT(n, 10);
    EXPECT_EQ(MEROWirelessConfSet(&saving.network), 0);
  }
}

TEST_F(WithoutMemory, WhatWasListedBeforeIsTheCallersAndTheRestIsReported) {
  struct Listing {
    const char* szUnit;
    int (*run)(WIRELESS_LIST*);
  };
  for (const Listing& listing : {Listing{"wireless_conf_enum", MEROWirelessConfEnum},
                                 Listing{"wireless_conf_enum_by_atime", MEROWirelessConfEnumByAtime}}) {
    SCOPED_TRACE(listing.szUnit);
    int failures = 0;
    for (int n = 1;; ++n) {
      Ring<WIRELESS_NETWORK_CONFIG> ring;
      int listed = 0;
      const MemoryOutcome outcome = RunWithoutMemory(n, [&] {
        const int result = listing.run(ring.head());
        ring.ForEach([&](const WIRELESS_NETWORK_CONFIG&) { ++listed; });
        ring.Clear();
        return result;
      });
      EXPECT_EQ(outcome.blocksLeft, 0) << "allocation " << n;
      const std::vector<LogLine> log = TakeLog();
      if (outcome.result == 0) {
        if (!outcome.failed) break;
        continue;
      }
      ++failures;
      EXPECT_EQ(outcome.result, -1) << "allocation " << n;
      EXPECT_LT(listed, 3) << "allocation " << n;
      ASSERT_FALSE(log.empty()) << "allocation " << n;
      EXPECT_EQ(log.back().unit, listing.szUnit) << "allocation " << n;
    }
    EXPECT_GE(failures, 6);
  }
}

TEST_F(WithoutMemory, DisconnectingGoesOnAndSaysSo) {
  const auto outcome = RunWithoutMemory(1, [] { return MEROWirelessNetworkDisconnect(); });
  EXPECT_TRUE(outcome.failed);
  EXPECT_EQ(outcome.blocksLeft, 0);
  EXPECT_THAT(TakeLog(), testing::Not(IsEmpty()));
}

}  // namespace
