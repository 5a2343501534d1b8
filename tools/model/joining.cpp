// A join by the library, while the supplicant is listened to.
#include "model/joining.h"

#include <chrono>
#include <string>
#include <thread>

#include "common/paths.h"
#include "model/access_points.h"
#include "model/join_failures.h"
#include "work/supplicant.h"

namespace {

std::string SupplicantSocket() {
  return std::string(kSupplicantControlDirectory) + "/" + MEROWirelessInterfaceGet();
}

}  // namespace

void EndFormerSupplicant(const Program& program) {
  if (PLIBCFileExist(kSupplicantPidPath) == 0) return;
  const bool gone = Run<bool>(program.Doing("leaving the former network"), [] {
    if (PLIBCExec("/usr/sbin/wpa_cli", "terminate", nullptr, nullptr, nullptr) != 0)
      return true;  // no supplicant runs, and only the file of one is left
    for (int tries = 50; tries > 0 && PLIBCFileExist(kSupplicantPidPath) != 0; --tries) {
      std::this_thread::sleep_for(std::chrono::milliseconds(100));
    }
    return PLIBCFileExist(kSupplicantPidPath) == 0;
  });
  if (!gone) throw Failed("the former connection does not end", "`merowireless disconnect` ends it by force");
}

// Once the supplicant has refused the secret for good, the library would only wait until its time is over.
void Join(const Program& program, const KnownNetwork& config) {
  const std::string name = program.output.Name(config.network.szEssid);
  EndFormerSupplicant(program);
  SupplicantListener listener(SupplicantSocket());
  Task task = program.Doing("joining " + name);
  task.szMarker = kJoinMarkerPath;
  task.listener = &listener;
  task.isPointless = [&] { return listener.isFinal(); };
  try {
    if (Run<int>(task, [&] { return MEROWirelessNetworkConnect(&config); }) >= 0) return;
  } catch (const Pointless&) {
  }
  if (listener.verdict() != Verdict::kSecretRefused) throw JoinFailed(name, listener.verdict());
  throw SecretRefused(JoinFailed(name, listener.verdict()), listener.accessPoint());
}

void Join(const Program& program, const Target& target) {
  JoinTrusting(target.config, target.trusted, [&](const KnownNetwork& config) { Join(program, config); });
}
