// The connection that stands before another network is tried.
#include "model/former_connection.h"

#include <algorithm>

#include "base/pid_file.h"
#include "base/signals.h"
#include "base/whole_file.h"
#include "common/paths.h"
#include "common/text.h"
#include "model/ap_state.h"
#include "model/join_failures.h"
#include "model/name_servers.h"
#include "model/supplicant_settings.h"
#include "work/radio.h"

namespace {

// ---- What it was ----

// The supplicant's settings are those of the connection, unless somebody else has made it.
std::optional<KnownNetwork> Joined(const Status& status) {
  std::optional<KnownNetwork> network = ConfiguredNetwork(TextOfFile(kSupplicantConfigPath).value_or(""));
  if (!network || network->network.szEssid != status.name) return FindCalled(status.name);
  if (status.auth != WIRELESS_AUTH_UNKNOWN) network->network.auth = status.auth;
  network->network.protocol = status.protocol;
  const auto accessPoint = AccessPointOf(status.interface);
  if (network->noneBssid != 0 && accessPoint) std::ranges::copy(*accessPoint, network->network.bssid);
  return network;
}

KnownNetwork Cell(const Status& status) {
  KnownNetwork cell{};
  CopyText(cell.network.szEssid, status.name);
  cell.network.opmode = WIRELESS_OPMODE_ADHOC;
  CopyText(cell.szKey, WepKeyOf(status.interface));
  const bool wep = cell.szKey[0] != '\0';
  cell.network.auth = wep ? WIRELESS_AUTH_SHARED : WIRELESS_AUTH_OPEN;
  cell.network.encrypt = wep ? WIRELESS_ENCRYPT_WEP : WIRELESS_ENCRYPT_NONE;
  return cell;
}

// How the interface is addressed, whatever the settings say.
void SetAddressOf(const Status& status, KnownNetwork& network) {
  const InterfacePath client(kDhcpClientPidFormat, status.interface.c_str());
  const bool leased = IsDaemonThere(client.c_str(), "busybox");
  CopyText(network.szIp, leased ? "DHCP" : status.ip);
  CopyText(network.szMask, leased ? "" : status.mask);
}

std::optional<KnownNetwork> NetworkOf(const Status& status) {
  if (!status.isConnected()) return std::nullopt;
  auto network = status.state == WIRELESS_STATUS_CONNECTED_ADHOC ? Cell(status) : Joined(status);
  if (network) SetAddressOf(status, *network);
  return network;
}

// Whether a failed attempt is to be left as it is.
bool StaysAsItIs(const Failure& failure) {
  return failure.exit() == Exit::kNoLease || failure.exit() == Exit::kBusy;
}

}  // namespace

FormerConnection::FormerConnection(const Program& program)
    : program_(program),
      status_(ReadStatus()),
      network_(NetworkOf(status_)),
      routes_(Routes::Of(status_.interface)),
      nameServers_(SavedNameServersOf(status_.interface)) {}

void FormerConnection::Try(const std::function<void()>& attempt) const {
  const auto attemptToTheEnd = [&](const Signals& signals) {
    attempt();
    if (signals.HasCome()) throw Interrupted{};
  };
  Attempt(attemptToTheEnd, [&] { BringBack(); });
}

void FormerConnection::Guard(const std::function<void()>& attempt) const {
  Attempt([&](const Signals&) { attempt(); }, [&] { BringBackWhatHasEnded(); });
}

// Signals are held all the time, so that none comes between two steps; each step that takes time ends with one.
void FormerConnection::Attempt(const std::function<void(const Signals&)>& attempt,
                               const std::function<void()>& takeBack) const {
  const Signals signals;
  const auto undo = [&] {
    Task task = program_.Doing("");
    task.undo = takeBack;
    Undo(task);
    while (signals.HasCome()) continue;  // it has been told, or nothing was left to be interrupted
  };
  try {
    attempt(signals);
  } catch (const Failure& failure) {
    if (!StaysAsItIs(failure)) undo();
    throw;
  } catch (const std::exception&) {
    undo();
    throw;
  } catch (const Interrupted&) {
    undo();
    throw;
  }
}

bool FormerConnection::Stands() const {
  const Status status = ReadStatus();
  return status.isLetIn && status.state == status_.state && status.name == status_.name && status.ip == status_.ip;
}

void FormerConnection::BringBackWhatHasEnded() const {
  if (!exists() || Stands()) return;
  if (!IsAccessPoints()) return BringBack();
  const std::string name = program_.output.Name(status_.name);
  Remark("merowireless: the former connection, to " + name + ", is not brought back: the adapter is an access point");
}

void FormerConnection::BringBack() const {
  if (!exists()) return LeaveNothing();
  (void)MEROWirelessNetworkDisconnect();  // what it has not ended is ended by the join, or below
  if (network_ && Rejoin(*network_)) return SayItIsBack(*network_);
  const std::string name = program_.output.Name(status_.name);
  Remark("merowireless: the former connection, to " + name + ", could not be brought back");
  LeaveNothing();
}

bool FormerConnection::Rejoin(const KnownNetwork& network) const {
  Task task = program_.Doing("going back to " + program_.output.Name(status_.name));
  task.szMarker = kJoinMarkerPath;
  task.undo = LeaveNothing;
  if (Run<int>(task, [&] { return MEROWirelessNetworkConnect(&network); }) < 0) return false;
  const Status status = ReadStatus();
  return status.state == status_.state && status.name == status_.name;
}

bool FormerConnection::PutNameServersBack() const {
  try {
    SetNameServers(status_.interface, nameServers_);
    return true;
  } catch (const Failure&) {
    return false;
  }
}

// A lease brings its own routes, and those of another one may not fit.
bool FormerConnection::Readdress(const KnownNetwork& network) const {
  if (network.szIp[0] == '\0') return routes_.PutBack();
  Task task = program_.Doing("going back to the former address");
  task.undo = LeaveNothing;
  const bool set = Run<int>(task, [&] { return MEROWirelessIfconfigSet(status_.interface.c_str(), network); }) == 0;
  const bool routed = routes_.PutBack();
  const bool leased = std::string_view(network.szIp) == "DHCP";
  return set && (leased ? status_.ip.empty() || !ReadStatus().ip.empty() : routed);
}

void FormerConnection::SayItIsBack(const KnownNetwork& network) const {
  const std::string name = program_.output.Name(status_.name);
  const bool addressed = Readdress(network);
  if (PutNameServersBack() && addressed) {
    Remark("merowireless: the former connection, to " + name + ", is back");
  } else {
    Remark("merowireless: the former connection, to " + name + ", is back, but not all that came with it");
  }
}

void LeaveNothing() {
  if (MEROWirelessNetworkDisconnect() < 0) throw NotEnded();
}
