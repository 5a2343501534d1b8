// The files that the access-point daemon is started from.
#include "model/ap_files.h"

#include <algorithm>
#include <string_view>

#include "base/whole_file.h"
#include "common/hostapd_lines.h"
#include "common/paths.h"
#include "model/country.h"
#include "platform.h"

namespace {

// ---- What the daemon is given ----

class Lines {
 public:
  void Text(const char* szKey, const std::string& value) { text_ += szKey + ("=" + value) + "\n"; }
  void Quoted(const char* szKey, const std::string& value) { Text(szKey, "\"" + value + "\""); }
  void Number(const char* szKey, int value) { Text(szKey, std::to_string(value)); }
  void TwoTexts(const char* szKey, const char* szFirst, const char* szSecond) {
    Text(szKey, std::string(szFirst) + szSecond);
  }

  const std::string& text() const { return text_; }

 private:
  std::string text_;
};

std::string PathOf(const char* szFormat, const std::string& interface) {
  return InterfacePath(szFormat, interface.c_str()).c_str();
}

bool HasOtherGuests(const std::string& interface, const MERO_HOSTAP_GUEST_NET& guest) {
  if (PLIBCFileCheckKeyValue(kModelPath, "support_pci_wifi", "yes", 0) == 0) return false;  // and so no guests at all
  const std::string info = PathOf(kHostapdGuestInfoFormat, interface);
  const bool had = PLIBCFileCheckKeyValue(info.c_str(), "enable", "yes", 0) != 0;
  const bool has = guest.blEnable != FALSE;
  if (!had || !has) return had != has;
  Lines lines;
  hostapd::WriteGuest(lines, guest);
  return TextOfFile(PathOf(kHostapdGuestFormat, interface)) != lines.text();
}

struct GuestRight {
  const char* szKey;
  BOOL MERO_AP_ACCESS_RULE::* value;
};

constexpr GuestRight kGuestRights[] = {
    {"guest_net_lan_block", &MERO_AP_ACCESS_RULE::blLanBlock},
    {"guest_net_access_ds", &MERO_AP_ACCESS_RULE::blAccessDS},
    {"guest_net_internet_block", &MERO_AP_ACCESS_RULE::blInternetBlock},
    {"guest_net_allow_http", &MERO_AP_ACCESS_RULE::blAllowHttp},
};

// By the note of the network start script, which stands while guests are on the air: at other hours no rules are in
// force, and the settings of the next hour will be.
bool HaveOtherGuestRights(const MERO_AP_ACCESS_RULE& rule) {
  if (PLIBCFileExist(kGuestRightsPath) == 0) return false;
  return std::ranges::any_of(kGuestRights, [&](const GuestRight& right) {
    const char* szValue = rule.*right.value != FALSE ? "yes" : "no";
    return PLIBCFileCheckKeyValue(kGuestRightsPath, right.szKey, szValue, 0) == 0;
  });
}

// The start script adds the country to what the library has written.
bool HasOtherCountry(const std::string& interface) {
  constexpr std::string_view kLine = "\ncountry_code=";
  const auto started = TextOfFile(PathOf(kHostapdStartedFormat, interface));
  if (!started) return false;
  const std::size_t line = started->find(kLine);
  const std::string country = SavedCountry();
  return line == started->npos ? !country.empty() : started->compare(line + kLine.size(), 2, country) != 0;
}

}  // namespace

std::optional<bool> WasGivenOthers(const std::string& interface, const ApConf& conf) {
  const auto given = TextOfFile(PathOf(kHostapdHostFormat, interface));
  if (!given) return std::nullopt;
  Lines lines;
  hostapd::WriteMain(lines, interface.c_str(), conf.hostapConf);
  return *given != lines.text() || HasOtherGuests(interface, conf.hostapConf.guestNet) ||
         HaveOtherGuestRights(conf.guestNetAccessRule) || HasOtherCountry(interface);
}

ApSwitch ApSwitchOf(const std::string& interface) {
  const std::string info = PathOf(kHostapdInfoFormat, interface);
  if (PLIBCFileExist(info.c_str()) == 0) return ApSwitch::kNone;
  return PLIBCFileCheckKeyValue(info.c_str(), "enable", "yes", 0) != 0 ? ApSwitch::kOn : ApSwitch::kOff;
}
