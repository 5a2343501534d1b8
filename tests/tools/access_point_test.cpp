// The commands about the access point.
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <iterator>
#include <sstream>

#include "base/text.h"
#include "common/paths.h"
#include "running.h"

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::StartsWith;

namespace {

std::vector<std::string> Words(const std::string& text) {
  std::istringstream stream(text);
  return {std::istream_iterator<std::string>(stream), {}};
}

// Records each save by the settings that it was given.
void RecordSaves(std::string (*show)(const MERO_AP_CONF&)) {
  library::MEROWirelessSetAPConfig = [show](PMERO_AP_CONF conf) {
    library::Record((conf->blEnable == TRUE ? "on: " : "off: ") + show(*conf));
    return TRUE;
  };
}

constexpr char kPid[] = "/var/run/rc.network/hostapd-wlan0.pid";

class AccessPoint : public ToolTest {
 protected:
  AccessPoint() { library::SavedAp(library::Office()); }
  ~AccessPoint() override { std::filesystem::remove(kApMarkerPath); }
};

TEST_F(AccessPoint, IsShownWithoutItsSecrets) {
  const Ran ran = Tool({"ap", "show"});
  EXPECT_EQ(ran.status, 0);
  EXPECT_THAT(ran.out, testing::StartsWith("enable                           off\n"
                                           "ssid                             Office\n"
                                           "encryption                       wpa2\n"
                                           "wpa_encrypt_type                 aes\n"
                                           "auth_server_addr                 -\n"
                                           "band                             2.4 GHz\n"
                                           "hw_mode                          gn\n"
                                           "channel                          6\n"
                                           "ieee80211n_wireless_width        20 and 40 MHz\n"));
  for (const char* form : {"-v", "--json", "--porcelain"}) {
    EXPECT_THAT(Tool({"ap", "show", form}).out, Not(HasSubstr("sesame"))) << form;
    EXPECT_THAT(Tool({"ap", "show", form, "--show-secrets"}).out, HasSubstr("open sesame")) << form;
  }
  EXPECT_THAT(Tool({"ap", "show", "--json"}).out, HasSubstr(R"("has_secret":true,"guest_net_has_secret":false)"));
}

// The port of the RADIUS server came in among them, and every field behind it had another place.
TEST_F(AccessPoint, HasItsFieldsAtThePlacesThatScriptsKnow) {
  std::istringstream line(Tool({"ap", "show", "--porcelain"}).out);
  std::vector<std::string> fields;
  for (std::string field; std::getline(line, field, '\t');) fields.push_back(field);
  ASSERT_EQ(fields.size(), 30U);
  EXPECT_EQ(fields[4], "");         // auth_server_addr
  EXPECT_EQ(fields[5], "2.4");      // band
  EXPECT_EQ(fields[16], "Guests");  // guest_net_ssid
  EXPECT_EQ(fields[27], "yes");     // has_secret
  EXPECT_EQ(fields[29], "\n");      // auth_server_port
}

TEST_F(AccessPoint, KeepsItsSwitchAndOtherSettingsWhenOneIsChanged) {
  RecordSaves([](const MERO_AP_CONF& of) {
    return std::string(of.hostapConf.szSSID) + "|" + std::to_string(of.hostapConf.channel) + "|" +
           of.hostapConf.encryptInfo.wpaPskInfo.szPassPhrase;
  });
  const Ran ran = Tool({"ap", "set", "--channel", "11"});
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig", "on: Office|11|open sesame",
                                            "MEROWirelessSetAPConfig", "off: Office|11|open sesame"));
}

TEST_F(AccessPoint, WithoutSettingsKeepsItsGuestsFromWhatIsNotTheirs) {
  library::MEROWirelessGetAPConfig = [](const char*, PMERO_AP_CONF conf) {
    std::strcpy(conf->hostapConf.szSSID, "Office");
    std::strcpy(conf->hostapConf.szBridge, "lbr0");
    return 0;
  };
  RecordSaves([](const MERO_AP_CONF& of) {
    return std::to_string(of.guestNetAccessRule.blLanBlock) + std::to_string(of.hostapConf.guestNet.blAPIsolate);
  });
  EXPECT_EQ(Tool({"ap", "set", "--guest-net-enable", "yes", "--guest-net-ssid", "Guests"}).status, 0);
  EXPECT_EQ(library::Calls()[1], "on: 11");
}

TEST_F(AccessPoint, ThatIsEnabledIsSavedOnce) {
  MERO_AP_CONF conf = library::Office();
  conf.blEnable = TRUE;
  library::SavedAp(conf);
  EXPECT_EQ(Tool({"ap", "set", "--ssid", "New"}).status, 0);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig"));
}

