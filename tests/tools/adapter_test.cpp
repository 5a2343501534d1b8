// The commands about the adapter as a whole: mode, radio.
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstring>
#include <filesystem>
#include <utility>

#include "running.h"

using testing::ElementsAre;
using testing::EndsWith;
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
  kernel::Main().megahertz = 0;  // where the driver does not tell, it was said to be channel 0
  EXPECT_EQ(Tool({"mode", "ap"}).out, "the adapter is an access point's already: Office is on the air\n");
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
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessModeChange", "MEROWirelessModeChange")) << "there and back";
  kernel::BecomeAccessPoint("Office");
  const Ran ran = Tool({"mode", "client"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err,
              HasSubstr("merowireless: the mode was changed, and the adapter is an access point's all the same: "));
}

// The start script was killed half way, and the next hour put the access point on the air.
TEST_F(Mode, ThatIsInterruptedIsTheClients) {
  library::MEROWirelessModeChange = [](MERO_WIRELESS_MODE mode) {
    library::Record(mode == WIRELESS_AP_MODE ? "ap" : "client");
    while (mode == WIRELESS_AP_MODE) ::pause();
    return TRUE;
  };
  StartedTool tool({"mode", "ap"});
  ASSERT_TRUE(Soon([] { return std::ranges::count(library::Calls(), "ap") > 0; }));
  ::kill(tool.pid(), SIGINT);
  EXPECT_EQ(tool.Wait().status, 130);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessModeChange", "ap", "MEROWirelessModeChange", "client"));
}

TEST_F(Mode, IsNobodysWithoutAnAdapter) {
  library::MEROWirelessAdapterNum = [] { return 0; };
  EXPECT_EQ(Tool({"mode", "ap"}).status, 3);
  EXPECT_EQ(Tool({"mode", "client"}).status, 3);
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(Mode, IsNoAccessPointsWhileTheRadioIsOff) {
  library::MEROWirelessCheckBlock = [] { return 0; };
  EXPECT_EQ(Tool({"mode", "ap"}).status, 6);
  EXPECT_EQ(Tool({"ap", "enable"}).status, 6);
  EXPECT_THAT(library::Calls(), IsEmpty());
}

// ---- The radio ----

constexpr char kSwitch[] = "/sys/class/net/wlan0/phy80211/rfkill3/";
constexpr char kNote[] = "/usr/mero/etc/wireless_radio.conf";

// A radio that the kernel can block, and a switch in the settings that keeps what is set.
class RadioSwitch : public ToolTest {
 protected:
  RadioSwitch() {
    Shell("mount -t tmpfs scratch /sys/class/net");
    WriteText(std::string(kSwitch) + "soft", "0");
    WriteText(std::string(kSwitch) + "hard", "0");
    WriteText("/tmp/unblock", "yes");
    library::SavedAp(library::Office());
    library::MEROWirelessCheckBlock = [] { return ReadText("/tmp/unblock") == "yes" ? 1 : 0; };
    library::PLIBCFileSetSectionValue = [](const char* szPath, const char* szSection, const char* szKey,
                                           const char* szValue, const char*) {
      WriteText("/tmp/unblock", szValue);
      return library::Record(std::string(szPath) + " " + szSection + " " + szKey + " " + szValue), 0;
    };
    library::PLIBCFileSetKeyValue = [](const char* szPath, const char* szKey, const char* szValue, const char*) {
      return WriteText(szPath, std::string(szKey) + "=\"" + szValue + "\"\n"), 1;
    };
  }

  // Connected, until the connection is ended.
  static void Connect() {
    library::Known({library::Home()});
    library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG* config) {
      return WriteText("/tmp/joined", config->network.szEssid), 0;
    };
    library::MEROWirelessNetworkDisconnect = [] { return WriteText("/tmp/joined", ""), 0; };
    library::MEROWirelessConnStatusGet = [] {
      return ReadText("/tmp/joined").empty() ? WIRELESS_STATUS_DISCONNECTED : WIRELESS_STATUS_CONNECTED_MANAGED;
    };
    library::MEROWirelessCurInfoGet = [](WIRELESS_REQUEST request, PWIRELESS_INFO info) {
      if (request == REQUEST_ESSID) std::strcpy(info->szEssid, ReadText("/tmp/joined").c_str());
      return 0;
    };
    WriteText("/tmp/joined", "Home");
  }

  static void PutOnAir() {
    kernel::BecomeAccessPoint("Office");
    WriteText(kInfo, "enable=\"yes\"\n");
    library::MEROWirelessModeChange = [](MERO_WIRELESS_MODE mode) {
      const bool on = mode == WIRELESS_AP_MODE;
      on ? kernel::BecomeAccessPoint("Office") : kernel::BecomeClient();
      WriteText(kInfo, on ? "enable=\"yes\"\n" : "enable=\"no\"\n");
      return library::Record(on ? "ap" : "client"), TRUE;
    };
  }

  static std::string Soft() { return ReadText(std::string(kSwitch) + "soft"); }
};

