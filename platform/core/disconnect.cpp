// Ending the current connection.
#include <unistd.h>

#include "common/paths.h"
#include "platform/base/daemon.h"
#include "platform/base/dhcp_client.h"
#include "platform/base/failure.h"
#include "platform/base/interface.h"
#include "platform/base/shared_directory.h"
#include "platform/core/adapters.h"
#include "platform/core/radio.h"

namespace {

// An ad-hoc cell has no access point to take leave of. The interface leaves it by becoming a station again, and a
// driver changes the mode only while the interface is down.
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

Status ForgetRecord() {
  const Status status = RemoveOrMoveAside(kConnectionRecordPath);
  return status.error() == ENOENT ? Status::Ok() : status;
}

}  // namespace

// A step that fails is reported, and the others are taken all the same.
int MEROWirelessNetworkDisconnect(void) {
  int failures = 0;
  Result<int> adapters = CountAdapters();
  if (!adapters.ok()) ++failures, FAIL(adapters.error(), "Failed to look for the adapter to disconnect");
  const bool adapter = !adapters.ok() || *adapters > 0;
  const char* szIfName = MEROWirelessInterfaceGet();
  // Daemons first: they would join and address the interface again.
  if (const Status status = EndDaemon(kSupplicantPidPath, "wpa_supplicant"); !status.ok()) {
    ++failures, FAIL(status.error(), "Failed to end the supplicant of %s", szIfName);
  }
  if (const Status status = EndDhcpClient(szIfName); !status.ok()) {
    ++failures, FAIL(status.error(), "Failed to end the DHCP client of %s", szIfName);
  }
  if (const Status status = adapter ? LeaveNetwork(szIfName) : Status::Ok(); !status.ok()) {
    ++failures, FAIL(status.error(), "Failed to leave the network of %s", szIfName);
  }
  if (const Status status = adapter ? RemoveAddresses(szIfName) : Status::Ok(); !status.ok()) {
    ++failures, FAIL(status.error(), "Failed to remove the addresses of %s", szIfName);
  }
  if (const Status status = ForgetRecord(); !status.ok()) {
    ++failures, FAIL(status.error(), "Failed to forget the connection of %s", szIfName);
  }
  return failures == 0 ? 0 : -1;
}