TEST_F(AccessPoint, TakesAllSettingsByTheOptionsThatTheirKeysMake) {
  std::string week;
  for (int day = 0; day < 7; ++day) week += "000000001111111111110000\n";
  WriteText("/tmp/week", week);
  RecordSaves([](const MERO_AP_CONF& of) {
    const MERO_HOSTAP_CONF& main = of.hostapConf;
    std::string text;
    for (int value : {main.hwMode, main.ieee80211n, main.channel, main.wirelessWidth, int{main.encryption},
                      main.encryptInfo.wpaPskInfo.wpaType, main.encryptInfo.wpaPskInfo.encryptType, main.hideSSID,
                      main.maxStation, main.wmm, of.txpower, of.wifiSchedConf.wifiSchedEnabled,
                      int{main.guestNet.blEnable}, int{main.guestNet.encryption}, int{main.guestNet.blAPIsolate},
                      int{of.guestNetAccessRule.blLanBlock}, int{of.guestNetAccessRule.blInternetBlock},
                      int{of.guestNetAccessRule.blAccessDS}, int{of.guestNetAccessRule.blAllowHttp}}) {
      text += std::to_string(value) + " ";
    }
    return text + main.szBridge + " " + main.encryptInfo.wpaPskInfo.szPassPhrase + " " +
           main.guestNet.encryptInfo.wpaPskInfo.szPassPhrase + " " +
           std::string(of.wifiSchedConf.szWifiSched).substr(0, 12);
  });
  WriteText("/tmp/main-key", "main secret\n");
  WriteText("/tmp/guest-key", "guest secret\n");
  const Ran ran =
      Tool(Words("ap set --band 5 --hw-mode an --channel 44 --ieee80211n-wireless-width 40 --encryption mixed "
                 "--wpa-encrypt-type both --key-file /tmp/main-key"
                 " --ignore-broadcast-ssid yes --max-num-sta 12 --wmm-enabled no --txpower 20 --wifi-sched /tmp/week "
                 "--guest-net-enable yes --guest-net-encryption wpa2"
                 " --guest-net-key-file /tmp/guest-key --ap-isolate yes --guest-net-lan-block no "
                 "--guest-net-internet-block yes --guest-net-access-ds yes"
                 " --guest-net-allow-http no --bridge br7"));
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_EQ(library::Calls()[1],
            "on: 1 1 44 2 2 3 3 1 12 0 20 1 1 2 1 0 1 1 0 br7 main secret guest secret 000000001111");
}

TEST_F(AccessPoint, HasNoGuestsWhereTheModelHasNone) {
  library::PLIBCFileCheckKeyValue = [](const char* szPath, const char* szKey, const char* szExpected, int) {
    EXPECT_EQ(std::string(szPath) + " " + szKey + " " + szExpected, "/etc.defaults/meroinfo.conf support_pci_wifi yes");
    return 0;
  };
  const Ran ran = Tool({"ap", "set", "--guest-net-enable", "yes", "--guest-net-ssid", "Guests"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("this appliance has no guest network"));
  EXPECT_EQ(Tool({"ap", "set", "--guest-net-enable", "no"}).status, 0);
}

TEST_F(AccessPoint, RefusesSettingsThatCannotBe) {
  WriteText("/tmp/short", "seven77\n");
  WriteText("/tmp/week", "0101\n");
  const std::pair<std::vector<std::string>, int> wrong[] = {
      {{}, 2},
      {{"--channel", "36"}, 2},
      {{"--band", "5", "--channel", "6"}, 2},
      {{"--band", "6"}, 2},
      {{"--hw-mode", "an", "--channel", "36"}, 2},
      {{"--band", "5", "--hw-mode", "gn", "--channel", "6"}, 2},
      {{"--channel", "eleven"}, 2},
      {{"--ssid", ""}, 2},
      {{"--ssid", std::string(33, 'x')}, 2},
      {{"--encryption", "wpa3"}, 2},
      {{"--encryption", "wep"}, 2},
      {{"--encryption", "eap"}, 2},
      {{"--encryption", "open", "--wpa-encrypt-type", "aes"}, 2},
      {{"--auth-server-addr", "10.0.0.1"}, 2},
      {{"--auth-server-port", "1812"}, 2},
      {{"--key-file", "/tmp/short"}, 5},
      {{"--ignore-broadcast-ssid", "perhaps"}, 2},
      {{"--max-num-sta", "0"}, 2},
      {{"--bridge", "../x"}, 2},
      {{"--bridge", "a-name-of-sixteen"}, 2},
      {{"--wifi-sched", "/tmp/week"}, 2},
      {{"--guest-net-enable", "yes", "--guest-net-encryption", "wpa2"}, 2},
      {{"--guest-net-encryption", "eap"}, 2},
      {{"--guest-net-key-file", "/tmp/short"}, 2},
  };
  for (const auto& [options, status] : wrong) {
    std::vector<std::string> arguments{"ap", "set"};
    arguments.insert(arguments.end(), options.begin(), options.end());
    const Ran ran = Tool(arguments);
    EXPECT_EQ(ran.status, status) << testing::PrintToString(options) << ran.err;
    EXPECT_THAT(ran.err, testing::MatchesRegex("merowireless: [^\n]+: [^\n]+\n")) << testing::PrintToString(options);
  }
  EXPECT_THAT(library::Calls(), IsEmpty());
}

// For the guests' network, the option of the main one was advised, which would have protected another network.
TEST_F(AccessPoint, IsToldTheOptionThatIsMissingOfTheNetworkInQuestion) {
  WriteText("/tmp/key", "open sesame\n");
  EXPECT_THAT(Tool({"ap", "set", "--encryption", "open", "--key-file", "/tmp/key"}).err,
              HasSubstr("has no secret: add --encryption wpa2\n"));
  EXPECT_THAT(Tool({"ap", "set", "--guest-net-key-file", "/tmp/key"}).err,
              HasSubstr("has no secret: add --guest-net-encryption wpa2\n"));
  EXPECT_THAT(Tool({"ap", "set", "--guest-net-wpa-encrypt-type", "aes"}).err,
              HasSubstr("choice of ciphers: add --guest-net-encryption wpa2\n"));
  EXPECT_THAT(Tool({"ap", "set", "--guest-net-encryption", "wpa3"}).err,
              HasSubstr("--guest-net-encryption cannot be this"));
}

TEST_F(AccessPoint, IsEnabledAndDisabledTogetherWithItsSwitch) {
  RecordSaves([](const MERO_AP_CONF&) { return std::string(); });
  EXPECT_EQ(Tool({"ap", "enable"}).out, "the access point Office is enabled\n");
  EXPECT_EQ(Tool({"ap", "disable"}).out, "the access point is disabled\n");
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig", "on: ", "MEROWirelessAPEnable",
                                            "MEROWirelessSetAPConfig", "off: ", "MEROWirelessAPDisable"));
}

