#include <climits>
#include <filesystem>

#include "reports.h"
#include "unit_test.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr char kScript[] = "/usr/mero/hotplug/usb.wireless.function";
constexpr char kChangesToAp[] = "PLIBCExec(/usr/mero/hotplug/usb.wireless.function, change-mode, ap, null, null)";
constexpr char kChangesToClient[] =
    "PLIBCExec(/usr/mero/hotplug/usb.wireless.function, change-mode, client, null, null)";

std::string ReportOf(const std::string& message) {
  return fake::Report("wireless_mode_change:# " + message);
}

class ModeChange : public UnitTest {};

TEST_F(ModeChange, RunsTheHotplugScriptAlsoForTheModeThatIsInForce) {
  fake::PLIBCExec.Returns(0);
  for (int i = 0; i < 2; ++i) {
    EXPECT_EQ(MEROWirelessModeChange(WIRELESS_AP_MODE), TRUE);
    EXPECT_EQ(MEROWirelessModeChange(WIRELESS_CLIENT_MODE), TRUE);
    EXPECT_EQ(MEROWirelessModeChange(WIRELESS_CLIENT_MODE), TRUE);
  }
  EXPECT_THAT(Steps(), ElementsAre(kChangesToAp, kChangesToClient, kChangesToClient,  //
                                   kChangesToAp, kChangesToClient, kChangesToClient));
}

TEST_F(ModeChange, FailsOnceAndIsReportedOnceWhenTheScriptDoesNotSucceed) {
  for (const int result : {1, 2, 255, 256, -1, INT_MIN}) {
    fake::Begin();
    fake::PLIBCExec.Returns(result);
    EXPECT_EQ(MEROWirelessModeChange(WIRELESS_AP_MODE), FALSE) << result;
    EXPECT_EQ(MEROWirelessModeChange(WIRELESS_CLIENT_MODE), FALSE) << result;
    EXPECT_THAT(Steps(), ElementsAre(kChangesToAp, ReportOf("Failed to change to wireless AP mode."), kChangesToClient,
                                     ReportOf("Failed to change to wireless client mode.")));
  }
}

TEST_F(ModeChange, RunsNothingForAModeThatDoesNotExist) {
  for (const int mode : {2, 3, -1, 256, 257, INT_MAX, INT_MIN}) {
    fake::Begin();
    EXPECT_EQ(MEROWirelessModeChange(static_cast<MERO_WIRELESS_MODE>(mode)), FALSE) << mode;
    EXPECT_THAT(Steps(), ElementsAre(ReportOf("Wrong Wireless Mode.")));
  }
}

TEST_F(ModeChange, DependsOnWhatTheScriptSaysWhenItHasFinished) {
  std::filesystem::create_directories("/usr/mero/hotplug");
  WriteScript(kScript, "echo \"$@\" >> /tmp/modes\n[ \"$2\" = client ]\n");
  WriteText("/tmp/modes", "");
  EXPECT_EQ(MEROWirelessModeChange(WIRELESS_CLIENT_MODE), TRUE);
  EXPECT_EQ(ReadText("/tmp/modes"), "change-mode client\n");
  EXPECT_EQ(MEROWirelessModeChange(WIRELESS_AP_MODE), FALSE);
  EXPECT_EQ(ReadText("/tmp/modes"), "change-mode client\nchange-mode ap\n");
  EXPECT_THAT(WithoutLines(fake::Messages()),
              ElementsAre("wireless_mode_change:# Failed to change to wireless AP mode."));
}

TEST_F(ModeChange, FailsWithoutTheScript) {
  std::filesystem::remove(kScript);
  EXPECT_EQ(MEROWirelessModeChange(WIRELESS_CLIENT_MODE), FALSE);
  EXPECT_EQ(Last(WithoutLines(fake::Messages())), "wireless_mode_change:# Failed to change to wireless client mode.");
}

}  // namespace
