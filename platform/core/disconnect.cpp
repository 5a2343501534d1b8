// Ending the current connection.
#include <unistd.h>

#include "common/connection_files.h"
#include "platform/base/daemon.h"
#include "platform/base/dhcp_client.h"
#include "platform/base/failure.h"
#include "platform/base/interface.h"
#include "platform/base/shared_directory.h"
#include "platform/core/radio.h"

namespace {

Status EndSupplicant(const char* /*szIfName*/) {
  return EndDaemon(kSupplicantPidPath, "wpa_supplicant");
}

// An ad-hoc cell has nobody to tell: the interface stops being part of it by being a station again, which the driver
// only takes while the interface is down.
Status LeaveCell(const char* szIfName, const Radio& radio) {
  if (Status status = SetInterfaceUp(szIfName, false); !status.ok()) return status;
  if (Status status = radio.SetMode(WIRELESS_OPMODE_MANAGED); !status.ok()) return status;
  return SetInterfaceUp(szIfName, true);
}

Status LeaveNetwork(const char* szIfName) {
  Result<Radio> radio = Radio::OfAdapter(szIfName);
  if (!radio.ok()) return radio.status();
  Result<WIRELESS_OPMODE> mode = radio->Mode();
  if (!mode.ok()) return mode.status();
  if (*mode == WIRELESS_OPMODE_ADHOC) return LeaveCell(szIfName, *radio);
  if (*mode != WIRELESS_OPMODE_MANAGED) return Status::Ok();

  Result<std::optional<Bssid>> accessPoint = radio->AccessPoint();
  if (!accessPoint.ok()) return accessPoint.status();
  return *accessPoint ? radio->Leave() : Status::Ok();
}

Status ForgetRecord(const char* /*szIfName*/) {
  const Status status = RemoveOrMoveAside(kConnectionRecordPath);
  return status.error() == ENOENT ? Status::Ok() : status;
}

struct Step {
  const char* szName;
  Status (*run)(const char* szIfName);
  bool needsAdapter;
};

// Daemons first: they would join and address the interface again.
constexpr Step kSteps[] = {
    {"end the supplicant of", EndSupplicant, false},   {"end the DHCP client of", EndDhcpClient, false},
    {"leave the network of", LeaveNetwork, true},      {"remove the addresses of", RemoveAddresses, true},
    {"forget the connection of", ForgetRecord, false},
};

}  // namespace

int MEROWirelessNetworkDisconnect(void) {
  const bool adapter = MEROWirelessAdapterNum() > 0;
  const char* szIfName = MEROWirelessInterfaceGet();
  int result = 0;
  for (const Step& step : kSteps) {
    if (step.needsAdapter && !adapter) continue;
    if (Status status = step.run(szIfName); !status.ok()) {
      FAIL(status.error(), step.szName, szIfName);
      result = -1;
    }
  }
  return result;
}