TEST_F(AccessPoint, IsNotEnabledAsNobodyHasSetIt) {
  library::MEROWirelessGetAPConfig = [](const char*, PMERO_AP_CONF conf) { return *conf = library::Office(), 0; };
  const Ran ran = Tool({"ap", "enable"});
  EXPECT_EQ(ran.status, 2);
  EXPECT_THAT(ran.err, HasSubstr("`merowireless ap set` gives it"));
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(AccessPoint, ThatCannotBeEnabledSaysWhy) {
  const std::pair<const char*, const char*> reports[] = {
      {"Another ap construction is going", "is being set up already"},
      {"Failed to restart /etc/rc.network", "the network start script failed"},
      {"Failed to enable AP.", "could not be enabled"},
  };
  for (const auto& [szReport, szSentence] : reports) {
    library::MEROWirelessAPEnable = [szText = szReport] {
      return library::Report("wireless_ap_enable", szText), FALSE;
    };
    const Ran ran = Tool({"ap", "enable"});
    EXPECT_EQ(ran.status, 1);
    EXPECT_THAT(ran.err, HasSubstr(szSentence));
  }
}

TEST_F(AccessPoint, ThatCannotBeEnabledIsDisabled) {
  library::MEROWirelessAPEnable = [] { return FALSE; };
  library::MEROWirelessAPDisable = [] { return FALSE; };
  RecordSaves([](const MERO_AP_CONF&) { return std::string(); });
  const Ran ran = Tool({"ap", "enable"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: the access point could not be taken down whole\n"));
  EXPECT_THAT(ran.err, HasSubstr("merowireless: the access point could not be enabled: "));
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig", "on: ", "MEROWirelessAPEnable",
                                            "MEROWirelessSetAPConfig", "off: ", "MEROWirelessAPDisable"));
}

TEST_F(AccessPoint, ThatAnotherSetsUpIsLeftToIt) {
  library::MEROWirelessAPEnable = [] {
    return library::Report("wireless_ap_enable", "Another ap construction is going"), FALSE;
  };
  EXPECT_EQ(Tool({"ap", "enable"}).status, 1);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig", "MEROWirelessAPEnable"));
}

TEST_F(AccessPoint, ThatCannotBeSavedIsNotTried) {
  library::MEROWirelessSetAPConfig = [](PMERO_AP_CONF) { return FALSE; };
  EXPECT_THAT(Tool({"ap", "enable"}).err, HasSubstr("the settings could not be saved"));
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig"));
}

TEST_F(AccessPoint, ThatThereNeverWasIsDisabled) {
  library::MEROWirelessAPDisable = [] {
    return library::Report("wireless_ap_disable", "File[/etc/sysconfig/network-scripts/ifcfg-wlan0] does not exist."),
           FALSE;
  };
  EXPECT_EQ(Tool({"ap", "disable"}).out, "the access point is disabled\n");
  library::MEROWirelessAPDisable = [] {
    return library::Report("wireless_ap_disable", "Failed to restart /etc/rc.network"), FALSE;
  };
  EXPECT_EQ(Tool({"ap", "disable"}).status, 1);
}

TEST_F(AccessPoint, WhoseStartIsInterruptedIsDisabled) {
  library::MEROWirelessAPEnable = [] {
    library::Record("enabling");
    while (true) ::pause();
    return TRUE;
  };
  RecordSaves([](const MERO_AP_CONF&) { return std::string(); });
  StartedTool tool({"ap", "enable"});
  ASSERT_TRUE(Soon([] { return std::ranges::count(library::Calls(), "enabling") > 0; }));
  ::kill(tool.pid(), SIGINT);
  EXPECT_EQ(tool.Wait().status, 130);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig", "on: ", "MEROWirelessAPEnable", "enabling",
                                            "MEROWirelessSetAPConfig", "off: ", "MEROWirelessAPDisable"));
}