TEST_F(RadioSwitch, IsShownWithTheKernelsBlock) {
  EXPECT_EQ(Tool({"radio", "--porcelain"}).out, "on\tExampleStick\tnone\n");
  EXPECT_EQ(Tool({"radio"}).out, "radio           on\nadapter         ExampleStick\nkernel's block  none\n");
  WriteText(std::string(kSwitch) + "soft", "1");
  EXPECT_EQ(Tool({"radio", "--porcelain"}).out, "off\tExampleStick\tset\n");
  WriteText(std::string(kSwitch) + "hard", "1");
  EXPECT_EQ(Tool({"radio", "--porcelain"}).out, "off\tExampleStick\thardware\n");
  EXPECT_THAT(Tool({"radio"}).out, EndsWith("\nkernel's block  set by a switch of the hardware\n"));
  Shell("umount /sys/class/net");
  EXPECT_EQ(Tool({"radio", "--json"}).out,
            R"({"result":"ok","radio":{"radio":"on","adapter":"ExampleStick","kernel_block":null}})"
            "\n");
}

// The status told the switch in the settings alone.
TEST_F(RadioSwitch, IsTheSameInTheStatus) {
  EXPECT_THAT(Tool({"status"}).out, HasSubstr("\nradio         on\n"));
  WriteText(std::string(kSwitch) + "soft", "1");
  EXPECT_THAT(Tool({"status"}).out, HasSubstr("\nradio         off\n"));
  WriteText(std::string(kSwitch) + "soft", "0");
  WriteText("/tmp/unblock", "no");
  EXPECT_THAT(Tool({"status"}).out, HasSubstr("\nradio         off\n"));
}

// The connection stayed, and only the next one was refused.
TEST_F(RadioSwitch, EndsTheConnectionAndBringsItBack) {
  Connect();
  EXPECT_EQ(Tool({"radio", "off"}).out, "the radio is off: no network will be joined\n");
  EXPECT_EQ(ReadText("/tmp/joined"), "");
  EXPECT_EQ(ReadText("/tmp/unblock"), "no");
  EXPECT_EQ(Soft(), "1");
  EXPECT_EQ(ReadText(kNote), "use=\"network:486f6d65\"\n");
  EXPECT_EQ(Tool({"radio", "off"}).status, 0) << "once more, and what there was is not forgotten";
  EXPECT_EQ(Tool({"radio", "on"}).out, "the radio is on, and connected to Home\n");
  EXPECT_EQ(ReadText("/tmp/joined"), "Home");
  EXPECT_EQ(ReadText("/tmp/unblock"), "yes");
  EXPECT_EQ(Soft(), "0");
  EXPECT_FALSE(Exists(kNote));
}

// The switch stood at off, and the connection was left.
TEST_F(RadioSwitch, ThatIsInterruptedBetweenTwoStepsIsWhereItWas) {
  Connect();
  library::PLIBCFileSetSectionValue = [save = library::PLIBCFileSetSectionValue, first = true](auto... all) mutable {
    const int result = save(all...);
    if (std::exchange(first, false)) ::raise(SIGTERM);
    return result;
  };
  EXPECT_EQ(Tool({"radio", "off"}).status, 130);
  EXPECT_EQ(ReadText("/tmp/joined"), "Home");
  EXPECT_EQ(ReadText("/tmp/unblock"), "yes");
  EXPECT_EQ(Soft(), "0");
  EXPECT_FALSE(Exists(kNote));
}

