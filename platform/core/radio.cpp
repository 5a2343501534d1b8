// One interface's radio.
#include "platform/core/radio.h"

#include <linux/wireless.h>
#include <sys/ioctl.h>

#include "platform/base/interface.h"

// The kernel numbers the modes as this interface does.
static_assert(WIRELESS_OPMODE_AUTO == IW_MODE_AUTO && WIRELESS_OPMODE_ADHOC == IW_MODE_ADHOC);
static_assert(WIRELESS_OPMODE_MANAGED == IW_MODE_INFRA && WIRELESS_OPMODE_MASTER == IW_MODE_MASTER);
static_assert(WIRELESS_OPMODE_REPEATER == IW_MODE_REPEAT && WIRELESS_OPMODE_SECONDEARY == IW_MODE_SECOND);
static_assert(WIRELESS_OPMODE_MONITOR == IW_MODE_MONITOR);

namespace {

// Addresses that drivers give while there is no connection.
constexpr Bssid kNoAddresses[] = {
    {{0x00, 0x00, 0x00, 0x00, 0x00, 0x00}},
    {{0xff, 0xff, 0xff, 0xff, 0xff, 0xff}},
    {{0x44, 0x44, 0x44, 0x44, 0x44, 0x44}},
};

bool IsAddress(const Bssid& bssid) {
  for (const Bssid& none : kNoAddresses) {
    if (bssid == none) return false;
  }
  return true;
}

constexpr uint16_t kReasonLeaving = 3;  // "the station is leaving", as a frame gives it

}  // namespace

Result<Radio> Radio::OfAdapter(const char* szIfName) {
  // Looked at first: without an adapter, a kernel without wireless extensions would give another reason.
  if (MEROWirelessAdapterNum() <= 0) return Status::Failed(ENODEV);
  Result<Descriptor> control = OpenControl();
  if (!control.ok()) return control.status();
  if (std::strlen(szIfName) >= IFNAMSIZ) return Status::Failed(ENODEV);
  Radio radio;
  radio.control_ = std::move(*control);
  CopyText(radio.szIfName_, szIfName);
  return radio;
}

Result<bool> Radio::IsUp() const {
  Result<ifreq> request = RequestFor<ifreq>(szIfName_);
  if (::ioctl(control_.get(), SIOCGIFFLAGS, &*request) < 0) return Status::Failed(errno);
  return (request->ifr_flags & IFF_UP) != 0;
}

Result<WIRELESS_OPMODE> Radio::Mode() const {
  Result<iwreq> request = RequestFor<iwreq>(szIfName_);
  if (::ioctl(control_.get(), SIOCGIWMODE, &*request) < 0) return Status::Failed(errno);
  const __u32 mode = request->u.mode;
  return mode <= IW_MODE_MONITOR ? static_cast<WIRELESS_OPMODE>(mode) : WIRELESS_OPMODE_UNKNOWN;
}

Status Radio::SetMode(WIRELESS_OPMODE mode) const {
  Result<iwreq> request = RequestFor<iwreq>(szIfName_);
  request->u.mode = static_cast<__u32>(mode);
  return Status::Of(::ioctl(control_.get(), SIOCSIWMODE, &*request));
}

Status Radio::Essid(char (&szEssid)[33]) const {
  char name[IW_ESSID_MAX_SIZE + 1] = {};
  Result<iwreq> request = RequestFor<iwreq>(szIfName_);
  request->u.essid.pointer = name;
  request->u.essid.length = IW_ESSID_MAX_SIZE;
  if (::ioctl(control_.get(), SIOCGIWESSID, &*request) < 0) return Status::Failed(errno);
  const bool any = request->u.essid.flags != 0;
  CopyText(szEssid, any ? std::string_view(name, request->u.essid.length) : std::string_view());
  return Status::Ok();
}

Result<std::optional<Bssid>> Radio::AccessPoint() const {
  Result<iwreq> request = RequestFor<iwreq>(szIfName_);
  if (::ioctl(control_.get(), SIOCGIWAP, &*request) < 0) return Status::Failed(errno);
  Bssid bssid;
  std::memcpy(bssid.octets, request->u.ap_addr.sa_data, sizeof bssid.octets);
  return IsAddress(bssid) ? std::optional<Bssid>(bssid) : std::nullopt;
}

Status Radio::Leave() const {
  iw_mlme leave{};
  leave.cmd = IW_MLME_DISASSOC;
  leave.reason_code = kReasonLeaving;
  Result<iwreq> request = RequestFor<iwreq>(szIfName_);
  request->u.data.pointer = &leave;
  request->u.data.length = sizeof leave;
  return Status::Of(::ioctl(control_.get(), SIOCSIWMLME, &*request));
}

bool Radio::KnowsNetworks() const {
  char none[1];
  Result<iwreq> request = RequestFor<iwreq>(szIfName_);
  request->u.data.pointer = none;  // with no room for any
  return ::ioctl(control_.get(), SIOCGIWSCAN, &*request) < 0 && errno == E2BIG;
}

Status Radio::Scan() const {
  Result<iwreq> request = RequestFor<iwreq>(szIfName_);
  return Status::Of(::ioctl(control_.get(), SIOCSIWSCAN, &*request));
}