TEST_F(AccessPoint, WhoseStartCannotBeUndoneSaysSo) {
  library::MEROWirelessAPEnable = [] {
    library::Record("enabling");
    while (true) ::pause();
    return TRUE;
  };
  library::MEROWirelessSetAPConfig = [](PMERO_AP_CONF conf) { return conf->blEnable; };
  StartedTool tool({"ap", "enable"});
  ASSERT_TRUE(Soon([] { return std::ranges::count(library::Calls(), "enabling") > 0; }));
  ::kill(tool.pid(), SIGINT);
  const Ran ran = tool.Wait();
  EXPECT_EQ(ran.status, 130);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: the settings could not be saved\n"));
}

TEST_F(AccessPoint, WhoseChangeIsInterruptedHasItsSwitchAsItWas) {
  library::MEROWirelessSetAPConfig = [](PMERO_AP_CONF conf) {
    library::Record(conf->blEnable == TRUE ? "on" : "off");
    ::kill(::getpid(), SIGINT);
    return TRUE;
  };
  StartedTool tool({"ap", "set", "--ssid", "New"});
  (void)tool.Wait();
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig", "on", "MEROWirelessSetAPConfig", "off"));
}

TEST_F(AccessPoint, ThatTheKernelDoesNotHaveAfterwardsWasNotEnabled) {
  library::MEROWirelessAPEnable = [] { return TRUE; };
  const Ran ran = Tool({"ap", "enable"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: the access point Office was started, and is not on the air: "));
}

TEST_F(AccessPoint, ThatTheKernelHasAfterwardsWasNotDisabled) {
  kernel::BecomeAccessPoint("Office");
  library::MEROWirelessAPDisable = [] { return TRUE; };
  const Ran ran = Tool({"ap", "disable"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: the access point is disabled, and the kernel has one on the air: "));
}

// ---- Its channel ----

// A radio as it is where channels 12 and 13 may only be listened to.
void GiveChannels() {
  kernel::g_channels = {{2412},
                        {2437},
                        {2462},
                        {2472, NL80211_FREQUENCY_ATTR_NO_IR},
                        {2484, NL80211_FREQUENCY_ATTR_DISABLED},
                        {5180},
                        {5260, NL80211_FREQUENCY_ATTR_RADAR},
                        {5500, NL80211_FREQUENCY_ATTR_DISABLED},
                        {5860}};  // which no access point of this program uses
}

constexpr char kUsable[] =
    "`merowireless country CC` tells the country; it may use 1, 6, 11 in the 2.4 GHz band, and 36, 52 (radar) in the 5 "
    "GHz band\n";

// It was saved, and the access point that was on the air went off it when it was enabled.
TEST_F(AccessPoint, TakesNoChannelThatTheRadioMayNotUse) {
  GiveChannels();
  for (const char* szOptions : {"--channel 13", "--channel 14", "--channel 2", "--band 5 --channel 100"}) {
    const Ran ran = Tool(Words(std::string("ap set ") + szOptions));
    EXPECT_EQ(ran.status, 2) << szOptions;
    EXPECT_THAT(ran.err, testing::StartsWith("merowireless: this radio may not use channel ")) << szOptions;
    EXPECT_THAT(ran.err, testing::EndsWith(std::string(" without a country: ") + kUsable)) << szOptions;
  }
  EXPECT_THAT(library::Calls(), IsEmpty());
  for (const char* szOptions : {"--channel 11", "--channel auto", "--band 5", "--band 5 --channel 52"}) {
    const Ran ran = Tool(Words(std::string("ap set ") + szOptions));
    EXPECT_EQ(ran.status, 0) << szOptions;
    EXPECT_EQ(ran.err, "") << szOptions;
  }
}

TEST_F(AccessPoint, IsNotTriedOnAChannelThatTheRadioMayNotUse) {
  GiveChannels();
  MERO_AP_CONF conf = library::Office();
  conf.hostapConf.channel = 13;
  library::SavedAp(conf);
  EXPECT_THAT(Tool({"ap", "enable"}).err,
              HasSubstr("merowireless: this radio may not use channel 13 without a country: "));
  EXPECT_THAT(library::Calls(), IsEmpty());
  EXPECT_EQ(Tool({"ap", "set", "--ssid", "New"}).status, 0) << "what has nothing to do with the channel";
}

TEST_F(AccessPoint, IsSavedWithoutARadioThatKnowsItsChannels) {
  const Ran ran = Tool({"ap", "set", "--channel", "13"});
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(ran.err, "merowireless: the channel could not be checked, since no radio is there to tell\n");
  EXPECT_EQ(library::Calls().size(), 2U);
  EXPECT_EQ(Tool({"ap", "set", "--ssid", "New"}).err, "") << "no remark about what was not asked for";
}

// ---- The one that was on the air before ----

class FormerAccessPoint : public AccessPoint {
 protected:
  FormerAccessPoint() {
    kernel::BecomeAccessPoint("Old Office");
    WriteText(kHost, "ssid=Old Office\n");
    WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"yes\"\n", 0644);
    WriteText(kScripts + "ifcfg-wlan0", "DEVICE=wlan0\nBRIDGE=br7\n", 0644);
    library::MEROWirelessAPEnable = [] {
      kernel::BecomeClient();
      WriteText(kHost, "ssid=Office\n");
      WriteText(kScripts + "ifcfg-wlan0", "DEVICE=wlan0\nBRIDGE=lbr0\n");
      WriteText(kScripts + "ifcfg-lbr0", "DEVICE=lbr0\n");
      WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"no\"\n");
      return library::Record("enabling"), FALSE;
    };
    library::MEROWirelessAPDisable = [] { return kernel::BecomeClient(), TRUE; };
    RecordSaves([](const MERO_AP_CONF&) { return std::string(); });
    kernel::AppearWith(kStarted, "Old Office");
  }

  static void SetScript(const std::string& text) { WriteScript("/etc/rc.network", text); }

  static inline const std::string kHost = "/etc/hostapd/hostapd-wlan0-host.conf";
  static inline const std::string kScripts = "/etc/sysconfig/network-scripts/";
  static constexpr char kStarted[] = "/tmp/started";
};

// It was gone for good, for a channel that the new one could not use.
TEST_F(FormerAccessPoint, ComesBackWhenTheNextOneCannotBeEnabled) {
  SetScript("echo $* >/tmp/started\n");
  const Ran ran = Tool({"ap", "enable"});
  EXPECT_EQ(ran.status, 1);
  constexpr char kMessage[] = "the access point could not be enabled, and the one that was on the air is there again";
  EXPECT_THAT(ran.err, HasSubstr("merowireless: " + std::string(kMessage) + ": "));
  EXPECT_EQ(ReadText(kStarted), "start wlan0 br7\n");
  EXPECT_EQ(ReadText(kHost), "ssid=Old Office\n");
  EXPECT_EQ(ModeOf(kHost), 0600U);
  EXPECT_EQ(ReadText("/etc/hostapd/hostapd-wlan0.info"), "enable=\"yes\"\n");
  EXPECT_EQ(ReadText(kScripts + "ifcfg-wlan0"), "DEVICE=wlan0\nBRIDGE=br7\n");
  EXPECT_FALSE(Exists(kScripts + "ifcfg-lbr0"));
  EXPECT_THAT(NamesIn("/etc/hostapd"), Not(testing::Contains(HasSubstr("host.conf."))));
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig", "on: ", "MEROWirelessAPEnable", "enabling"));
}

TEST_F(FormerAccessPoint, ComesBackWhenTheNextOneIsInterrupted) {
  SetScript("echo $* >/tmp/started\n");
  library::MEROWirelessAPEnable = [] {
    kernel::BecomeClient();
    WriteText(kHost, "ssid=Office\n");
    library::Record("enabling");
    while (true) ::pause();
    return TRUE;
  };
  StartedTool tool({"ap", "enable"});
  ASSERT_TRUE(Soon([] { return std::ranges::count(library::Calls(), "enabling") > 0; }));
  ::kill(tool.pid(), SIGINT);
  EXPECT_EQ(tool.Wait().status, 130);
  EXPECT_EQ(ReadText(kStarted), "start wlan0 br7\n");
  EXPECT_EQ(ReadText(kHost), "ssid=Old Office\n");
}

TEST_F(FormerAccessPoint, ThatDoesNotComeBackIsDisabled) {
  SetScript("exit 1\n");
  const Ran ran = Tool({"ap", "enable"});
  EXPECT_EQ(ran.status, 1);
  constexpr char kMessage[] = "the access point that was on the air could not be brought back, and is disabled";
  EXPECT_THAT(ran.err, HasSubstr("merowireless: " + std::string(kMessage) + "\n"));
  EXPECT_THAT(ran.err, HasSubstr("merowireless: the access point could not be enabled: "));
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig", "on: ", "MEROWirelessAPEnable", "enabling",
                                            "MEROWirelessSetAPConfig", "off: ", "MEROWirelessAPDisable"));
}

