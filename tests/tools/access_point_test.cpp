// The commands about the access point.
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstring>
#include <filesystem>
#include <iterator>
#include <sstream>
#include <tuple>

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
  const std::tuple<const char*, int, const char*> reports[] = {
      {"Another ap construction is going", 8, "is being set up already"},
      {"Failed to restart /etc/rc.network", 1, "the network start script failed"},
      {"Failed to enable AP.", 1, "could not be enabled"},
  };
  for (const auto& [szReport, status, szSentence] : reports) {
    library::MEROWirelessAPEnable = [szText = szReport] {
      return library::Report("wireless_ap_enable", szText), FALSE;
    };
    const Ran ran = Tool({"ap", "enable"});
    EXPECT_EQ(ran.status, status);
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
  EXPECT_EQ(Tool({"ap", "enable"}).status, 8);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig", "MEROWirelessAPEnable"));
}

TEST_F(AccessPoint, ThatCannotBeSavedIsNotTried) {
  library::MEROWirelessSetAPConfig = [](PMERO_AP_CONF) { return FALSE; };
  EXPECT_THAT(Tool({"ap", "enable"}).err, HasSubstr("the settings could not be saved"));
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig"));
}

TEST_F(AccessPoint, ThatNobodyHasSetIsNotSavedByDisablingIt) {
  library::MEROWirelessGetAPConfig = [](const char*, PMERO_AP_CONF conf) { return *conf = MERO_AP_CONF{}, 0; };
  EXPECT_EQ(Tool({"ap", "disable"}).out, "the access point is disabled\n");
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessAPDisable"));
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
  RecordSaves([](const MERO_AP_CONF&) { return std::string(); });
  const Ran ran = Tool({"ap", "enable"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: the access point could not be enabled: "));
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig", "on: ", "MEROWirelessAPEnable",
                                            "MEROWirelessSetAPConfig", "off: ", "MEROWirelessAPDisable"));
}

// It was left on the air, and told to be disabled.
TEST_F(AccessPoint, ThatCannotBeTakenBackIsToldToBeOnTheAir) {
  library::MEROWirelessAPEnable = [] {
    kernel::BecomeAccessPoint("Office");
    return library::Report("wireless_ap_enable", "Failed to restart /etc/rc.network"), FALSE;
  };
  library::MEROWirelessAPDisable = [] { return FALSE; };
  const Ran ran = Tool({"ap", "enable"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("the access point could not be enabled, and an access point is left on the air: "));
}

TEST_F(AccessPoint, WhoseSwitchCannotBeSavedIsTakenDownAllTheSame) {
  library::MEROWirelessAPEnable = [] { return FALSE; };
  library::MEROWirelessSetAPConfig = [](PMERO_AP_CONF conf) { return conf->blEnable; };
  EXPECT_THAT(Tool({"ap", "enable"}).err, HasSubstr("merowireless: the settings could not be saved\n"));
  EXPECT_EQ(library::Calls().back(), "MEROWirelessAPDisable");
  EXPECT_EQ(Tool({"ap", "disable"}).status, 1);
  EXPECT_EQ(library::Calls().back(), "MEROWirelessAPDisable");
}

// Nobody can tell any more whose the settings are: what was begun was left as it was.
TEST_F(AccessPoint, WhoseAdapterIsPulledMeanwhileIsTakenBack) {
  static constexpr char kPulled[] = "/tmp/pulled";
  library::MEROWirelessAPEnable = [] { return WriteText(kPulled, ""), FALSE; };
  library::MEROWirelessApConfigSecNameGet = [known = library::MEROWirelessApConfigSecNameGet](char* szName,
                                                                                              size_t size) {
    return Exists(kPulled) ? FALSE : known(szName, size);
  };
  EXPECT_EQ(Tool({"ap", "enable"}).status, 1);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig", "MEROWirelessAPEnable",
                                            "MEROWirelessSetAPConfig", "MEROWirelessAPDisable"));
  std::filesystem::remove(kPulled);
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
  const Ran ran = Tool({"ap", "enable"});
  EXPECT_EQ(ran.status, 8);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: an access point is being set up already, or "));
  EXPECT_TRUE(Exists(kApMarkerPath));
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(AccessPoint, NeedsAnAdapterThatHasBeenAnnounced) {
  library::MEROWirelessApConfigSecNameGet = [](char*, size_t) { return FALSE; };
  EXPECT_EQ(Tool({"ap", "show"}).status, 1);
  library::MEROWirelessAdapterNum = [] { return 0; };
  EXPECT_EQ(Tool({"ap", "show"}).status, 3);
}

}  // namespace