// It stayed on the air.
TEST_F(RadioSwitch, EndsTheAccessPointAndBringsItBack) {
  PutOnAir();
  EXPECT_EQ(Tool({"radio", "off"}).status, 0);
  EXPECT_EQ(Soft(), "1");
  EXPECT_EQ(ReadText(kNote), "use=\"access-point\"\n");
  EXPECT_EQ(Tool({"ap", "status", "--porcelain"}).out.substr(0, 4), "off\t");
  EXPECT_EQ(Tool({"radio", "on"}).out, "the radio is on, and Office is on the air on channel 6\n");
  EXPECT_EQ(Tool({"radio", "on"}).out, "the radio is on\n");
  const std::string saved = "/usr/mero/etc/wireless_ap.conf ExampleStick unblock ";
  EXPECT_THAT(library::Calls(),
              ElementsAre("PLIBCFileSetKeyValue", "PLIBCFileSetSectionValue", saved + "no", "MEROWirelessModeChange",
                          "client", "PLIBCFileSetSectionValue", saved + "yes", "MEROWirelessModeChange", "ap",
                          "PLIBCFileSetSectionValue", saved + "yes"));
}

TEST_F(RadioSwitch, BringsNoAccessPointBackThatWasDisabledMeanwhile) {
  PutOnAir();
  EXPECT_EQ(Tool({"radio", "off"}).status, 0);
  Shell(std::string("rm ") + kInfo);
  EXPECT_EQ(Tool({"radio", "on"}).out, "the radio is on\n");
}

TEST_F(RadioSwitch, TellsOfAConnectionThatItCannotBringBack) {
  Connect();
  library::Known({});
  EXPECT_EQ(Tool({"radio", "off"}).status, 0);
  EXPECT_EQ(Tool({"radio", "on"}).out,
            "the radio is on; Home is not among the known networks, and was not joined again\n");
  Connect();
  EXPECT_EQ(Tool({"radio", "off"}).status, 0);
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return -1; };
  const Ran ran = Tool({"radio", "on"});
  EXPECT_EQ(ran.status, 9);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: the radio is on, and not connected to Home again: Home could not be "));
  EXPECT_EQ(Soft(), "0");
  EXPECT_EQ(ReadText("/tmp/unblock"), "yes");
}