// The file was taken for one that was not there, and would have been removed.
TEST_F(FormerAccessPoint, IsNotTouchedWhenItCouldNotBeBroughtBack) {
  SetScript("echo $* >/tmp/started\n");
  Shell("ln -s ifcfg-lbr0 " + kScripts + "ifcfg-lbr0");
  const Ran ran = Tool({"ap", "enable"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, StartsWith("merowireless: " + kScripts + "ifcfg-lbr0"));
  EXPECT_THAT(ran.err, HasSubstr(" cannot be read, and nothing was changed: Too many levels of symbolic links: "));
  EXPECT_THAT(library::Calls(), IsEmpty());
  EXPECT_EQ(ReadText(kHost), "ssid=Old Office\n");
  Shell("rm " + kScripts + "ifcfg-lbr0");
}

// ---- Who is at it ----

// Its marker stayed, and the next attempt was refused.
TEST_F(AccessPoint, IsEnabledAfterAnAttemptThatWasKilled) {
  library::MEROWirelessAPEnable = [] {
    return Exists(kApMarkerPath) ? FALSE : (kernel::BecomeAccessPoint("Office"), TRUE);
  };
  Shell(std::string("touch -d '10 minutes ago' ") + kApMarkerPath);
  EXPECT_EQ(Tool({"ap", "enable"}).status, 0);
}

// The library would have taken the marker of whoever was at it.
TEST_F(AccessPoint, ThatSomebodySetsUpIsNotTouched) {
  WriteText(kApMarkerPath, "");
  EXPECT_THAT(Tool({"ap", "enable"}).err, HasSubstr("merowireless: an access point is being set up already, or "));
  EXPECT_TRUE(Exists(kApMarkerPath));
  EXPECT_THAT(library::Calls(), IsEmpty());
}

// ---- Its status ----

// The settings of an access point that has a schedule, with no hour on the air or with all of them.
MERO_AP_CONF Scheduled(char digit) {
  MERO_AP_CONF conf = library::Office();
  MERO_WIFI_SCHED_CONF& schedule = conf.wifiSchedConf;
  schedule.wifiSchedEnabled = 1;
  std::memset(schedule.szWifiSched, digit, sizeof schedule.szWifiSched - 1);
  return conf;
}

// The marker of an attempt that was killed, from just before this process could have made it.
void MakeStaleMarker() {
  const std::string pid = std::to_string(::getpid());
  Shell("touch -d \"$(($(ps -o etimes= -p " + pid + ") + 2)) seconds ago\" " + kApMarkerPath);
}

// The first fields of the status in a line.
std::string StatusLine() {
  const std::string line = Tool({"ap", "status", "--porcelain"}).out;
  return line.substr(0, line.find("\tOffice"));
}

std::string StatusDocument() {
  return Tool({"ap", "status", "--json"}).out;
}

// What was saved was shown as what is on the air.
TEST_F(AccessPoint, TellsWhatIsOnTheAirByTheKernel) {
  kernel::BecomeAccessPoint("Old Office", 5180);
  kernel::Main().stations = 3;
  EXPECT_EQ(StatusDocument(),
            R"({"result":"ok","access_point":{"state":"on-air","name":"Office","enabled":false,"interface":"wlan0",)"
            R"("air_name":"Old Office","air_name_hex":null,"channel":36,"megahertz":5180,"stations":3,)"
            R"("pending":null}})"
            "\n");
  EXPECT_EQ(Tool({"ap", "status"}).out,
            "access point  on the air\n"
            "name          Office\n"
            "enabled       no\n"
            "interface     wlan0\n"
            "on air as     Old Office\n"
            "channel       36\n"
            "stations      3\n"
            "settings      -\n");
  EXPECT_EQ(Tool({"ap", "status", "--porcelain"}).out, "on-air\tOffice\tno\twlan0\tOld Office\t\t36\t5180\t3\t\n");
}

TEST_F(AccessPoint, CountsItsGuestsAmongItsStations) {
  kernel::BecomeAccessPoint("Office");
  kernel::Main().stations = 2;
  kernel::Guests() = kernel::Main();
  EXPECT_THAT(StatusDocument(), HasSubstr(R"("stations":4,)"));
  kernel::Guests().joining = 1;
  EXPECT_THAT(StatusDocument(), HasSubstr(R"("stations":3,)")) << "who is not let in is none";
}

TEST_F(AccessPoint, ThatThereIsNoneOfIsOff) {
  EXPECT_EQ(StatusDocument(),
            R"({"result":"ok","access_point":{"state":"off","name":"Office","enabled":false,"interface":"wlan0",)"
            R"("air_name":null,"air_name_hex":null,"channel":null,"megahertz":null,"stations":null,)"
            R"("pending":null}})"
            "\n");
  kernel::Main().isThere = false;
  EXPECT_EQ(StatusLine(), "off");
}

// The interface has the type of an access point then, and so it was said to be on the air.
TEST_F(AccessPoint, ThatItsScheduleKeepsOffTheAirSaysSo) {
  kernel::BecomeAccessPoint("", 0);
  const StartedDaemon hostapd("hostapd", kPid);
  library::SavedAp(Scheduled('0'));
  EXPECT_EQ(StatusLine(), "off-by-schedule");
  EXPECT_THAT(Tool({"ap", "status"}).out, HasSubstr("off the air at this hour, by its schedule\n"));
}

TEST_F(AccessPoint, WhoseInterfaceIsDownSaysSo) {
  kernel::BecomeAccessPoint("", 0);
  EXPECT_EQ(StatusLine(), "off") << "its daemon is gone";
  const StartedDaemon hostapd("hostapd", kPid);
  library::SavedAp(Scheduled('1'));
  EXPECT_EQ(StatusLine(), "interface-down");
  EXPECT_THAT(Tool({"ap", "status"}).out, HasSubstr("off the air, since its interface is down\n"));
  EXPECT_EQ(Tool({"mode", "ap"}).out,
            "the adapter is an access point's already: Office is off the air, since its interface is down\n");
}

// Every state but "off" keeps the adapter from being used otherwise, and "off" does not: `connect` asked the library
// and the age of a marker, and `ap status` the kernel and the processes.
TEST_F(AccessPoint, IsTheSameForEveryCommand) {
  const auto expect = [](const std::string& state) {
    const int refused = state == "off" ? 0 : 8;
    EXPECT_EQ(StatusLine(), state);
    EXPECT_EQ(Tool({"connect", "Home"}).status, refused) << state;
    EXPECT_EQ(Tool({"scan", "--renew"}).status, refused) << state;
    EXPECT_EQ(Tool({"status", "--porcelain"}).out.starts_with("access-point\t"), refused != 0) << state;
    EXPECT_EQ(Tool({"mode", "client"}).out == "the adapter is a client's already\n", refused == 0) << state;
  };
  library::Known({library::Home()});
  library::MEROWirelessModeChange = [](MERO_WIRELESS_MODE) { return FALSE; };
  expect("off");
  MakeStaleMarker();
  expect("off");
  WriteText(kApMarkerPath, "");
  expect("setting-up");
  std::filesystem::remove(kApMarkerPath);

  kernel::BecomeAccessPoint("Office");
  expect("on-air");
  kernel::BecomeAccessPoint("", 5260);
  expect("waiting-for-radar");
  kernel::BecomeAccessPoint("", 0);
  expect("off");
  kernel::Guests() = {.isThere = true, .type = NL80211_IFTYPE_AP, .megahertz = 2437, .szName = "Guests", .stations = 0};
  expect("interface-down");
  kernel::Guests() = {};

  const StartedDaemon hostapd("hostapd", kPid);
  expect("interface-down");
  library::SavedAp(Scheduled('0'));
  expect("off-by-schedule");
  kernel::BecomeClient();
  expect("setting-up");
}

TEST_F(AccessPoint, TellsByTheHourOfTheWeekWhetherItsScheduleKeepsItOffTheAir) {
  kernel::BecomeAccessPoint("", 0);
  MERO_AP_CONF conf = Scheduled('0');
  std::tm utc{};
  const std::time_t now = std::time(nullptr);
  ::gmtime_r(&now, &utc);
  const int hour = utc.tm_wday * 24 + utc.tm_hour;
  for (const int on : {hour, hour + 1}) conf.wifiSchedConf.szWifiSched[on % 168] = '1';  // the hour may end meanwhile
  library::SavedAp(conf);
  const StartedDaemon hostapd("hostapd", kPid);
  const std::string line = Tool({"ap", "status", "--porcelain"}, {.environment = {{"TZ", "UTC"}}}).out;
  EXPECT_THAT(line, testing::StartsWith("interface-down\t"));
}

TEST_F(AccessPoint, ThatListensForRadarSaysSo) {
  kernel::BecomeAccessPoint("", 5260);
  EXPECT_EQ(StatusLine(), "waiting-for-radar");
  library::MEROWirelessAPEnable = [] { return TRUE; };
  EXPECT_EQ(Tool({"ap", "enable"}).out,
            "the access point Office is enabled, and waits until channel 52 is known to be free of radar\n");
}

TEST_F(AccessPoint, IsBeingSetUpWhileSomebodyIsAtIt) {
  WriteText(kApMarkerPath, "");
  EXPECT_EQ(StatusLine(), "setting-up");
  EXPECT_THAT(Tool({"ap", "status"}).out, testing::StartsWith("access point  being set up\n"));
}

// Whoever has an account could keep the adapter from everybody for ever, with a file and a program that has the
// library.
TEST_F(AccessPoint, IsNotBeingSetUpByAMarkerThatIsNotRoots) {
  WriteText(kApMarkerPath, "");
  Shell(std::string("chown 65534 ") + kApMarkerPath);
  EXPECT_EQ(StatusLine(), "off");
}

// The clock was put back at a start.
TEST_F(AccessPoint, IsNotBeingSetUpByAMarkerFromTheFuture) {
  Shell(std::string("touch -d tomorrow ") + kApMarkerPath);
  EXPECT_EQ(StatusLine(), "off");
}

// A process that was killed left its marker, and the access point was "being set up" from then on.
TEST_F(AccessPoint, IsNotBeingSetUpByAProcessThatIsGone) {
  Shell(std::string("touch -d '10 minutes ago' ") + kApMarkerPath);
  EXPECT_EQ(StatusLine(), "off");
}

// What guests may reach was not compared: guests could still get at the appliance, and nothing waited.
void ExpectGuestRightsCompared() {
  constexpr char kRights[] = "/var/run/rc.network/guest-rights";
  const std::string rights =
      "guest_net_lan_block=yes\nguest_net_access_ds=no\nguest_net_internet_block=no\nguest_net_allow_http=no\n";
  EXPECT_THAT(StatusDocument(), HasSubstr(R"("pending":false})")) << "no guests are on the air";
  WriteText(kRights, rights);
  EXPECT_THAT(StatusDocument(), HasSubstr(R"("pending":false})"));
  for (const char* szKey : {"lan_block", "access_ds", "internet_block", "allow_http"}) {
    Shell(std::string("sed -i '/") + szKey + "=/{s/yes/-/;s/no/yes/;s/-/no/}' " + kRights);
    EXPECT_THAT(StatusDocument(), HasSubstr(R"("pending":true})")) << szKey;
    WriteText(kRights, rights);
  }
  std::filesystem::remove(kRights);
}

void ExpectCountryCompared() {
  constexpr char kStartedWith[] = "/var/run/rc.network/hostapd-wlan0.conf";
  constexpr char kCountry[] = "/usr/mero/etc/wireless_country.conf";
  WriteText(kStartedWith, "interface=wlan0\ncountry_code=DE\nieee80211d=1\n");
  EXPECT_THAT(StatusDocument(), HasSubstr(R"("pending":true})")) << "a country that is not set any more";
  WriteText(kCountry, "country=\"DE\"\n");
  EXPECT_THAT(StatusDocument(), HasSubstr(R"("pending":false})"));
  WriteText(kStartedWith, "interface=wlan0\n");
  EXPECT_THAT(StatusDocument(), HasSubstr(R"("pending":true})")) << "a country that is not told yet";
  std::filesystem::remove(kStartedWith);
  std::filesystem::remove(kCountry);
}

TEST_F(AccessPoint, TellsWhetherWhatWasSavedIsOnTheAir) {
  const std::string host = "/etc/hostapd/hostapd-wlan0-host.conf";
  kernel::BecomeAccessPoint("Office");
  Shell("mkdir -p /etc/hostapd");
  WriteText(host,
            "interface=wlan0\ndriver=nl80211\nssid=Office\nignore_broadcast_ssid=0\nmacaddr_acl=0\n"
            "wpa_psk_file=/etc/hostapd.psk\nwps_state=2\nap_setup_locked=1\nctrl_interface=/var/run/hostapd\n"
            "config_methods=label display push_button keypad\nmax_num_sta=256\nbridge=lbr0\nchannel=6\nieee80211n=1\n"
            "ht_capab=[SHORT-GI-20][DELAYED-BA][SHORT-GI-40][MAX-AMSDU-7935][HT40-]\nwmm_enabled=1\nhw_mode=g\n"
            "eap_server=1\nauth_algs=1\nwpa=2\nwpa_key_mgmt=WPA-PSK\nwpa_passphrase=open sesame\nwpa_pairwise=CCMP\n"
            "rsn_pairwise=CCMP\n");
  EXPECT_THAT(StatusDocument(), HasSubstr(R"("pending":false})"));
  EXPECT_THAT(Tool({"ap", "status"}).out, HasSubstr("\nsettings      as on the air\n"));

  MERO_AP_CONF conf = library::Office();
  std::strcpy(conf.hostapConf.encryptInfo.wpaPskInfo.szPassPhrase, "open says me");
  library::SavedAp(conf);
  EXPECT_THAT(StatusDocument(), HasSubstr(R"("pending":true})"));
  EXPECT_THAT(Tool({"ap", "status"}).out, HasSubstr("\nsettings      saved, not yet on the air\n"));

  conf = library::Office();
  conf.hostapConf.guestNet.blEnable = TRUE;
  library::SavedAp(conf);
  EXPECT_THAT(StatusDocument(), HasSubstr(R"("pending":true})")) << "guests, who are not on the air";
  library::SavedAp(library::Office());
  ExpectGuestRightsCompared();
  ExpectCountryCompared();
}

TEST_F(AccessPoint, NeedsAnAdapterThatHasBeenAnnounced) {
  library::MEROWirelessApConfigSecNameGet = [](char*, size_t) { return FALSE; };
  EXPECT_EQ(Tool({"ap", "show"}).status, 1);
  library::MEROWirelessAdapterNum = [] { return 0; };
  EXPECT_EQ(Tool({"ap", "show"}).status, 3);
}

// Without it, the access point was said to be off.
TEST_F(AccessPoint, HasNoStatusWithoutItsAdapter) {
  library::MEROWirelessAdapterNum = [] { return 0; };
  EXPECT_EQ(Tool({"ap", "status"}).status, 3);
}

}  // namespace
