// The files that the access-point daemon is started from, and whether somebody is at it.
#include "model/ap_files.h"

#include <dirent.h>
#include <sys/stat.h>
#include <unistd.h>

#include <chrono>
#include <ctime>
#include <fstream>
#include <iterator>
#include <memory>
#include <sstream>

#include "base/text.h"
#include "common/hostapd_lines.h"
#include "common/paths.h"
#include "platform.h"

namespace {

// ---- What the daemon is given ----

class Lines {
 public:
  void Text(const char* szKey, const std::string& value) { text_ += szKey + ("=" + value) + "\n"; }
  void Quoted(const char* szKey, const std::string& value) { Text(szKey, "\"" + value + "\""); }
  void Number(const char* szKey, int value) { Text(szKey, std::to_string(value)); }
  void TwoTexts(const char* szKey, const char* szFirst, const char* szSecond) {
    Text(szKey, std::string(szFirst) + szSecond);
  }

  const std::string& text() const { return text_; }

 private:
  std::string text_;
};

std::string PathOf(const char* szFormat, const std::string& interface) {
  return InterfacePath(szFormat, interface.c_str()).c_str();
}

bool HasOtherGuests(const std::string& interface, const MERO_HOSTAP_GUEST_NET& guest) {
  if (PLIBCFileCheckKeyValue(kModelPath, "support_pci_wifi", "yes", 0) == 0) return false;  // and so no guests at all
  const std::string info = PathOf(kHostapdGuestInfoFormat, interface);
  const bool had = PLIBCFileCheckKeyValue(info.c_str(), "enable", "yes", 0) != 0;
  const bool has = guest.blEnable != FALSE;
  if (!had || !has) return had != has;
  Lines lines;
  hostapd::WriteGuest(lines, guest);
  return TextOfFile(PathOf(kHostapdGuestFormat, interface)) != lines.text();
}

// ---- Who is at it ----

using std::chrono::nanoseconds;
using std::chrono::seconds;

nanoseconds Duration(const timespec& time) {
  return seconds(time.tv_sec) + nanoseconds(time.tv_nsec);
}

nanoseconds Now(clockid_t clock) {
  timespec now{};
  ::clock_gettime(clock, &now);
  return Duration(now);
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

// Whether a process could have made something that is so old: another one than this, with the library in it.
bool CouldHaveMade(const char* szPid, nanoseconds age) {
  constexpr nanoseconds kTick = std::chrono::milliseconds(10);
  const auto pid = ParseNumber(szPid);
  if (!pid || *pid == ::getpid()) return false;
  const std::string process = std::string("/proc/") + szPid;
  const auto start = StartOf(process);
  return start && *start <= Now(CLOCK_BOOTTIME) - age + kTick && HasLoadedTheLibrary(process);
}

}  // namespace

std::optional<std::string> TextOfFile(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  if (!file) return std::nullopt;
  return std::string(std::istreambuf_iterator<char>(file), {});
}

std::optional<bool> WasGivenOthers(const std::string& interface, const ApConf& conf) {
  const auto given = TextOfFile(PathOf(kHostapdHostFormat, interface));
  if (!given) return std::nullopt;
  Lines lines;
  hostapd::WriteMain(lines, interface.c_str(), conf.hostapConf);
  return *given != lines.text() || HasOtherGuests(interface, conf.hostapConf.guestNet);
}

ApSwitch ApSwitchOf(const std::string& interface) {
  const std::string info = PathOf(kHostapdInfoFormat, interface);
  if (PLIBCFileExist(info.c_str()) == 0) return ApSwitch::kNone;
  return PLIBCFileCheckKeyValue(info.c_str(), "enable", "yes", 0) != 0 ? ApSwitch::kOn : ApSwitch::kOff;
}

bool IsBeingSetUp() {
  constexpr nanoseconds kLongest = std::chrono::minutes(5);
  struct stat marker {};
  if (MEROWirelessTestAPMode() == FALSE || ::stat(kApMarkerPath, &marker) < 0) return false;
  const nanoseconds age = Now(CLOCK_REALTIME) - Duration(marker.st_mtim);
  if (age > kLongest) return false;
  const std::unique_ptr<DIR, int (*)(DIR*)> processes(::opendir("/proc"), ::closedir);
  if (!processes) return false;
  while (const dirent* entry = ::readdir(processes.get())) {
    if (CouldHaveMade(entry->d_name, age)) return true;
  }
  return false;
}
