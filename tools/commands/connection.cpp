// The commands about the connection.
#include "commands/connection.h"

#include <chrono>
#include <optional>
#include <thread>
#include <vector>

#include "base/choices.h"
#include "common/paths.h"
#include "model/access_points.h"
#include "model/addressing.h"
#include "model/ap_state.h"
#include "model/former_connection.h"
#include "model/join_failures.h"
#include "model/join_lock.h"
#include "model/left_alone.h"
#include "model/library.h"
#include "model/network_extras.h"
#include "model/patience.h"
#include "model/saved_networks.h"
#include "model/saving.h"
#include "model/security.h"
#include "model/situation.h"
#include "model/status.h"
#include "work/supplicant.h"

namespace {

// ---- Joining ----

// Fails when the adapter cannot be used, or is used otherwise.
void RequireFreeAdapter() {
  RequireAdapter();
  RequireRadio();
  RequireNoAccessPoint();
  RequireNoOtherJoin();
}

Task Joining(const Program& program, const std::string& what, SupplicantListener& listener) {
  Task task = program.Doing(what);
  task.szMarker = kJoinMarkerPath;
  task.listener = &listener;
  return task;
}

std::string SupplicantSocket() {
  return std::string(kSupplicantControlDirectory) + "/" + MEROWirelessInterfaceGet();
}

// The library tells a running supplicant to end and starts the next one at once. That one gives up while the control
// socket of the former one is still there, so the program waits for its end before it calls the library.
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

void Join(const Program& program, const KnownNetwork& config) {
  const std::string name = program.output.Name(config.network.szEssid);
  EndFormerSupplicant(program);
  SupplicantListener listener(SupplicantSocket());
  Task task = Joining(program, "joining " + name, listener);
  task.isPointless = [&] { return listener.isFinal(); };  // the library would wait on until its time is over
  try {
    if (Run<int>(task, [&] { return MEROWirelessNetworkConnect(&config); }) >= 0) return;
  } catch (const Pointless&) {
  }
  if (listener.verdict() != Verdict::kSecretRefused) throw JoinFailed(name, listener.verdict());
  throw SecretRefused(JoinFailed(name, listener.verdict()), listener.accessPoint());
}

// ---- Addressing ----

void ApplyAddressing(const Program& program, const KnownNetwork& config) {
  if (config.szIp[0] != '\0') {
    ApplyAddress(SettingAddress(program, config), config);
    ApplySavedGateway(config);
  }
  ApplyNameServers(config);
}

// ---- What to join ----

// A network that is to be joined.
struct Target {
  KnownNetwork config;
  bool isInRange;
  std::vector<Network> trusted = {};  // access points that are tried alone where another one refuses the secret
};

void Join(const Program& program, const Target& target) {
  JoinTrusting(target.config, target.trusted, [&](const KnownNetwork& config) { Join(program, config); });
}

// The network of those known by one name that is in range.
Target TargetAmong(const Program& program, const std::vector<SavedNetwork>& known, const std::vector<Network>& inRange,
                   bool isChanged) {
  for (const SavedNetwork& saved : known) {
    if (const auto config = Through(saved, inRange)) {
      return {.config = *config, .isInRange = true, .trusted = Trusted(saved, inRange)};
    }
  }
  const SavedNetwork& newest = known.front();
  const auto pretender = Pretender(newest, inRange);
  if (!pretender) return {.config = AsSaved(newest), .isInRange = false};
  if (!isChanged) throw NotAsSaved(program, newest, *pretender);
  return {.config = AsChanged(newest, *pretender), .isInRange = true};
}

Target FromWhatIsKnown(const Program& program, const std::vector<SavedNetwork>& known, bool isChanged) {
  if (known.front().isCell()) return {.config = AsSaved(known.front()), .isInRange = true};
  return TargetAmong(program, known, LookFor(program, known.front()), isChanged);
}

// An access point of a known name, but of an address that it was not saved with, may be one of that network.
Target FromTheAir(const Program& program, const NetworkToJoin& wanted) {
  const Network accessPoint = FindInRange(program, wanted.name);
  auto known = SavedAs(accessPoint.szEssid);
  for (SavedNetwork& saved : known) saved.LeaveOnly(accessPoint);
  if (!known.empty()) return TargetAmong(program, known, {accessPoint}, wanted.isChanged);
  KnownNetwork config{};
  config.network = accessPoint;
  config.network.opmode = WIRELESS_OPMODE_MANAGED;
  SetAddressing(config, Addressing{});
  config.noneBssid = wanted.name == accessPoint.szEssid ? 1 : 0;
  return {.config = config, .isInRange = true};
}

Failure NotInRange(const Program& program, const Target& target) {
  return {Exit::kOutOfRange,
          program.output.Name(target.config.network.szEssid) + " is not in range, and nothing was changed",
          "move closer; `merowireless scan --renew` shows what is"};
}

// One that hides, or comes into range, is found by the attempt. It is not worth to lose a connection for, and who waits
// is asked for nothing as long as it is not there.
Target TargetOf(const Program& program, const NetworkToJoin& wanted) {
  const auto known = SavedAs(wanted.name);
  if (!known.empty() && !wanted.isChanged) RequireJoinable(program, known.front().newest.network);
  Target target = known.empty() ? FromTheAir(program, wanted) : FromWhatIsKnown(program, known, wanted.isChanged);
  KnownNetwork& config = target.config;
  RequireJoinable(program, config.network);
  if (!target.isInRange && !wanted.wait.empty()) throw NotInRange(program, target);
  SetText(config.szUser, UserOf(program, config, wanted.user), "the user");
  if (config.szKey[0] == '\0' || wanted.secret.isGiven()) SetSecret(program, config, wanted.secret);
  if (wanted.anyAccessPoint) config.noneBssid = 1;
  return target;
}

// One that is given has been looked at.
void RequireSavedSecret(const Program& program, const KnownNetwork& config) {
  if (CanBeSecret(config.network.auth, config.szKey)) return;
  throw Failure(Exit::kSecretRefused,
                "the secret that was saved for " + program.output.Name(config.network.szEssid) + " can be none",
                "`merowireless save` saves the right one");
}

void SayConnected(const Program& program, const char* szMore = "") {
  const Status status = ReadStatus();
  program.output.Done(ConnectionText(program.output, status) + szMore, "status", StatusFields(), status);
}

// Whoever is asked for a secret is told before that the adapter is used otherwise, and keeps nobody else from it with
// his answer.
void RequireFreeAdapterNow() {
  const JoinLock lock;
  RequireFreeAdapter();
}

// The network that is wanted.
Target ToBeJoined(const Program& program, const NetworkToJoin& wanted) {
  RequireFreeAdapterNow();
  Target target = TargetOf(program, wanted);
  RequireSavedSecret(program, target.config);
  if (!wanted.noAddress) RequireAddressing(target.config);
  return target;
}

void ConnectTo(const Program& program, const NetworkToJoin& wanted, const Target& target) {
  const JoinLock lock;
  RequireFreeAdapter();
  const FormerConnection former(program);
  if (former.exists() && !target.isInRange) throw NotInRange(program, target);
  Saving saving = Saving::kNothing;
  former.Try([&] {
    Join(program, target);
    LeaveAloneNoMore();
    if (!wanted.noSave) saving = SaveWhatWorked(target.config, wanted.name == target.config.network.szEssid);
    if (!wanted.noAddress) ApplyAddressing(program, target.config);
  });
  if (saving == Saving::kFailed) throw JoinedAndNotSaved(program.output.Name(target.config.network.szEssid));
  SayConnected(program, saving == Saving::kDone ? ", and saved" : "");
}

// The library does not notice when the driver refuses the cell.
bool IsInCell(const std::string& name) {
  WIRELESS_INFO info{};
  return MEROWirelessCurInfoGet(REQUEST_MODE, &info) == 0 && info.opmode == WIRELESS_OPMODE_ADHOC &&
         MEROWirelessCurInfoGet(REQUEST_ESSID, &info) == 0 && name == info.szEssid;
}

Failure NothingToJoin() {
  if (Known(Order::kAsSaved).empty()) {
    return {Exit::kOutOfRange, "no network is known", "`merowireless save NAME` saves one"};
  }
  return {Exit::kOutOfRange, "none of the known networks is to be joined by itself",
          "`merowireless edit NAME --auto yes` lets one be"};
}

}  // namespace

