// Leasing an address.
#include "platform/base/dhcp_client.h"

#include <arpa/inet.h>
#include <sys/ioctl.h>

#include <algorithm>
#include <cstdio>
#include <cstring>

#include "platform/base/error.h"
#include "platform/base/interface.h"
#include "platform/base/program.h"

namespace {

constexpr char kLeaseScript[] = "/usr/mero/sbin/udhcpc.lease";  // applies what the client leases
constexpr int kTries = 4;                                       // and a wait of the same length behind each

// Runs the client until it has a lease, and stays behind to renew it, or gives up. ETIMEDOUT when no server answered.
Status Lease(const char* szIfName, int seconds) {
  const DhcpClientFile pidFile(kDhcpClientPidFormat, szIfName);
  char szTries[16];
  char szWait[16];
  std::snprintf(szTries, sizeof szTries, "%d", kTries);
  std::snprintf(szWait, sizeof szWait, "%d", std::max(seconds / kTries, 1));

  const char* const argv[] = {kDhcpClientPath, "udhcpc", "-n",    "-S", "-i",   szIfName, "-p", pidFile.c_str(), "-s",
                              kLeaseScript,    "-t",     szTries, "-T", szWait, nullptr};
  Result<int> exitStatus = RunProgram(argv, Standard::kNull);
  if (!exitStatus.ok()) return exitStatus.status();
  return *exitStatus == 0 ? Status::Ok() : Status::Failed(ETIMEDOUT);
}

Result<ifreq> Ask(const Descriptor& control, const char* szIfName, unsigned long what) {
  Result<ifreq> request = RequestFor<ifreq>(szIfName);
  if (request.ok() && ::ioctl(control.get(), what, &*request) < 0) return Status::Failed(errno);
  return request;
}

template <size_t kSize>
void WriteAddress(const ifreq& request, char (&szAddress)[kSize]) {
  const auto& address = reinterpret_cast<const sockaddr_in&>(request.ifr_addr);
  ::inet_ntop(AF_INET, &address.sin_addr, szAddress, kSize);
}

// Fills the record with what the interface has.
Status Describe(NETINFO& netInfo) {
  Result<Descriptor> control = OpenControl();
  if (!control.ok()) return control.status();
  Result<ifreq> hardware = Ask(*control, netInfo.szInterface, SIOCGIFHWADDR);
  if (!hardware.ok()) return hardware.status();
  Result<ifreq> address = Ask(*control, netInfo.szInterface, SIOCGIFADDR);
  if (!address.ok()) return address.status();
  Result<ifreq> mask = Ask(*control, netInfo.szInterface, SIOCGIFNETMASK);
  if (!mask.ok()) return mask.status();

  std::memcpy(netInfo.rgbMac, hardware->ifr_hwaddr.sa_data, sizeof netInfo.rgbMac);
  WriteAddress(*address, netInfo.szIp);
  WriteAddress(*mask, netInfo.szMask);
  return Status::Ok();
}

Status LeaseAnew(NETINFO& netInfo, int seconds) {
  if (Status status = EndDhcpClient(netInfo.szInterface); !status.ok()) return status;
  if (Status status = SetInterfaceUp(netInfo.szInterface, true); !status.ok()) return status;
  if (Status status = Lease(netInfo.szInterface, seconds); !status.ok()) return status;
  return Describe(netInfo);
}

}  // namespace

int MEROIGetDHCPTestNetInfo(PNETINFO pNetInfo, int seconds) {
  if (pNetInfo == nullptr) return REFUSE_NULL(), -1;
  if (Status status = LeaseAnew(*pNetInfo, seconds); !status.ok()) {
    return FAIL(status.error(), "lease an address for", pNetInfo->szInterface), -1;
  }
  return 0;
}
