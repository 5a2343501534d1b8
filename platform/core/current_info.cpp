// Queries about the current connection.
#include "platform/base/failure.h"
#include "platform/core/connection_record.h"
#include "platform/core/radio.h"

namespace {

// Whether an adapter in this mode can be in a network that it has joined. In any other mode, such as that of an access
// point, drivers refuse to name a network. That is no failure: there is none.
bool CanBeInNetwork(WIRELESS_OPMODE mode) {
  return mode == WIRELESS_OPMODE_MANAGED || mode == WIRELESS_OPMODE_ADHOC || mode == WIRELESS_OPMODE_AUTO;
}

Result<std::optional<Bssid>> AccessPointIn(const Radio& radio, WIRELESS_OPMODE mode) {
  return CanBeInNetwork(mode) ? radio.AccessPoint() : std::optional<Bssid>();
}

WIRELESS_STATUS StatusOfMode(WIRELESS_OPMODE mode) {
  switch (mode) {
    case WIRELESS_OPMODE_ADHOC:
      return WIRELESS_STATUS_CONNECTED_ADHOC;
    case WIRELESS_OPMODE_MANAGED:
      return WIRELESS_STATUS_CONNECTED_MANAGED;
    default:
      return WIRELESS_STATUS_DISCONNECTED;
  }
}

Result<WIRELESS_STATUS> StatusOf(const Radio& radio) {
  Result<bool> up = radio.IsUp();
  if (!up.ok()) return up.status();
  if (!*up) return WIRELESS_STATUS_DOWN;
  Result<WIRELESS_OPMODE> mode = radio.Mode();
  if (mode.error() == EOPNOTSUPP) return WIRELESS_STATUS_NOT_SUPPORTED;
  if (!mode.ok()) return mode.status();
  if (*mode == WIRELESS_OPMODE_MONITOR) return WIRELESS_STATUS_MONITOR;
  Result<std::optional<Bssid>> accessPoint = AccessPointIn(radio, *mode);
  if (!accessPoint.ok()) return accessPoint.status();
  return *accessPoint ? StatusOfMode(*mode) : WIRELESS_STATUS_DISCONNECTED;
}

Status TellEssid(const Radio& radio, char (&szEssid)[33]) {
  Result<WIRELESS_OPMODE> mode = radio.Mode();
  if (!mode.ok()) return mode.status();
  if (CanBeInNetwork(*mode)) return radio.Essid(szEssid);
  szEssid[0] = '\0';
  return Status::Ok();
}

Result<ConnectionRecord> RecordOf(const Radio& radio) {
  Result<WIRELESS_OPMODE> mode = radio.Mode();
  if (!mode.ok()) return mode.status();
  Result<std::optional<Bssid>> accessPoint = AccessPointIn(radio, *mode);
  if (!accessPoint.ok()) return accessPoint.status();
  const std::optional<Bssid>& bssid = *accessPoint;
  return bssid ? RecordOfConnectionTo(*bssid) : ConnectionRecord{};
}

// Puts what was found into the answer, or gives the reason why there is none.
template <class T, class Member>
Status Answer(Result<T> found, Member& member) {
  if (!found.ok()) return found.status();
  member = *found;
  return Status::Ok();
}

Status Ask(const Radio& radio, WIRELESS_REQUEST request, WIRELESS_INFO& info) {
  switch (request) {
    case REQUEST_ESSID:
      return TellEssid(radio, info.szEssid);
    case REQUEST_MODE:
      return Answer(radio.Mode(), info.opmode);
    case REQUEST_STATUS:
      return Answer(StatusOf(radio), info.status);
    case REQUEST_PROTOCOL:
    case REQUEST_AUTH: {
      Result<ConnectionRecord> record = RecordOf(radio);
      if (!record.ok()) return record.status();
      if (request == REQUEST_PROTOCOL) info.protocol = record->protocol;
      if (request == REQUEST_AUTH) info.auth = record->auth;
      return Status::Ok();
    }
  }
  return Status::Failed(EINVAL);
}

}  // namespace

int MEROWirelessCurInfoGet(WIRELESS_REQUEST request, PWIRELESS_INFO pInfo) {
  if (pInfo == nullptr) return REFUSE_NULL(), -1;
  if (request == REQUEST_STATUS && MEROWirelessAdapterNum() <= 0) {
    pInfo->status = WIRELESS_STATUS_NO_ADAPTER;
    return 0;
  }
  const char* szIfName = MEROWirelessInterfaceGet();
  Result<Radio> radio = Radio::OfAdapter(szIfName);
  const Status status = radio.ok() ? Ask(*radio, request, *pInfo) : radio.status();
  if (!status.ok()) return FAIL(status.error(), "Failed to ask the adapter %s", szIfName), -1;
  return 0;
}