void Connect(const Program& program, const NetworkToJoin& wanted) {
  constexpr int kDay = 86400;
  const std::chrono::seconds patience(wanted.wait.empty() ? 0 : NumberOf(wanted.wait, 1, kDay, "wait"));
  std::optional<Target> target;
  Patiently(program, program.output.Name(wanted.name), patience, [&] {
    if (!target) target = ToBeJoined(program, wanted);
    ConnectTo(program, wanted, *target);
  });
}

void JoinAgain(const Program& program, const std::string& name) {
  const Target target = FromWhatIsKnown(program, SavedAs(name), false);
  Join(program, target);
  ApplyAddressing(program, target.config);
}

void AutoConnect(const Program& program, JoinLockFor who) {
  const JoinLock lock(who);
  RequireFreeAdapter();
  if (who == JoinLockFor::kCommand) LeaveAloneNoMore();
  if (IsLeftAlone()) return;  // the keeper has looked before it had the lock
  if (ReadStatus().isLetIn) return SayConnected(program);
  const auto networks = NetworksToTry();
  if (networks.empty()) throw NothingToJoin();
  FormerConnection(program).Try([&] {
    const auto joined = JoinFirst(program, networks, [&](const KnownNetwork& config) { Join(program, config); });
    ApplyAddressing(program, joined);
  });
  SayConnected(program);
}

void Disconnect(const Program& program) {
  const JoinLock lock;
  if (Run<int>(program.Doing("disconnecting"), [] { return MEROWirelessNetworkDisconnect(); }) < 0) {
    throw NotEnded();
  }
  LeaveAlone();
  program.output.Done("disconnected");
}

void ShowStatus(const Program& program) {
  program.output.One("status", StatusFields(), ReadStatus());
}

void MakeCell(const Program& program, const CellToMake& wanted) {
  RequireFreeAdapterNow();
  KnownNetwork config{};
  SetNetworkName(config.network.szEssid, wanted.name);
  config.network.opmode = WIRELESS_OPMODE_ADHOC;
  config.network.auth = wanted.wep ? WIRELESS_AUTH_SHARED : WIRELESS_AUTH_OPEN;
  config.network.encrypt = wanted.wep ? WIRELESS_ENCRYPT_WEP : WIRELESS_ENCRYPT_NONE;
  SetSecret(program, config, wanted.secret);
  const JoinLock lock;
  RequireFreeAdapter();
  const std::string name = program.output.Name(wanted.name);
  FormerConnection(program).Try([&] {
    EndFormerSupplicant(program);
    const int result = Run<int>(program.Doing("starting " + name), [&] { return MEROWirelessAdhocCreate(&config); });
    if (result >= 0 && IsInCell(wanted.name)) return LeaveAloneNoMore();
    throw Failed("the cell " + name + " could not be started",
                 "not every adapter can; -v shows what the library reports");
  });
  program.output.Done("started the ad-hoc cell " + name);
}
