// The kernel's own switch of a radio.
#include "model/kernel_switch.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <fstream>
#include <system_error>

#include "common/descriptor.h"

namespace {

namespace fs = std::filesystem;

fs::path RadioOf(const std::string& interface) {
  return fs::path("/sys/class/net") / interface / "phy80211";
}

// The directory of the radio's switch; empty when there is none.
fs::path SwitchOf(const std::string& interface) {
  std::error_code error;
  for (const auto& entry : fs::directory_iterator(RadioOf(interface), error)) {
    if (entry.path().filename().string().starts_with("rfkill")) return entry.path();
  }
  return {};
}

bool IsOne(const fs::path& path) {
  int value = 0;
  return std::ifstream(path) >> value && value == 1;
}

}  // namespace

KernelBlock KernelBlockOf(const std::string& interface) {
  const fs::path directory = SwitchOf(interface);
  if (directory.empty()) return KernelBlock::kUnknown;
  if (IsOne(directory / "hard")) return KernelBlock::kOfHardware;
  return IsOne(directory / "soft") ? KernelBlock::kSet : KernelBlock::kNone;
}

int SetKernelBlock(const std::string& interface, bool set) {
  std::error_code error;
  if (!fs::exists(RadioOf(interface), error)) return 0;
  const fs::path directory = SwitchOf(interface);
  if (directory.empty()) return set ? EOPNOTSUPP : 0;
  const Descriptor file(::open((directory / "soft").c_str(), O_WRONLY | O_CLOEXEC));
  return file.valid() && ::write(file.get(), set ? "1" : "0", 1) == 1 ? 0 : errno;
}
