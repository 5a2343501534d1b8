// The DHCP client of an interface.
#include "platform/base/dhcp_client.h"

#include "common/paths.h"
#include "platform/base/daemon.h"
#include "platform/base/program.h"

Status EndDhcpClient(const char* szIfName) {
  Status status = EndDaemon(InterfacePath(kDhcpClientPidFormat, szIfName).c_str(), kDhcpClientProgram);
  if (!status.ok()) return status;
  const char* const argv[] = {kLeaseScript, "left", szIfName, nullptr};
  const Result<int> exitStatus = RunProgram(argv, Standard::kNull);
  // The script reports what it cannot take back. The next network can be joined all the same.
  return exitStatus.error() == ENOENT ? Status::Ok() : exitStatus.status();
}
