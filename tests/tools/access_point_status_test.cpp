// What the program says of the access point's state.
#include <unistd.h>

#include <cstring>
#include <filesystem>

#include "common/paths.h"
#include "running.h"

using testing::HasSubstr;

namespace {

constexpr char kPid[] = "/var/run/rc.network/hostapd-wlan0.pid";

class AccessPointStatus : public ToolTest {
 protected:
  AccessPointStatus() { library::SavedAp(library::Office()); }
  ~AccessPointStatus() override { std::filesystem::remove(kApMarkerPath); }
};

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
TEST_F(AccessPointStatus, TellsWhatIsOnTheAirByTheKernel) {
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

TEST_F(AccessPointStatus, CountsItsGuestsAmongItsStations) {
  kernel::BecomeAccessPoint("Office");
  kernel::Main().stations = 2;
  kernel::Guests() = kernel::Main();
  EXPECT_THAT(StatusDocument(), HasSubstr(R"("stations":4,)"));
  kernel::Guests().joining = 1;
  EXPECT_THAT(StatusDocument(), HasSubstr(R"("stations":3,)")) << "who is not let in is none";
}

TEST_F(AccessPointStatus, ThatThereIsNoneOfIsOff) {
  EXPECT_EQ(StatusDocument(),
            R"({"result":"ok","access_point":{"state":"off","name":"Office","enabled":false,"interface":"wlan0",)"
            R"("air_name":null,"air_name_hex":null,"channel":null,"megahertz":null,"stations":null,)"
            R"("pending":null}})"
            "\n");
  kernel::Main().isThere = false;
  EXPECT_EQ(StatusLine(), "off");
}

// The interface has the type of an access point then, and so it was said to be on the air.
TEST_F(AccessPointStatus, ThatItsScheduleKeepsOffTheAirSaysSo) {
  kernel::BecomeAccessPoint("", 0);
  const StartedDaemon hostapd("hostapd", kPid);
  library::SavedAp(Scheduled('0'));
  EXPECT_EQ(StatusLine(), "off-by-schedule");
  EXPECT_THAT(Tool({"ap", "status"}).out, HasSubstr("off the air at this hour, by its schedule\n"));
}

TEST_F(AccessPointStatus, WhoseInterfaceIsDownSaysSo) {
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
TEST_F(AccessPointStatus, IsTheSameForEveryCommand) {
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

TEST_F(AccessPointStatus, TellsByTheHourOfTheWeekWhetherItsScheduleKeepsItOffTheAir) {
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

TEST_F(AccessPointStatus, ThatListensForRadarSaysSo) {
  kernel::BecomeAccessPoint("", 5260);
  EXPECT_EQ(StatusLine(), "waiting-for-radar");
  library::MEROWirelessAPEnable = [] { return TRUE; };
  EXPECT_EQ(Tool({"ap", "enable"}).out,
            "the access point Office is enabled, and waits until channel 52 is known to be free of radar\n");
}

TEST_F(AccessPointStatus, IsBeingSetUpWhileSomebodyIsAtIt) {
  WriteText(kApMarkerPath, "");
  EXPECT_EQ(StatusLine(), "setting-up");
  EXPECT_THAT(Tool({"ap", "status"}).out, testing::StartsWith("access point  being set up\n"));
}

// Whoever has an account could keep the adapter from everybody for ever, with a file and a program that has the
// library.
TEST_F(AccessPointStatus, IsNotBeingSetUpByAMarkerThatIsNotRoots) {
  WriteText(kApMarkerPath, "");
  Shell(std::string("chown 65534 ") + kApMarkerPath);
  EXPECT_EQ(StatusLine(), "off");
}

// The clock was put back at a start.
TEST_F(AccessPointStatus, IsNotBeingSetUpByAMarkerFromTheFuture) {
  Shell(std::string("touch -d tomorrow ") + kApMarkerPath);
  EXPECT_EQ(StatusLine(), "off");
}

// A process that was killed left its marker, and the access point was "being set up" from then on.
TEST_F(AccessPointStatus, IsNotBeingSetUpByAProcessThatIsGone) {
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

TEST_F(AccessPointStatus, TellsWhetherWhatWasSavedIsOnTheAir) {
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

// Without it, the access point was said to be off.
TEST_F(AccessPointStatus, HasNoStatusWithoutItsAdapter) {
  library::MEROWirelessAdapterNum = [] { return 0; };
  EXPECT_EQ(Tool({"ap", "status"}).status, 3);
}

}  // namespace
