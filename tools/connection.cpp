// The commands about the connection.
#include "connection.h"

#include <linux/rtnetlink.h>
#include <poll.h>
#include <sys/socket.h>

#include <chrono>
#include <cstdio>
#include <thread>

#include "library.h"
#include "library_log.h"
#include "paths.h"
#include "security.h"
#include "signals.h"
#include "status.h"
#include "supplicant.h"

namespace {

// ---- Joining ----

// Whatever an interrupted attempt has left. What cannot be ended was reported, and nobody is waiting for more.
void LeaveNothing() {
  (void)MEROWirelessNetworkDisconnect();
}

Task Joining(const Program& program, const std::string& what, SupplicantListener& listener) {
  Task task = program.Doing(what);
  task.szMarker = kJoinMarker;
  task.listener = &listener;
  task.undo = LeaveNothing;
  return task;
}

std::string SupplicantSocket() {
  return std::string(kSupplicantDirectory) + MEROWirelessInterfaceGet();
}

Failure JoinFailed(const std::string& name, Verdict verdict) {
  if (MEROWirelessAdapterNum() <= 0) return NoAdapter();
  if (library_log::Says("Another connection construction is going")) {
    return Failed("a network is being joined already, or an attempt was cut off", "wait a moment and try again");
  }
  if (library_log::Says("Failed to detect authentication/encryption type")) {
    return Failed(name + " is protected in a way that cannot be joined", "`merowireless scan` shows how");
  }
  switch (verdict) {
    case Verdict::kSecretRefused:
      return {Exit::kSecretRefused, name + " does not accept the secret",
              "`merowireless save` saves the network again with the right one"};
    case Verdict::kRefused:
      return Failed(name + " refuses this appliance",
                    "look for address filters and station limits at the access point");
    case Verdict::kNotFound:
      return {Exit::kOutOfRange, name + " is not in range", "move closer; `merowireless scan --renew` shows what is"};
    case Verdict::kNone:
      break;
  }
  return Failed(name + " could not be joined in time", "try again closer to it; -v shows what the library reports");
}

// The library tells a supplicant that runs to end, and starts the next one without waiting; that one gives up when it
// comes upon the former one's socket.
void EndFormerSupplicant(const Program& program) {
  if (PLIBCFileExist(kSupplicantPid) == 0) return;
  const bool gone = Run<bool>(program.Doing("leaving the former network"), [] {
    if (PLIBCExec(kSupplicantClient, "terminate", nullptr, nullptr, nullptr) != 0)
      return true;  // only its file is left
    for (int tries = 50; tries > 0 && PLIBCFileExist(kSupplicantPid) != 0; --tries) {
      std::this_thread::sleep_for(std::chrono::milliseconds(100));
    }
    return PLIBCFileExist(kSupplicantPid) == 0;
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

bool IsDhcp(const KnownNetwork& config) {
  return std::string_view(config.szIp) == "DHCP";
}

Task SettingAddress(const Program& program, const KnownNetwork& config) {
  return program.Doing(IsDhcp(config) ? "asking for an address" : "setting the address");
}

void ApplyAddress(const Task& task, const KnownNetwork& config) {
  const std::string interface = MEROWirelessInterfaceGet();
  const int result = Run<int>(task, [&] { return MEROWirelessIfconfigSet(interface.c_str(), config); });
  if (library_log::Says("Failed to get IP from DHCP")) {
    throw Failed("no DHCP server answered", "give a static address: merowireless address A.B.C.D --mask M");
  }
  if (result < 0) throw Failed("the address could not be set");
}

void ApplyGateway(const std::string& gateway) {
  if (MEROWirelessDefaultGatewaySet(gateway.c_str()) < 0) throw Failed("the gateway could not be set");
}

// A DHCP server names the gateway along with the address.
void ApplySavedGateway(const KnownNetwork& config) {
  if (config.szGateway[0] != '\0' && !IsDhcp(config)) ApplyGateway(config.szGateway);
}

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

// The static networks' gateway, which the library leaves to its caller.
void ApplyGatewayOfConnection() {
  if (const auto known = FindKnown(ReadStatus().name)) ApplySavedGateway(*known);
}

Failure AutoConnectFailed() {
  if (MEROWirelessAdapterNum() <= 0) return NoAdapter();
  if (library_log::Says("Failed to set interface configuration")) {
    return Failed("a network was joined, but its address could not be set", "-v shows what the library reports");
  }
  return {Exit::kOutOfRange, "none of the known networks could be joined",
          "`merowireless scan --renew` shows what is in range; `merowireless connect NAME` says why one fails"};
}

// ---- Watching ----

// Readable whenever the kernel has news about links and addresses.
Descriptor News() {
  Descriptor socket(Require(::socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC | SOCK_NONBLOCK, NETLINK_ROUTE), "netlink"));
  sockaddr_nl address{};
  address.nl_family = AF_NETLINK;
  address.nl_groups = RTMGRP_LINK | RTMGRP_IPV4_IFADDR;
  Require(::bind(socket.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address), "netlink");
  return socket;
}

// Waits until there is news, or time has passed in which some drivers have news that they do not tell. False when the
// program is to end.
bool WaitForNews(const Descriptor& news, const Signals& signals) {
  constexpr int kPatience = 1000;
  pollfd waited[] = {{news.get(), POLLIN, 0}, {signals.fd(), POLLIN, 0}};
  if (::poll(waited, std::size(waited), kPatience) <= 0) return true;
  if (signals.HasCome()) return false;
  char drained[8192];
  while (::recv(news.get(), drained, sizeof drained, 0) > 0) continue;
  return true;
}

}  // namespace

void Connect(const Program& program, const NetworkToJoin& wanted) {
  RequireAdapter();
  RequireRadio();
  const KnownNetwork config = NetworkOf(program, wanted);
  Join(program, config);
  if (wanted.address) ApplyAddressing(program, config);
  SayConnected(program);
}

void AutoConnect(const Program& program) {
  RequireAdapter();
  RequireRadio();
  // The library ends a connection that exists, and calls that a failure.
  if (ReadStatus().isConnected()) return SayConnected(program);

  SupplicantListener listener(SupplicantSocket());
  if (Run<int>(Joining(program, "joining a known network", listener), [] { return MEROWirelessAutoConnect(); }) < 0) {
    throw AutoConnectFailed();
  }
  ApplyGatewayOfConnection();
  SayConnected(program);
}

void Disconnect(const Program& program) {
  if (Run<int>(program.Doing("disconnecting"), [] { return MEROWirelessNetworkDisconnect(); }) < 0) {
    throw Failed("the connection could not be ended whole");
  }
  program.output.Done("disconnected");
}

void ShowStatus(const Program& program) {
  program.output.One("status", StatusFields(), ReadStatus());
}

void SetAddress(const Program& program, const Addressing& addressing) {
  KnownNetwork config{};
  SetAddressing(config, addressing);
  RequireAdapter();
  ApplyAddress(SettingAddress(program, config), config);
  const Status status = ReadStatus();
  program.output.Done("the address is " + (status.ip.empty() ? "not known yet" : status.ip), "status", StatusFields(),
                      status);
}

void SetGateway(const Program& program, const std::string& gateway) {
  if (!IsIpAddress(gateway)) {
    throw Failure(Exit::kUsage, "the gateway is no IPv4 address", "give an address such as 192.168.1.1");
  }
  RequireAdapter();
  ApplyGateway(gateway);
  program.output.Done("the gateway is " + gateway);
}

void MakeCell(const Program& program, const CellToMake& wanted) {
  RequireAdapter();
  RequireRadio();
  KnownNetwork config{};
  SetText(config.network.szEssid, wanted.name, "the name");
  config.network.opmode = WIRELESS_OPMODE_ADHOC;
  config.network.auth = wanted.wep ? WIRELESS_AUTH_SHARED : WIRELESS_AUTH_OPEN;
  config.network.encrypt = wanted.wep ? WIRELESS_ENCRYPT_WEP : WIRELESS_ENCRYPT_NONE;
  SetSecret(program, config, wanted.secret);
  const std::string name = program.output.Name(wanted.name);
  Task task = program.Doing("starting " + name);
  task.undo = LeaveNothing;
  if (Run<int>(task, [&] { return MEROWirelessAdhocCreate(&config); }) < 0) {
    throw Failed("the cell " + name + " could not be started",
                 "not every adapter can; -v shows what the library reports");
  }
  program.output.Done("started the ad-hoc cell " + name);
}

void Watch(const Program& program, int times) {
  const Signals signals;
  const Descriptor news = News();
  Status shown = ReadStatus();
  for (int count = 1;; ++count) {
    program.output.One("status", StatusFields(), shown);
    if (program.output.form() == Form::kHuman) std::fputs("\n", stdout);
    std::fflush(stdout);
    if (count == times) return;
    Status status = shown;
    while (status == shown) {
      if (!WaitForNews(news, signals)) return;
      status = ReadStatus();
    }
    shown = std::move(status);
  }
}
