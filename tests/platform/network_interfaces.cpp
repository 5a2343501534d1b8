// Network interfaces that a test makes.
#include "tests/platform/network_interfaces.h"

#include <net/if.h>
#include <sys/ioctl.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <utility>

// The interface is one end of a virtual cable: every kernel has those, but not every one has dummy interfaces.
NetworkInterface::NetworkInterface(std::string name) : name_(std::move(name)) {
  Shell("ip link add " + name_ + " type veth");
}

NetworkInterface::~NetworkInterface() {
  Shell("ip link delete " + name_);
}

unsigned NetworkInterface::flags() const {
  const int control = ::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
  ifreq request = {};
  name_.copy(request.ifr_name, sizeof request.ifr_name - 1);
  EXPECT_EQ(::ioctl(control, SIOCGIFFLAGS, &request), 0) << name_;
  ::close(control);
  return static_cast<unsigned short>(request.ifr_flags);
}

std::string NetworkInterface::addresses() const {
  return Shell("ip -4 -o address show dev " + name_ + " | while read -r _ _ _ a _; do printf '%s ' \"$a\"; done");
}

RunningProgram::RunningProgram(const std::vector<const char*>& argv) : pid_(::fork()) {
  if (pid_ != 0) return;
  std::vector<char*> arguments;
  for (const char* szArgument : argv) arguments.push_back(const_cast<char*>(szArgument));
  arguments.push_back(nullptr);
  ::execv(arguments[0], arguments.data());
  ::_exit(127);
}

RunningProgram::~RunningProgram() {
  ::kill(pid_, SIGTERM);
  ::waitpid(pid_, nullptr, 0);
}
