// The commands about the connection.
#include "commands/connection.h"

#include <chrono>
#include <thread>

#include "common/paths.h"
#include "model/addressing.h"
#include "model/ap_state.h"
#include "model/former_connection.h"
#include "model/join_failures.h"
#include "model/join_lock.h"
#include "model/library.h"
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
  throw JoinFailed(name, listener.verdict());
}

// ---- Addressing ----

void ApplyAddressing(const Program& program, const KnownNetwork& config) {
  if (config.szIp[0] == '\0') return;
  ApplyAddress(SettingAddress(program, config), config);
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
  if (!CanBeJoined(config.network)) throw Unsupported(program.output.Name(config.network.szEssid));
  if (config.szKey[0] == '\0' || wanted.secret.isGiven()) SetSecret(program, config, wanted.secret);
  SetUser(config, wanted.user);
  config.noneBssid = wanted.anyAccessPoint ? 1 : 0;
  return config;
}

// One that is given has been looked at.
void RequireSavedSecret(const Program& program, const KnownNetwork& config) {
  if (CanBeSecret(config.network.auth, config.szKey)) return;
  throw Failure(Exit::kSecretRefused,
                "the secret that was saved for " + program.output.Name(config.network.szEssid) + " can be none",
                "`merowireless save` saves the right one");
}

// A look at the air takes a while. It is worth that where there is a connection to be lost; elsewhere the attempt
// tells.
void RequireInRange(const Program& program, const KnownNetwork& config, const FormerConnection& former) {
  if (!former.exists() || IsInRange(program, config)) return;
  throw Failure(Exit::kOutOfRange,
                program.output.Name(config.network.szEssid) + " is not in range, and nothing was changed",
                "move closer; `merowireless scan --renew` shows what is");
}

void SayConnected(const Program& program) {
  const Status status = ReadStatus();
  program.output.Done(ConnectionText(program.output, status), "status", StatusFields(), status);
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
  RequireSavedSecret(program, config);
  if (!wanted.noAddress) RequireAddressing(config);
  const FormerConnection former(program);
  RequireInRange(program, config, former);
  former.Try([&] {
    Join(program, config);
    if (!wanted.noAddress) ApplyAddressing(program, config);
  });
  SayConnected(program);
}

void JoinAgain(const Program& program, const KnownNetwork& config) {
  Join(program, config);
  ApplyAddressing(program, config);
}

void AutoConnect(const Program& program) {
  const JoinLock lock;
  RequireFreeAdapter();
  // Called while there is a connection, the library would end it and fail.
  if (IsLetIn(ReadStatus())) return SayConnected(program);
  if (Known(Order::kByTime).empty()) {
    throw Failure(Exit::kOutOfRange, "no network is known", "`merowireless save NAME` saves one");
  }

  FormerConnection(program).Try([&] {
    EndFormerSupplicant(program);
    SupplicantListener listener(SupplicantSocket());
    if (Run<int>(Joining(program, "joining a known network", listener), [] { return MEROWirelessAutoConnect(); }) < 0) {
      throw AutoConnectFailed(listener.verdict());
    }
  });
  RequireLease();
  ApplyGatewayOfConnection();
  SayConnected(program);
}

void Disconnect(const Program& program) {
  const JoinLock lock;
  if (Run<int>(program.Doing("disconnecting"), [] { return MEROWirelessNetworkDisconnect(); }) < 0) {
    throw NotEnded();
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
  FormerConnection(program).Try([&] {
    EndFormerSupplicant(program);
    const int result = Run<int>(program.Doing("starting " + name), [&] { return MEROWirelessAdhocCreate(&config); });
    if (result >= 0 && IsInCell(wanted.name)) return;
    throw Failed("the cell " + name + " could not be started",
                 "not every adapter can; -v shows what the library reports");
  });
  program.output.Done("started the ad-hoc cell " + name);
}
