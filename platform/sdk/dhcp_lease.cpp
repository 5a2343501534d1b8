// Leasing an address.
#include "platform/base/dhcp_client.h"

#include <arpa/inet.h>
#include <poll.h>
#include <sys/ioctl.h>

#include <algorithm>
#include <cstdio>
#include <cstring>

#include "common/paths.h"
#include "platform/base/daemon.h"
#include "platform/base/failure.h"
#include "platform/base/interface.h"
#include "platform/base/program.h"

namespace {

constexpr int kGrace = 15;      // seconds more, for the script that applies the lease
constexpr int kTimedOut = 124;  // timeout(1)'s exit status when the time is up

// Runs the client until it has a lease, or was not answered in time. It asks each second, since everybody waits for the
// next question when one is lost. It stays behind to renew the lease, or to go on asking for one.
Status Lease(const char* szIfName, int seconds) {
  const InterfacePath pidFile(kDhcpClientPidFormat, szIfName);
  const int tries = std::max(seconds, 1);
  char szTries[16];
  std::snprintf(szTries, sizeof szTries, "%d", tries);
  char szLimit[16];
  std::snprintf(szLimit, sizeof szLimit, "%d", tries + kGrace);

  // The time is limited: a server that offers and refuses again and again would keep the client in the foreground.
  const char* const argv[] = {
      "/usr/bin/timeout", "-k", "2",          szLimit, kDhcpClientPath, "udhcpc", "-b", "-S",   "-i", szIfName, "-p",
      pidFile.c_str(),    "-s", kLeaseScript, "-t",    szTries,         "-T",     "1",  nullptr};
  Result<int> exitStatus = RunProgram(argv, Standard::kNull);
  if (!exitStatus.ok()) return exitStatus.status();
  if (*exitStatus == kTimedOut) return Status::Failed(ETIMEDOUT);
  if (*exitStatus != 0) return Status::Failed(ENOEXEC);
  // The client that stays behind writes its pid file only now, and without its pid it could not be ended.
  for (int looks = 100; looks > 0 && !IsDaemonThere(pidFile.c_str(), kDhcpClientProgram); --looks) {
    (void)::poll(nullptr, 0, 10);
  }
  return Status::Ok();
}

// A request is of another type in each libc.
template <auto kWhat>
Result<ifreq> Ask(const Descriptor& control, const char* szIfName) {
  Result<ifreq> request = RequestFor<ifreq>(szIfName);
  if (request.ok() && ::ioctl(control.get(), kWhat, &*request) < 0) return Status::Failed(errno);
  return request;
}

template <size_t kSize>
void WriteAddress(const ifreq& request, char (&szAddress)[kSize]) {
  const auto& address = reinterpret_cast<const sockaddr_in&>(request.ifr_addr);
  ::inet_ntop(AF_INET, &address.sin_addr, szAddress, kSize);
}

// Fills the record with what the interface has. ETIMEDOUT when it has no address: no server has answered.
Status Describe(NETINFO& netInfo) {
  Result<Descriptor> control = OpenControl();
  if (!control.ok()) return control.status();
  Result<ifreq> hardware = Ask<SIOCGIFHWADDR>(*control, netInfo.szInterface);
  if (!hardware.ok()) return hardware.status();
  Result<ifreq> address = Ask<SIOCGIFADDR>(*control, netInfo.szInterface);
  if (address.error() == EADDRNOTAVAIL) return Status::Failed(ETIMEDOUT);
  if (!address.ok()) return address.status();
  Result<ifreq> mask = Ask<SIOCGIFNETMASK>(*control, netInfo.szInterface);
  if (!mask.ok()) return mask.status();

  std::memcpy(netInfo.rgbMac, hardware->ifr_hwaddr.sa_data, sizeof netInfo.rgbMac);
  WriteAddress(*address, netInfo.szIp);
  WriteAddress(*mask, netInfo.szMask);
  return Status::Ok();
}

Status LeaseAnew(NETINFO& netInfo, int seconds) {
  if (Status status = EndDhcpClient(netInfo.szInterface); !status.ok()) return status;
  if (Status status = SetInterfaceUp(netInfo.szInterface, true); !status.ok()) return status;
  if (Status status = RemoveAddresses(netInfo.szInterface); !status.ok()) return status;
  if (Status status = Lease(netInfo.szInterface, seconds); !status.ok()) return status;
  return Describe(netInfo);
}

}  // namespace

int MEROIGetDHCPTestNetInfo(PNETINFO pNetInfo, int seconds) {
  if (pNetInfo == nullptr) return REFUSE_NULL(), -1;
  if (const Status status = LeaseAnew(*pNetInfo, seconds); !status.ok()) {
    return FAIL(status.error(), "Failed to lease an address for %s", pNetInfo->szInterface), -1;
  }
  return 0;
}
