// The commands about the connection.
#include "commands/connection.h"

#include <chrono>
#include <optional>

#include "base/choices.h"
#include "model/access_points.h"
#include "model/addressing.h"
#include "model/ap_state.h"
#include "model/former_connection.h"
#include "model/join_failures.h"
#include "model/join_lock.h"
#include "model/joining.h"
#include "model/left_alone.h"
#include "model/library.h"
#include "model/network_extras.h"
#include "model/patience.h"
#include "model/saved_networks.h"
#include "model/saving.h"
#include "model/status.h"
#include "model/target.h"

namespace {

// ---- What is known beforehand ----

// Fails when the adapter cannot be used, or is used otherwise.
void RequireFreeAdapter() {
  RequireAdapter();
  RequireRadio();
  RequireNoAccessPoint();
  RequireNoOtherJoin();
}

// Whoever is asked for a secret is told before that the adapter is used otherwise, and keeps nobody else from it with
// his answer.
void RequireFreeAdapterNow() {
  const JoinLock lock;
  RequireFreeAdapter();
}

// One that hides, or comes into range, is found by the attempt. It is not worth to lose a connection for, and who waits
// is asked for nothing as long as it is not there.
Target TargetOf(const Program& program, const NetworkToJoin& wanted) {
  Target target = FindTarget(program, wanted.name, wanted.isChanged);
  KnownNetwork& config = target.config;
  if (!target.isInRange && !wanted.wait.empty()) throw NotInRange(program, target);
  SetText(config.szUser, UserOf(program, config, wanted.user), "the user");
  if (config.szKey[0] == '\0' || wanted.secret.isGiven()) SetSecret(program, config, wanted.secret);
  if (wanted.anyAccessPoint) config.noneBssid = 1;
  return target;
}

// The network that is wanted.
Target ToBeJoined(const Program& program, const NetworkToJoin& wanted) {
  RequireFreeAdapterNow();
  Target target = TargetOf(program, wanted);
  RequireSavedSecret(program, target.config);
  RequireTellable(program, target.config);
  if (!wanted.noAddress) RequireAddressing(target.config);
  return target;
}

// ---- The connection ----

void ApplyAddressing(const Program& program, const KnownNetwork& config) {
  if (config.szIp[0] != '\0') {
    ApplyAddress(SettingAddress(program, config), config);
    ApplySavedGateway(config);
  }
  ApplyNameServers(config);
}

void SayConnected(const Program& program, const char* szMore = "") {
  const Status status = ReadStatus();
  program.output.Done(ConnectionText(program.output, status) + szMore, "status", StatusFields(), status);
}

// Nothing tells one open network from another of its name, so whoever saves one is told what that means.
const char* WhatBecame(Saving saving, const KnownNetwork& config) {
  if (saving != Saving::kDone) return "";
  if (config.network.auth != WIRELESS_AUTH_OPEN) return ", and saved";
  return ", and saved: from now on any open network of this name may be joined by itself";
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
    if (!wanted.noSave) saving = SaveWhatWorked(target.config, !ParseAddress(wanted.name));
    if (!wanted.noAddress) ApplyAddressing(program, target.config);
  });
  if (saving == Saving::kFailed) throw JoinedAndNotSaved(program.output.Name(target.config.network.szEssid));
  SayConnected(program, WhatBecame(saving, target.config));
}

// The library leaves all that the former network has brought to the cell: address, routes, name servers, and the DHCP
// client that renews them.
void LeaveFormerNetwork(const Program& program) {
  EndFormerSupplicant(program);
  const auto disconnect = [] { return MEROWirelessNetworkDisconnect(); };
  if (Run<int>(program.Doing("leaving the former network"), disconnect) < 0) throw NotEnded();
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
  const Target target = SavedTarget(program, name);
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

void LeaseAgain(const Program& program) {
  const JoinLock lock(JoinLockFor::kKeeper);
  if (!ReadStatus().isLetIn || !IsLeaseAbandoned()) return;
  KnownNetwork config{};
  SetAddressing(config, Addressing{});
  ApplyAddress(SettingAddress(program, config), config);
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
  RequireName(wanted.name);
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
    LeaveFormerNetwork(program);
    const int result = Run<int>(program.Doing("starting " + name), [&] { return MEROWirelessAdhocCreate(&config); });
    if (result >= 0 && IsInCell(wanted.name)) return LeaveAloneNoMore();
    throw Failed("the cell " + name + " could not be started",
                 "not every adapter can; -v shows what the library reports");
  });
  program.output.Done("started the ad-hoc cell " + name);
}
