// What the settings hold is data to the kit's scripts.
#include <sstream>

#include "kit_radio.h"

namespace {

using KitAccessPoint = KitRadio;

// Settings are read, and nothing more. Each of those that the scripts look at is once what a shell would run.
TEST_F(KitAccessPoint, RunsNothingThatItsSettingsHold) {
  const struct {
    const char* szFile;
    const char* szKeys;
    const char* szWords;
  } rows[] = {
      {"/etc/sysconfig/network-scripts/ifcfg-lbr0", "DEVICE TYPE BOOTPROTO IPADDR NETMASK ONBOOT HWADDR", "boot"},
      {"/etc/sysconfig/network-scripts/ifcfg-lbr0", "IPADDR NETMASK PRIMARY NAT", "start wlan0 lbr0"},
      {"/etc/sysconfig/network-scripts/ifcfg-wlan0", "BRIDGE", "schedule wlan0"},
      {"/etc/dhcpd/dhcpd-lbr0-lbr0.info", "enable", "start wlan0 lbr0"},
      {"/etc/dhcpd/dhcpd-lbr0-lbr0.conf", "interface dhcp-leasefile", "start wlan0 lbr0"},
      {"/etc/hostapd/hostapd-wlan0-host.conf", "interface ssid wpa hw_mode ht_capab accept_mac_file",
       "start wlan0 lbr0"},
      {"/etc/hostapd/hostapd-wlan0-guest.info", "enable", "start wlan0 lbr0"},
      {"/usr/mero/etc/wireless_country.conf", "country", "start wlan0 lbr0"},
      {"/tmp/wireless.info", "INTERFACE PRODUCT", "start wlan0 lbr0"},
  };
  for (const auto& [szFile, szKeys, szWords] : rows) {
    const std::string before = TextOrNothing(szFile);
    std::istringstream keys(szKeys);
    for (std::string key; keys >> key;) {
      for (const char* szValue :
           {"$(touch /tmp/ran)", "\"`touch /tmp/ran`\"", "';touch /tmp/ran;'", ";touch /tmp/ran"}) {
        WriteText(szFile, before + key + "=" + szValue + "\n");
        WriteText("/run/rc.network/late-wlan0", "");  // so that the hour has something to start
        Script(szWords);
        EXPECT_FALSE(fs::exists("/tmp/ran")) << szFile << " " << key << " " << szValue;
      }
    }
    WriteText(szFile, before);
    Script("restart wlan0 lbr0");
  }
}

}  // namespace
