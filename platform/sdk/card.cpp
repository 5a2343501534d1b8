// Addressing an interface, and noting down how.
#include <netinet/in.h>

#include <optional>

#include "platform/base/dhcp_client.h"
#include "platform/base/failure.h"
#include "platform/base/interface.h"
#include "platform/sdk/addresses.h"
#include "platform/sdk/network_script.h"

namespace {

struct Subnet {
  Ipv4 address;
  Ipv4 mask;
};

// The record's address and mask; none after a report when either of them is not valid.
std::optional<Subnet> SubnetOf(const NETINFO& netInfo) {
  const std::optional<Ipv4> mask = ParseMask(netInfo.szMask);
  if (!mask || *mask == 0) return LOG("'%s' is no netmask for %s", netInfo.szMask, netInfo.szInterface), std::nullopt;
  const std::optional<Ipv4> address = ParseAddress(netInfo.szIp);
  if (!address || *address == INADDR_ANY || !IsHost(*address, *mask)) {
    return LOG("'%s' is no address for %s", netInfo.szIp, netInfo.szInterface), std::nullopt;
  }
  return Subnet{*address, *mask};
}

Status Apply(const char* szIfName, const Subnet& subnet) {
  if (Status status = SetInterfaceUp(szIfName, true); !status.ok()) return status;
  return SetOnlyAddress(szIfName, subnet.address, subnet.mask);
}

bool WriteStatic(const NETINFO& netInfo) {
  NetworkScript script(netInfo.szInterface);
  script.Set("DEVICE", netInfo.szInterface);
  script.Set("BOOTPROTO", "static");
  script.Set("IPADDR", netInfo.szIp);
  script.Set("NETMASK", netInfo.szMask);
  return script.written();
}

bool WriteDhcp(const NETINFO& netInfo) {
  NetworkScript script(netInfo.szInterface);
  script.Set("DEVICE", netInfo.szInterface);
  script.Set("BOOTPROTO", "dhcp");
  script.Remove("IPADDR");
  script.Remove("NETMASK");
  return script.written();
}

int SetStatic(const NETINFO& netInfo) {
  const std::optional<Subnet> subnet = SubnetOf(netInfo);
  if (!subnet) return PLIBCErrSet(ERR_BAD_PARAMETERS), -1;
  // A DHCP client that stayed would put its own address back.
  if (const Status status = EndDhcpClient(netInfo.szInterface); !status.ok()) {
    return FAIL(status.error(), "Failed to end the DHCP client of %s", netInfo.szInterface), -1;
  }
  if (const Status status = Apply(netInfo.szInterface, *subnet); !status.ok()) {
    return FAIL(status.error(), "Failed to address %s", netInfo.szInterface), -1;
  }
  return WriteStatic(netInfo) ? 0 : -1;
}

// The DHCP client has set the address, or will.
int SetDhcp(const NETINFO& netInfo) {
  if (const Status status = SetInterfaceUp(netInfo.szInterface, true); !status.ok()) {
    return FAIL(status.error(), "Failed to bring up %s", netInfo.szInterface), -1;
  }
  return WriteDhcp(netInfo) ? 0 : -1;
}

}  // namespace

int MERONetSetCard1(const NETINFO* pNetInfo, int /*flags*/) {
  if (pNetInfo == nullptr) return REFUSE_NULL(), -1;
  return pNetInfo->blManual != FALSE ? SetStatic(*pNetInfo) : SetDhcp(*pNetInfo);
}
