// A join by the library, while the supplicant is listened to.
#include "model/joining.h"

#include <array>
#include <chrono>
#include <string>
#include <vector>

#include "base/await.h"
#include "base/pid_file.h"
#include "common/paths.h"
#include "model/access_points.h"
#include "model/join_failures.h"
#include "work/radio.h"
#include "work/supplicant.h"

namespace {

// A supplicant that has just been started goes over all channels, also where that has just been done. It takes the end
// of any scan for the end of its own, and what the kernel knows then for its results: so the radio listens to the
// channel on which the network was heard. Where that comes to nothing, the supplicant scans by itself.
void SpareScan(const KnownNetwork& config) {
  if (config.network.channel > 0) (void)ListenTo(MEROWirelessInterfaceGet(), config.network.channel);
}

std::string SupplicantSocket() {
  return std::string(kSupplicantControlDirectory) + "/" + MEROWirelessInterfaceGet();
}

// Who did not let the appliance in: who refused the secret, or all that did not answer in time. Without a word from the
// supplicant that is the strongest, which it asks first.
NotLetIn WhoRefused(const Failure& failure, const KnownNetwork& config, const SupplicantListener& listener) {
  std::vector<Address> by = listener.accessPoints();
  if (failure.exit() == Exit::kSecretRefused && by.size() > 1) by = {by.back()};
  if (failure.exit() == Exit::kTimedOut && by.empty()) by = {std::to_array(config.network.bssid)};
  return {failure, by};
}

// Whether the network was joined before that had become pointless.
bool IsJoined(const Task& task, const KnownNetwork& config) {
  try {
    return Run<int>(task, [&] { return MEROWirelessNetworkConnect(&config); }) >= 0;
  } catch (const Pointless&) {
    return false;
  }
}

}  // namespace

void EndFormerSupplicant(const Program& program) {
  if (PLIBCFileExist(kSupplicantPidPath) == 0) return;
  const bool gone = Run<bool>(program.Doing("leaving the former network"), [] {
    if (PLIBCExec("/usr/sbin/wpa_cli", "terminate", nullptr, nullptr, nullptr) != 0)
      return !IsDaemonThere(kSupplicantPidPath, "wpa_supplicant");  // mostly only the file of one is left
    constexpr std::chrono::milliseconds kPause{100};
    constexpr std::chrono::seconds kPatience{5};
    return Await(kPatience, kPause, [] { return PLIBCFileExist(kSupplicantPidPath) == 0; });
  });
  if (!gone) throw Failed("the former connection does not end", "`merowireless disconnect` ends it by force");
}

// Once the supplicant has refused the secret for good, the library would only wait until its time is over.
void Join(const Program& program, const KnownNetwork& config) {
  RequireTellable(program, config);
  const std::string name = program.output.Name(config.network.szEssid);
  EndFormerSupplicant(program);
  SupplicantListener listener(SupplicantSocket(), [&] { SpareScan(config); });
  Task task = program.Doing("joining " + name);
  task.szMarker = kJoinMarkerPath;
  task.listener = &listener;
  task.isPointless = [&] { return listener.isFinal(); };
  if (IsJoined(task, config)) return;
  const Failure failure = JoinFailed(name, listener.verdict());
  if (failure.exit() != Exit::kSecretRefused && failure.exit() != Exit::kTimedOut) throw Failure(failure);
  throw WhoRefused(failure, config, listener);
}

void Join(const Program& program, const Target& target) {
  JoinTrusting(target.config, target.trusted, [&](const KnownNetwork& config) { Join(program, config); });
}
