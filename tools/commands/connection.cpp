// The commands about the connection.
#include "commands/connection.h"

#include <chrono>
#include <optional>
#include <thread>

#include "common/paths.h"
#include "model/addressing.h"
#include "model/join_lock.h"
#include "model/library.h"
#include "model/library_lines.h"
#include "model/on_air.h"
#include "model/security.h"
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

// Ends everything that a failed attempt has left.
void LeaveNothing() {
  if (MEROWirelessNetworkDisconnect() < 0) throw Failed("the connection could not be ended whole");
}

Task Joining(const Program& program, const std::string& what, SupplicantListener& listener) {
  Task task = program.Doing(what);
  task.szMarker = kJoinMarkerPath;
  task.listener = &listener;
  task.undo = LeaveNothing;
  return task;
}

std::string SupplicantSocket() {
  return std::string(kSupplicantControlDirectory) + "/" + MEROWirelessInterfaceGet();
}

// Why the library gave an attempt up before it asked an access point, if it did.
std::optional<Failure> AttemptFailed(const std::string& name) {
  if (MEROWirelessAdapterNum() <= 0) return NoAdapter();
  if (WasReported(Report::kAnotherJoin)) {
    return Failure(Exit::kBusy, "a network is being joined already, or an attempt was cut off",
                   "wait a moment and try again");
  }
  if (WasReported(Report::kUnknownSecurity)) {
    return Failed(name + " is protected in a way that cannot be joined", "`merowireless scan` shows how");
  }
  if (WasReported(Report::kSupplicantNotConfigured) || WasReported(Report::kJoinNotRecorded)) {
    return Failed("the join could not be written down", "is there room on the disk? -v shows which file it is");
  }
  return std::nullopt;
}

// Why an access point let nobody in, by what the supplicant said.
std::optional<Failure> Refused(const std::string& name, Verdict verdict) {
  switch (verdict) {
    case Verdict::kSecretRefused:
      return Failure(Exit::kSecretRefused, name + " does not accept the secret",
                     "`merowireless save` saves the right one");
    case Verdict::kRefused:
      return Failed(name + " refuses this appliance",
                    "look for address filters and station limits at the access point");
    case Verdict::kNotFound:
      return Failure(Exit::kOutOfRange, name + " is not in range",
                     "move closer; `merowireless scan --renew` shows what is");
    case Verdict::kNone:
      break;
  }
  return std::nullopt;
}

Failure JoinFailed(const std::string& name, Verdict verdict) {
  if (const auto failure = AttemptFailed(name)) return *failure;
  if (const auto failure = Refused(name, verdict)) return *failure;
  return Failed(name + " could not be joined in time", "try again closer to it; -v shows what the library reports");
}

Failure AutoConnectFailed(Verdict verdict) {
  if (const auto failure = AttemptFailed("a known network")) return *failure;
  if (WasReported(Report::kAddressNotSet)) {
    return Failed("a network was joined, but its address could not be set");
  }
  if (verdict > Verdict::kNotFound) return *Refused("one of the known networks", verdict);
  return {Exit::kOutOfRange, "none of the known networks could be joined",
          "`merowireless scan --renew` shows what is in range; `merowireless connect NAME` says why one fails"};
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
  const int result =
      Run<int>(Joining(program, "joining " + name, listener), [&] { return MEROWirelessNetworkConnect(&config); });
  if (result < 0) throw JoinFailed(name, listener.verdict());
}

// ---- Addressing ----

void ApplyAddressing(const Program& program, const KnownNetwork& config) {
  if (config.szIp[0] == '\0') return;
  Task task = SettingAddress(program, config);
  task.undo = LeaveNothing;  // a join without its address is half of what was asked for
  ApplyAddress(task, config);
  ApplySavedGateway(config);
}

// ---- What to join ----

KnownNetwork FromTheAir(const Program& program, const NetworkToJoin& wanted) {
  KnownNetwork config{};
  config.network = FindInRange(program, wanted.name);
  config.network.opmode = WIRELESS_OPMODE_MANAGED;
  SetAddressing(config, Addressing{});
  return config;
}

