// Whether the adapter is an access point's at this moment.
#include "model/ap_state.h"

#include <dirent.h>
#include <unistd.h>

#include <chrono>
#include <cstdint>
#include <ctime>
#include <filesystem>
#include <memory>
#include <optional>
#include <sstream>
#include <string>
#include <system_error>

#include "base/failure.h"
#include "base/marker.h"
#include "base/pid_file.h"
#include "base/text.h"
#include "base/whole_file.h"
#include "common/paths.h"
#include "model/air.h"
#include "wireless.h"

namespace {

// ---- Who is at it ----

using std::chrono::nanoseconds;
using std::chrono::seconds;

nanoseconds SinceStart() {
  timespec now{};
  ::clock_gettime(CLOCK_BOOTTIME, &now);
  return seconds(now.tv_sec) + nanoseconds(now.tv_nsec);
}

// The time from the machine's start to that of a process.
std::optional<nanoseconds> StartOf(const std::string& process) {
  const auto status = TextOfFile(process + "/stat");
  if (!status) return std::nullopt;
  // The name is in brackets, and may hold anything. The start is the 20th word behind it, in ticks.
  std::istringstream words(status->substr(status->rfind(')') + 1));
  constexpr int kWords = 19;
  std::string skipped;
  for (int i = 0; i < kWords; ++i) words >> skipped;
  std::int64_t ticks = 0;
  if (!(words >> ticks)) return std::nullopt;
  return nanoseconds(seconds(1)) * ticks / ::sysconf(_SC_CLK_TCK);
}

bool HasLoadedTheLibrary(const std::string& process) {
  const auto maps = TextOfFile(process + "/maps");
  return maps && maps->find("/libmerowireless-core.so") != maps->npos;
}

// A container's processes have a network of their own, and so none of this machine's adapters.
bool IsOfThisNetwork(const std::string& process) {
  std::error_code error;
  return std::filesystem::read_symlink(process + "/ns/net", error) ==
         std::filesystem::read_symlink("/proc/self/ns/net");
}

// Whether a process could have made something that is so old: another one than this, with the library in it.
bool CouldHaveMade(const char* szPid, nanoseconds age) {
  constexpr nanoseconds kTick = std::chrono::milliseconds(10);
  const auto pid = ParseNumber(szPid);
  if (!pid || *pid == ::getpid()) return false;
  const std::string process = std::string("/proc/") + szPid;
  const auto start = StartOf(process);
  return start && *start <= SinceStart() - age + kTick && IsOfThisNetwork(process) && HasLoadedTheLibrary(process);
}

// ---- What runs ----

bool IsOnAir(const std::string& interface) {
  const auto air = AirOf(interface);
  return air && air->isAccessPoint && !air->name.empty();
}

// The daemon also runs while it has not told the kernel yet, and while its interface is down. The guests' network stays
// on the air then.
bool IsRunning(const std::string& interface) {
  return IsDaemonThere(InterfacePath(kHostapdPidFormat, interface.c_str()).c_str(), "hostapd") ||
         IsOnAir(kGuestInterface);
}

}  // namespace

bool IsBeingSetUp() {
  constexpr nanoseconds kLongest = std::chrono::minutes(5);
  const auto age = AgeOfMarker(kApMarkerPath);
  if (MEROWirelessTestAPMode() == FALSE || !age || *age < nanoseconds(0) || *age > kLongest) return false;
  const std::unique_ptr<DIR, int (*)(DIR*)> processes(::opendir("/proc"), ::closedir);
  if (!processes) return false;
  while (const dirent* entry = ::readdir(processes.get())) {
    if (CouldHaveMade(entry->d_name, *age)) return true;
  }
  return false;
}

ApState ReadApState() {
  if (IsBeingSetUp()) return ApState::kSettingUp;
  const std::string interface = MEROWirelessAPInterfaceGet();
  const auto air = AirOf(interface);
  if (!air) return ApState::kOff;
  if (air->isAccessPoint && !air->name.empty()) return ApState::kOnAir;
  if (air->isAccessPoint && air->channel != 0) return ApState::kWaitingForRadar;
  if (!IsRunning(interface)) return ApState::kOff;
  return air->isAccessPoint ? ApState::kDown : ApState::kSettingUp;
}

bool IsAccessPoints() {
  return ReadApState() != ApState::kOff;
}

void RequireNoAccessPoint() {
  const ApState state = ReadApState();
  if (state == ApState::kOff) return;
  if (state == ApState::kSettingUp) {
    throw Failure(Exit::kBusy, "the adapter is about to be an access point",
                  "wait until it is on the air; `merowireless ap disable` takes it down");
  }
  throw Failure(Exit::kBusy, "the adapter is an access point, and would be none any more",
                "`merowireless ap disable` takes that down first");
}
