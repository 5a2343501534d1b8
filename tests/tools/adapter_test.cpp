// The commands about the adapter as a whole: mode.
#include "running.h"

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

constexpr char kInfo[] = "/etc/hostapd/hostapd-wlan0.info";

// ---- The mode ----

class Mode : public ToolTest {
 protected:
  Mode() {
    library::SavedAp(library::Office());
    WriteText(kInfo, "enable=\"no\"\n");
  }
};

TEST_F(Mode, IsChangedToAnAccessPointsAndTellsWhatIsOnTheAir) {
  library::MEROWirelessModeChange = [](MERO_WIRELESS_MODE mode) {
    library::Record(mode == WIRELESS_AP_MODE ? "ap" : "client");
    return kernel::BecomeAccessPoint("Old Office", 2462), TRUE;
  };
  EXPECT_EQ(Tool({"mode", "ap"}).out, "the adapter is an access point's now: Old Office is on the air on channel 11\n");
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessModeChange", "ap"));
}

TEST_F(Mode, IsChangedToAClients) {
  kernel::BecomeAccessPoint("Office");
  library::MEROWirelessModeChange = [](MERO_WIRELESS_MODE mode) {
    library::Record(mode == WIRELESS_CLIENT_MODE ? "client" : "ap");
    return kernel::BecomeClient(), TRUE;
  };
  EXPECT_EQ(Tool({"mode", "client"}).out, "the adapter is a client's now\n");
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessModeChange", "client"));
}

// The connection was ended, and nothing came in its place.
TEST_F(Mode, IsNoAccessPointsWhereNoneIsEnabled) {
  Shell(std::string("rm ") + kInfo);
  const Ran ran = Tool({"mode", "ap"});
  EXPECT_EQ(ran.status, 2);
  EXPECT_THAT(ran.err,
              HasSubstr("merowireless: no access point is enabled, and the change would only end a connection: "));
  EXPECT_THAT(library::Calls(), IsEmpty());
}

// The access point went off the air and came back, and a connection was ended.
TEST_F(Mode, ThatItHasIsNotTouched) {
  EXPECT_EQ(Tool({"mode", "client"}).out, "the adapter is a client's already\n");
  EXPECT_EQ(Tool({"mode", "client", "--json"}).out, R"({"result":"ok","mode":{"mode":"client","changed":false}})"
                                                    "\n");
  kernel::BecomeAccessPoint("Office");
  EXPECT_EQ(Tool({"mode", "ap"}).out, "the adapter is an access point's already: Office is on the air on channel 6\n");
  kernel::BecomeAccessPoint("", 5260);
  EXPECT_EQ(Tool({"mode", "ap"}).out,
            "the adapter is an access point's already: Office waits until channel 52 is known to be free of radar\n");
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(Mode, OfAnAccessPointThatIsSwitchedOnAndDoesNotRunIsChanged) {
  WriteText(kInfo, "enable=\"yes\"\n");
  EXPECT_EQ(Tool({"mode", "client"}).out, "the adapter is a client's now\n");
  EXPECT_EQ(Tool({"mode", "ap"}).out, "the adapter is an access point's now: Office is on the air on channel 6\n");
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessModeChange", "MEROWirelessModeChange"));
}

TEST_F(Mode, ThatCouldNotBeChangedIsTheOneThatTheKernelTells) {
  library::MEROWirelessModeChange = [](MERO_WIRELESS_MODE) { return FALSE; };
  EXPECT_THAT(Tool({"mode", "ap"}).err,
              HasSubstr("merowireless: the mode could not be changed, and the adapter is a client's: "));
  kernel::BecomeAccessPoint("Office");
  EXPECT_THAT(Tool({"mode", "client"}).err,
              HasSubstr("merowireless: the mode could not be changed, and the adapter is an access point's: "));
}

// The script's success was taken for that of the change.
TEST_F(Mode, ThatTheKernelDoesNotShowWasNotChanged) {
  library::MEROWirelessModeChange = [](MERO_WIRELESS_MODE) { return TRUE; };
  EXPECT_THAT(Tool({"mode", "ap"}).err,
              HasSubstr("merowireless: the mode was changed, and no access point is on the air: "));
  kernel::BecomeAccessPoint("Office");
  const Ran ran = Tool({"mode", "client"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err,
              HasSubstr("merowireless: the mode was changed, and the adapter is an access point's all the same: "));
}

TEST_F(Mode, IsNobodysWithoutAnAdapter) {
  library::MEROWirelessAdapterNum = [] { return 0; };
  EXPECT_EQ(Tool({"mode", "ap"}).status, 3);
  EXPECT_EQ(Tool({"mode", "client"}).status, 3);
  EXPECT_THAT(library::Calls(), IsEmpty());
}

}  // namespace
