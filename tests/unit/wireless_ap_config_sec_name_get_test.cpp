// The name of the settings section: what is asked of the platform, and what the file of the adapter makes of it.
#include <algorithm>
#include <climits>
#include <cstdio>
#include <filesystem>

#include "reports.h"
#include "unit_test.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

const std::string kInfo = "/tmp/wireless.info";
const std::string kAsksForInfo = "PLIBCFileExist(" + kInfo + ")";

class SectionName : public UnitTest {
 protected:
  SectionName() { std::filesystem::remove_all(kInfo); }

  BOOL Get(size_t cbSize) {
    std::ranges::fill(szName_, '*');
    return memory::Run(0, [&] { return MEROWirelessApConfigSecNameGet(szName_, cbSize); });
  }

  // Whether nothing was written from an offset on.
  bool IsUntouchedFrom(size_t offset) const {
    return std::all_of(szName_ + offset, std::end(szName_), [](char c) { return c == '*'; });
  }

  char szName_[64];
};

TEST_F(SectionName, IsAskedForUnderItsKeyOnceTheFileIsThere) {
  fake::PLIBCFileExist.Returns(1);
  fake::PLIBCFileGetKeyValue.Does([this](const char*, const char*, char* szValue, size_t cbValue, int) {
    EXPECT_EQ(szValue, szName_);
    std::snprintf(szValue, cbValue, "RT-5370");
    return 1;
  });
  EXPECT_EQ(Get(17), TRUE);
  EXPECT_STREQ(szName_, "RT-5370");
  EXPECT_THAT(fake::Effects(), ElementsAre(kAsksForInfo, "PLIBCFileGetKeyValue(" + kInfo + ", PRODUCT, &, 17, 0)"));
}

TEST_F(SectionName, IsKnownForNothingButAPositiveAnswer) {
  fake::PLIBCFileExist.Returns(-1);  // not zero: it exists
  for (const int answer : {1, 7, INT_MAX}) {
    fake::PLIBCFileGetKeyValue.Returns(answer);
    EXPECT_EQ(Get(sizeof szName_), TRUE) << answer;
  }
  for (const int answer : {0, -1, INT_MIN}) {
    fake::PLIBCFileGetKeyValue.Returns(answer);
    EXPECT_EQ(Get(sizeof szName_), FALSE) << answer;
  }
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(SectionName, NeedsARoomToBePutIn) {
  EXPECT_EQ(MEROWirelessApConfigSecNameGet(nullptr, 32), FALSE);
  EXPECT_THAT(WithoutLines(fake::Effects()),
              ElementsAre(fake::Report("wireless_ap_config_sec_name_get:# Bad parameter.")));
}

TEST_F(SectionName, IsUnknownUntilAnAdapterIsAnnouncedAndTheLogSaysWhy) {
  EXPECT_EQ(Get(sizeof szName_), FALSE);
  EXPECT_THAT(
      WithoutLines(fake::Effects()),
      ElementsAre(kAsksForInfo, fake::Report("wireless_ap_config_sec_name_get:# File[" + kInfo + "] does not exist.")));
  EXPECT_TRUE(IsUntouchedFrom(0));
}

TEST_F(SectionName, IsUnknownForAnAdapterWithoutOneAndNothingIsReported) {
  for (const char* szInfo :
       {"", "VENDOR=Acme\n", "product=RT-5370\n", "PRODUCTS=RT-5370\n", "#PRODUCT=RT-5370\n", "PRODUCT RT-5370\n"}) {
    WriteText(kInfo, szInfo);
    EXPECT_EQ(Get(sizeof szName_), FALSE) << szInfo;
    EXPECT_TRUE(IsUntouchedFrom(0)) << szInfo;
  }
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(SectionName, IsUnknownWhenTheFileCannotBeRead) {
  std::filesystem::create_directory(kInfo);
  EXPECT_EQ(Get(sizeof szName_), FALSE);
  EXPECT_TRUE(IsUntouchedFrom(0));
}

TEST_F(SectionName, IsTheProductNameOfTheAdapter) {
  const struct {
    const char* szInfo;
    const char* szName;
  } rows[] = {
      {"PRODUCT=RT-5370\n", "RT-5370"},
      {"VENDOR=Acme\r\nPRODUCT=RT-5370\r\nBUS=usb", "RT-5370"},
      {"PRODUCT=\"802.11n WLAN Stick\"\n", "802.11n WLAN Stick"},
      {"PRODUCT='it is'\n", "it is"},
      {"  PRODUCT =  AR 9271 \n", "AR 9271"},
      {"PRODUCT=a=b\n", "a=b"},
      {"PRODUCT=$(reboot);`x`\n", "$(reboot);`x`"},
      {"PRODUCT=\xff\x80\n", "\xff\x80"},
      {"PRODUCT=\n", ""},
      {"PRODUCT=", ""},
  };
  for (const auto& row : rows) {
    WriteText(kInfo, row.szInfo);
    EXPECT_EQ(Get(sizeof szName_), TRUE) << row.szInfo;
    EXPECT_STREQ(szName_, row.szName);
  }
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(SectionName, IsCutToItsRoomAndTerminated) {
  const std::string name = "0123456789abcdef";
  WriteText(kInfo, "PRODUCT=" + name + "\n");
  for (size_t cbSize = 1; cbSize < 20; ++cbSize) {
    EXPECT_EQ(Get(cbSize), TRUE) << cbSize;
    EXPECT_EQ(szName_, name.substr(0, cbSize - 1));
    EXPECT_TRUE(IsUntouchedFrom(std::min(cbSize, name.size() + 1))) << cbSize;
  }
}

TEST_F(SectionName, IsPutNowhereWhenThereIsNoRoomAtAll) {
  WriteText(kInfo, "PRODUCT=RT-5370\n");
  (void)Get(0);  // whether there is a name is no matter, where it can be put is
  EXPECT_TRUE(IsUntouchedFrom(0));
}

TEST_F(SectionName, IsReadOrNotWhenMemoryRunsOutAndNothingIsLeftBehind) {
  WriteText(kInfo, "PRODUCT=RT-5370\n");
  int failures = 0;
  memory::FailEach([this] { return MEROWirelessApConfigSecNameGet(szName_, sizeof szName_); },
                   [&](int n, BOOL result) {
                     EXPECT_EQ(result, memory::HasFailed() ? FALSE : TRUE) << n;
                     EXPECT_EQ(memory::Held(), 0u) << n;
                     failures += memory::HasFailed() ? 1 : 0;
                   });
  EXPECT_GT(failures, 0);
}

}  // namespace
