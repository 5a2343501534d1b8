// What an operation leaves on a private machine, and the way back.
#include "tests/fault/machine_state.h"

#include <arpa/inet.h>
#include <ifaddrs.h>
#include <net/if.h>
#include <sys/stat.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <regex>
#include <system_error>

#include "common/paths.h"
#include "tests/platform/network_interfaces.h"
#include "tests/support/files.h"

namespace fs = std::filesystem;

namespace {

constexpr char kInterface[] = "wlan0";
constexpr size_t kModeSize = 5;  // such as "0644 "

// Programs are among them, which other ways of reading take long for.
std::string Content(const fs::path& path) {
  std::error_code none;
  std::string content(fs::file_size(path, none), '\0');
  std::ifstream(path, std::ios::binary).read(content.data(), static_cast<std::streamsize>(content.size()));
  return content;
}

// What stands in for a file that was removed is no file.
bool IsThere(const fs::file_status& status) {
  return fs::is_regular_file(status) || fs::is_symlink(status);
}

std::string Describe(const fs::path& path, const fs::file_status& status) {
  char szMode[kModeSize + 1];
  std::snprintf(szMode, sizeof szMode, "%04o ", static_cast<unsigned>(status.permissions()) & 07777U);
  if (fs::is_symlink(status)) return "l" + fs::read_symlink(path).string();
  return szMode + Content(path);
}

// Of the layers that a private machine keeps in /mnt, one for each directory that may be written to.
void AddFiles(const std::string& directory, MachineState& state) {
  const fs::path layer = "/mnt/" + directory;
  for (auto entry = fs::recursive_directory_iterator(layer); entry != fs::recursive_directory_iterator(); ++entry) {
    const fs::path path = fs::path("/" + directory) / entry->path().lexically_relative(layer);
    const fs::file_status status = entry->symlink_status();
    if (path == "/tmp/interfaces") entry.disable_recursion_pending();  // the kernel's interfaces are mounted on it
    if (IsThere(status) && path != kCommandRecord) state[path] = Describe(entry->path(), status);
  }
}

std::string DescribeInterface() {
  std::string state = "down";
  std::string addresses;
  ifaddrs* all = nullptr;
  EXPECT_EQ(::getifaddrs(&all), 0);
  for (const ifaddrs* one = all; one != nullptr; one = one->ifa_next) {
    if (std::string_view(one->ifa_name) != kInterface) continue;
    if ((one->ifa_flags & IFF_UP) != 0) state = "up";
    if (one->ifa_addr == nullptr || one->ifa_addr->sa_family != AF_INET) continue;
    char szAddress[INET_ADDRSTRLEN];
    const auto* address = reinterpret_cast<const sockaddr_in*>(one->ifa_addr);
    addresses += std::string(" ") + ::inet_ntop(AF_INET, &address->sin_addr, szAddress, sizeof szAddress);
  }
  ::freeifaddrs(all);
  return state + addresses;
}

// The addresses have no mask in a state, and get a usual one.
void RestoreInterface(const std::string& state) {
  const size_t space = state.find(' ');
  std::string command = "ip address flush dev wlan0; ip link set wlan0 " + state.substr(0, space);
  for (size_t at = space; at != std::string::npos; at = state.find(' ', at + 1)) {
    command += "; ip address add " + state.substr(at + 1, state.find(' ', at + 1) - at - 1) + "/24 dev wlan0";
  }
  Shell(command);
}

void RestoreFile(const std::string& path, const std::string& described) {
  if (described[0] == 'l') {
    fs::remove_all(path);
    fs::create_symlink(described.substr(1), path);
  } else {
    WriteText(path, std::string_view(described).substr(kModeSize),
              static_cast<mode_t>(std::stoul(described.substr(0, kModeSize), nullptr, 8)));
  }
}

}  // namespace

MachineState StateOfMachine() {
  MachineState state;
  for (const char* directory : {"etc", "run", "tmp", "usr", "var"}) AddFiles(directory, state);
  state[kInterface] = DescribeInterface();
  return state;
}

void Restore(const MachineState& state) {
  const MachineState now = StateOfMachine();
  for (const auto& [path, described] : now) {
    if (!state.contains(path)) fs::remove(path);
  }
  for (const auto& [path, described] : state) {
    const auto is = now.find(path);
    if (is != now.end() && is->second == described) continue;
    path == kInterface ? RestoreInterface(described) : RestoreFile(path, described);
  }
}

MachineState Comparable(MachineState state) {
  static const std::regex time("ACCESS_TIME=[0-9]+");
  const auto store = state.find(kKnownNetworksPath);
  if (store != state.end()) store->second = std::regex_replace(store->second, time, "ACCESS_TIME=");
  for (auto& [path, described] : state) {
    if (path.ends_with(".pid")) described = described.substr(0, kModeSize) + "(a process)";
  }
  return state;
}

std::string ContentIn(const MachineState& state, const std::string& path) {
  const auto file = state.find(path);
  return file != state.end() && file->second.size() > kModeSize ? file->second.substr(kModeSize) : std::string();
}

bool KeepProgram(const std::string& path) {
  if (!fs::exists(path)) return false;
  const std::string content = Content(path);
  fs::remove(path);
  WriteText(path, content, 0755);
  return true;
}
