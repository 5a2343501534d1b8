// A machine's adapters and the driver of one, without a radio.
#include "tests/platform/simulated_radio.h"

#include <net/if.h>  // first: the kernel's own headers make room for it

#include <dlfcn.h>
#include <gtest/gtest.h>
#include <linux/wireless.h>
#include <sys/ioctl.h>
#include <sys/mount.h>

#include <algorithm>
#include <cerrno>
#include <cstdarg>
#include <cstring>
#include <filesystem>
#include <utility>

namespace {

constexpr char kShown[] = "/sys/class/net";
constexpr char kTree[] = "/tmp/interfaces";

SimulatedDriver* g_driver = nullptr;

bool IsOfWirelessExtensions(unsigned long request) {
  return request >= SIOCIWFIRST && request <= SIOCIWLAST;
}

// Any other error is one that a supervisor has put in place of the answer.
bool IsOfAKernelWithoutDriver(int error) {
  return error == ENODEV || error == EOPNOTSUPP || error == ENOTTY || error == EINVAL || error == EPERM;
}

int Fail(int error) {
  errno = error;
  return -1;
}

}  // namespace

// In place of libc's: requests to a driver go to the simulated one while there is one.
extern "C" int ioctl(int fd, unsigned long request, ...) {
  va_list arguments;
  va_start(arguments, request);
  void* argument = va_arg(arguments, void*);
  va_end(arguments);
  if (g_driver != nullptr && request == SIOCSIFFLAGS) {
    g_driver->told.push_back((static_cast<ifreq*>(argument)->ifr_flags & IFF_UP) != 0 ? "up" : "down");
  }
  static const auto next = reinterpret_cast<int (*)(int, unsigned long, ...)>(::dlsym(RTLD_NEXT, "ioctl"));
  const int result = next(fd, request, argument);  // also where the kernel has no answer: a supervisor sees the call
  if (g_driver == nullptr || !IsOfWirelessExtensions(request)) return result;
  return result < 0 && !IsOfAKernelWithoutDriver(errno) ? result : g_driver->Answer(request, argument);
}

// The name by which 32-bit programs with 64-bit times call it.
extern "C" __attribute__((alias("ioctl"))) int __ioctl_time64(int fd, unsigned long request, ...);

ShownInterfaces::ShownInterfaces(const std::vector<Interface>& interfaces) {
  std::filesystem::create_directory(kTree);
  for (const Interface& interface : interfaces) {
    std::filesystem::create_directories(kTree / std::filesystem::path(interface.name) / interface.mark);
  }
  EXPECT_EQ(::mount(kTree, kShown, nullptr, MS_BIND, nullptr), 0);
}

ShownInterfaces::~ShownInterfaces() {
  EXPECT_EQ(::umount(kShown), 0);
  std::filesystem::remove_all(kTree);
}

SimulatedDriver::SimulatedDriver(std::string interface) : interface_(std::move(interface)) {
  g_driver = this;
}

SimulatedDriver::~SimulatedDriver() {
  g_driver = nullptr;
}

int SimulatedDriver::Answer(unsigned long request, void* argument) {
  auto& wireless = *static_cast<iwreq*>(argument);
  if (wireless.ifr_ifrn.ifrn_name != interface_) return Fail(ENODEV);
  if (refusal != 0) return Fail(refusal);
  switch (request) {
    case SIOCGIWMODE:
      wireless.u.mode = mode;
      return 0;
    case SIOCSIWMODE:
      mode = wireless.u.mode;
      told.push_back("mode " + std::to_string(mode));
      return 0;
    case SIOCGIWAP:
      if (mode > IW_MODE_INFRA) return Fail(EOPNOTSUPP);  // as the kernel's own drivers do
      std::ranges::copy(accessPoint, wireless.u.ap_addr.sa_data);
      return 0;
    case SIOCGIWESSID:
      if (mode > IW_MODE_INFRA) return Fail(EOPNOTSUPP);
      if (wireless.u.essid.length < name.size()) return Fail(E2BIG);
      std::memcpy(wireless.u.essid.pointer, name.data(), name.size());
      wireless.u.essid.length = static_cast<__u16>(name.size());
      wireless.u.essid.flags = hasName ? 1 : 0;
      return 0;
    case SIOCSIWMLME: {
      const auto& order = *static_cast<const iw_mlme*>(wireless.u.data.pointer);
      told.push_back(order.cmd == IW_MLME_DISASSOC || order.cmd == IW_MLME_DEAUTH ? "leave" : "something else");
      return 0;
    }
    case SIOCGIWSCAN:
      if (wireless.u.data.pointer == nullptr) return Fail(EFAULT);
      return hasResults ? Fail(E2BIG) : 0;  // for whoever brings no room
    case SIOCSIWSCAN:
      if (scanRefusal != 0) return Fail(scanRefusal);
      told.push_back(wireless.u.data.pointer == nullptr && wireless.u.data.length == 0 && wireless.u.data.flags == 0
                         ? "scan"
                         : "scan for something");
      return 0;
    default:
      return Fail(EOPNOTSUPP);
  }
}
