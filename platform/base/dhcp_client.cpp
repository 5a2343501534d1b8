// The DHCP client of an interface.
#include "platform/base/dhcp_client.h"

#include <cstdio>

#include "platform/base/daemon.h"

DhcpClientFile::DhcpClientFile(const char* szFormat, const char* szIfName) {
  std::snprintf(szPath_, sizeof szPath_, szFormat, szIfName);
}

Status EndDhcpClient(const char* szIfName) {
  return EndDaemon(DhcpClientFile(kDhcpClientPidFormat, szIfName).c_str(), "busybox");
}