TEST_F(RadioSwitch, TellsOfAnAccessPointThatDoesNotComeBack) {
  PutOnAir();
  EXPECT_EQ(Tool({"radio", "off"}).status, 0);
  library::MEROWirelessModeChange = [](MERO_WIRELESS_MODE) { return FALSE; };
  const Ran ran = Tool({"radio", "on"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err,
              HasSubstr("merowireless: the radio is on, and the access point that was there does not come back: "));
}

TEST_F(RadioSwitch, ThatTheKernelRefusesLeavesWhatThereWas) {
  Connect();
  Shell("rm -r /sys/class/net/wlan0/phy80211/rfkill3");
  const Ran ran = Tool({"radio", "off"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err,
              HasSubstr("merowireless: the radio stays on, since the kernel does not block it: Operation not "));
  EXPECT_EQ(ReadText("/tmp/joined"), "Home");
  EXPECT_EQ(ReadText("/tmp/unblock"), "yes");
  EXPECT_FALSE(Exists(kNote));
}

TEST_F(RadioSwitch, LeavesWhatItCannotEnd) {
  Connect();
  library::MEROWirelessNetworkDisconnect = [] { return -1; };
  EXPECT_THAT(Tool({"radio", "off"}).err,
              HasSubstr("merowireless: the radio stays on, since the connection could not be ended: "));
  PutOnAir();
  library::MEROWirelessModeChange = [](MERO_WIRELESS_MODE) { return FALSE; };
  EXPECT_THAT(Tool({"radio", "off"}).err,
              HasSubstr("merowireless: the radio stays on, since the access point could not be ended: "));
  EXPECT_EQ(Soft(), "0");
  EXPECT_EQ(ReadText("/tmp/unblock"), "yes");
}

TEST_F(RadioSwitch, ThatCannotBeSavedIsNotMoved) {
  Connect();
  library::PLIBCFileSetKeyValue = [](const char*, const char*, const char*, const char*) { return -1; };
  EXPECT_THAT(Tool({"radio", "off"}).err, HasSubstr("merowireless: what uses the radio could not be noted: "));
  WriteText(kNote, "");
  library::PLIBCFileSetKeyValue = [](const char*, const char*, const char*, const char*) { return 1; };
  library::PLIBCFileSetSectionValue = [](const char*, const char*, const char*, const char*, const char*) {
    return -1;
  };
  EXPECT_THAT(Tool({"radio", "off"}).err, HasSubstr("merowireless: the radio could not be switched: "));
  EXPECT_EQ(ReadText("/tmp/joined"), "Home");
  EXPECT_EQ(Soft(), "0");
}

TEST_F(RadioSwitch, ThatCannotBeSavedAsOnStaysOff) {
  WriteText(std::string(kSwitch) + "soft", "1");
  WriteText("/tmp/unblock", "no");
  library::PLIBCFileSetSectionValue = [](const char*, const char*, const char*, const char*, const char*) {
    return -1;
  };
  EXPECT_THAT(Tool({"radio", "on"}).err, HasSubstr("merowireless: the radio could not be switched: "));
  EXPECT_EQ(Soft(), "1");
}

// Why it could not be saved was hidden by what failed behind that.
TEST_F(RadioSwitch, ThatCannotBeSavedNorPutBackTellsBoth) {
  WriteText(std::string(kSwitch) + "soft", "1");
  library::PLIBCFileSetSectionValue = [](const char*, const char*, const char*, const char*, const char*) {
    std::filesystem::remove(std::string(kSwitch) + "soft");
    return -1;
  };
  const Ran ran = Tool({"radio", "on"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, testing::StartsWith("merowireless: the kernel's block of the radio could not be set again\n"
                                           "merowireless: the radio could not be switched: "));
}

TEST_F(RadioSwitch, ThatAHandHasMovedIsNotSwitchedOn) {
  WriteText(std::string(kSwitch) + "soft", "1");
  WriteText(std::string(kSwitch) + "hard", "1");
  const Ran ran = Tool({"radio", "on"});
  EXPECT_EQ(ran.status, 6);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: a switch of the hardware has the radio blocked: "));
  EXPECT_EQ(Soft(), "1") << "or the radio would be on when the hand moves it, whatever the settings say";
}

TEST_F(RadioSwitch, OfTheKernelKeepsWhatNeedsTheRadioFromBeingBegun) {
  WriteText(std::string(kSwitch) + "soft", "1");
  WriteText(kInfo, "enable=\"no\"\n");
  library::Known({library::Home()});
  for (const std::vector<std::string>& words :
       {std::vector<std::string>{"connect", "Home"}, {"ap", "enable"}, {"mode", "ap"}}) {
    const Ran ran = Tool(words);
    EXPECT_EQ(ran.status, 6) << words[0];
    EXPECT_THAT(ran.err, HasSubstr("merowireless: the kernel blocks the radio: ")) << words[0];
  }
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(RadioSwitch, WhoseBlockCannotBeLiftedSaysSo) {
  const std::string soft = std::string(kSwitch) + "soft";
  Shell("rm " + soft + " && mkdir " + soft);
  EXPECT_THAT(Tool({"radio", "on"}).err,
              HasSubstr("merowireless: the kernel's block of the radio could not be lifted: Is a directory: "));
}

TEST_F(RadioSwitch, StandsInTheSettingsAloneWhereThereIsNoSuchRadio) {
  Shell("umount /sys/class/net");
  EXPECT_EQ(Tool({"radio", "off"}).status, 0);
  EXPECT_EQ(ReadText("/tmp/unblock"), "no");
  EXPECT_EQ(Tool({"radio", "sideways"}).status, 2);
}

}  // namespace