void SetUser(KnownNetwork& config, const std::string& user) {
  if (NeedsUser(config.network.auth) && user.empty()) {
    throw Failure(Exit::kUsage, "this network asks who you are", "add --user NAME");
  }
  SetText(config.szUser, user, "the user");
}

KnownNetwork NetworkOf(const Program& program, const NetworkToJoin& wanted) {
  const auto known = FindKnown(wanted.name);
  KnownNetwork config = known ? *known : FromTheAir(program, wanted);
  if (config.szKey[0] == '\0' || wanted.secret.isGiven()) SetSecret(program, config, wanted.secret);
  SetUser(config, wanted.user);
  config.noneBssid = wanted.anyAccessPoint ? 1 : 0;
  return config;
}

void SayConnected(const Program& program) {
  const Status status = ReadStatus();
  const std::string address = status.ip.empty() ? "without an address" : "as " + status.ip;
  program.output.Done("connected to " + program.output.Name(status.name) + " " + address, "status", StatusFields(),
                      status);
}

// A static address needs its gateway too, which the library leaves to its caller.
void ApplyGatewayOfConnection() {
  if (const auto known = FindKnown(ReadStatus().name)) ApplySavedGateway(*known);
}

// The library does not notice when the driver refuses the cell.
bool IsInCell(const std::string& name) {
  WIRELESS_INFO info{};
  return MEROWirelessCurInfoGet(REQUEST_MODE, &info) == 0 && info.opmode == WIRELESS_OPMODE_ADHOC &&
         MEROWirelessCurInfoGet(REQUEST_ESSID, &info) == 0 && name == info.szEssid;
}

}  // namespace

void Connect(const Program& program, const NetworkToJoin& wanted) {
  const JoinLock lock;
  RequireFreeAdapter();
  const KnownNetwork config = NetworkOf(program, wanted);
  Join(program, config);
  if (!wanted.noAddress) ApplyAddressing(program, config);
  SayConnected(program);
}

void AutoConnect(const Program& program) {
  const JoinLock lock;
  RequireFreeAdapter();
  // Called while there is a connection, the library would end it and fail.
  if (ReadStatus().isConnected()) return SayConnected(program);
  if (Known(Order::kByTime).empty()) {
    throw Failure(Exit::kOutOfRange, "no network is known", "`merowireless save NAME` saves one");
  }

  EndFormerSupplicant(program);
  SupplicantListener listener(SupplicantSocket());
  if (Run<int>(Joining(program, "joining a known network", listener), [] { return MEROWirelessAutoConnect(); }) < 0) {
    throw AutoConnectFailed(listener.verdict());
  }
  RequireLease();
  ApplyGatewayOfConnection();
  SayConnected(program);
}

void Disconnect(const Program& program) {
  const JoinLock lock;
  if (Run<int>(program.Doing("disconnecting"), [] { return MEROWirelessNetworkDisconnect(); }) < 0) {
    throw Failed("the connection could not be ended whole");
  }
  program.output.Done("disconnected");
}

void ShowStatus(const Program& program) {
  program.output.One("status", StatusFields(), ReadStatus());
}

void MakeCell(const Program& program, const CellToMake& wanted) {
  const JoinLock lock;
  RequireFreeAdapter();
  KnownNetwork config{};
  SetNetworkName(config.network.szEssid, wanted.name);
  config.network.opmode = WIRELESS_OPMODE_ADHOC;
  config.network.auth = wanted.wep ? WIRELESS_AUTH_SHARED : WIRELESS_AUTH_OPEN;
  config.network.encrypt = wanted.wep ? WIRELESS_ENCRYPT_WEP : WIRELESS_ENCRYPT_NONE;
  SetSecret(program, config, wanted.secret);
  const std::string name = program.output.Name(wanted.name);
  Task task = program.Doing("starting " + name);
  task.undo = LeaveNothing;
  if (Run<int>(task, [&] { return MEROWirelessAdhocCreate(&config); }) < 0 || !IsInCell(wanted.name)) {
    Undo(task);
    throw Failed("the cell " + name + " could not be started",
                 "not every adapter can; -v shows what the library reports");
  }
  program.output.Done("started the ad-hoc cell " + name);
}
