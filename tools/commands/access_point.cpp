// The commands about the access point.
#include "commands/access_point.h"

#include <algorithm>
#include <optional>

#include "base/signals.h"
#include "base/text.h"
#include "commands/channels.h"
#include "common/ap_settings.h"
#include "common/paths.h"
#include "model/ap_channels.h"
#include "model/ap_former.h"
#include "model/ap_saving.h"
#include "model/ap_settings.h"
#include "model/ap_state.h"
#include "model/ap_status.h"
#include "model/former_connection.h"
#include "model/join_lock.h"
#include "model/library.h"
#include "model/library_lines.h"

namespace {

// The saved settings. The defaults are never enabled: they are an open network, which nobody has asked for.
ApConf SettingsToEnable() {
  ApConf conf{};
  if (!ReadSavedAp(conf)) {
    throw Failure(Exit::kUsage, "no access point has been set up for this adapter",
                  "`merowireless ap set` gives it a name and a protection");
  }
  RequireComplete(conf);
  return conf;
}

void ApplySecrets(const Program& program, ApConf& conf, const ApChanges& changes) {
  if (changes.secret.isGiven() || LacksSecret(conf)) {
    const auto secret = ReadSecret(changes.secret, "secret of " + program.output.Name(conf.hostapConf.szSSID));
    if (secret) SetApSecret(conf, *secret);
  }
  if (!changes.guestKeyFile.empty()) {
    SetGuestSecret(conf, ReadSecret({.file = changes.guestKeyFile}, "").value_or(""));
  }
}

void ApplySettings(ApConf& conf, const ApChanges& changes) {
  for (const ApSetting& setting : ApSettings()) {
    const auto change = changes.settings.find(setting.field.key);
    if (change != changes.settings.end()) setting.set(conf, change->second);
  }
}

bool ConcernsChannel(const ApChanges& changes) {
  return std::ranges::any_of(changes.settings, [](const auto& change) {
    return change.first == "channel" || change.first == "band" || change.first == "hw_mode";
  });
}

bool AsksForQuietest(const ApChanges& changes) {
  const auto change = changes.settings.find("channel");
  return change != changes.settings.end() && IsWord(change->second, "auto");
}

// Tells what became of the channel, for a sentence; nothing when it is as it was given.
std::string ChooseChannel(const Program& program, ApConf& conf) {
  const auto quietest = QuietestChannel(program, Is5GHz(conf));
  conf.hostapConf.channel = quietest.value_or(0);
  if (!quietest) return " with the channel left to the daemon, since the radio does not tell which it knows";
  return " with channel " + std::to_string(*quietest) + ", the quietest";
}

// Takes the access point down. The library fails when none has ever been set up; the command does not, since there is
// nothing to take down then.
void TakeDown(const Program& program) {
  if (Run<BOOL>(program.Doing("taking the access point down"), [] { return MEROWirelessAPDisable(); }) != FALSE) return;
  if (WasReported(Report::kNeverAnAp)) return;
  throw Failed("the access point could not be taken down whole");
}

// Takes the access point down also where its switch cannot be saved.
void Disable(const Program& program, const ApConf& conf) {
  try {
    SaveApSwitch(conf, false);
  } catch (const Failure&) {
    TakeDown(program);
    throw;
  }
  TakeDown(program);
}

// ---- Enabling ----

enum class Start { kNotSaved, kFailed, kDone };

// The library starts an access point only when the saved settings say that it is switched on.
Start TryToStart(ApConf conf) {
  const bool wasOff = conf.blEnable == FALSE;
  conf.blEnable = TRUE;
  if (wasOff && MEROWirelessSetAPConfig(&conf) == FALSE) return Start::kNotSaved;
  return MEROWirelessAPEnable() != FALSE ? Start::kDone : Start::kFailed;
}

bool IsAnothers() {
  return WasReported(Report::kAnotherAp);
}

Failure Anothers() {
  return {Exit::kBusy, "an access point is being set up already, or an attempt was cut off",
          "wait a moment and try again"};
}

// The access point that there was is on the air again, or there was none.
Failure EnableFailed(bool hasFormer) {
  if (MEROWirelessAdapterNum() <= 0) return NoAdapter();
  if (IsAnothers()) return Anothers();
  if (hasFormer) {
    return Failed("the access point could not be enabled, and the one that was on the air is there again",
                  "the settings stay saved; -v shows what is wrong with them");
  }
  if (IsAccessPoints()) {
    return Failed("the access point could not be enabled, and an access point is left on the air",
                  "`merowireless ap disable` takes it down");
  }
  if (WasReported(Report::kScriptFailed)) {
    return Failed("the network start script failed, and the access point is disabled", "-v shows what it says");
  }
  return Failed("the access point could not be enabled");
}

// Ends an attempt that has failed: the access point that there was comes back, or else none is left.
void TakeBack(const Program& program, const ApConf& conf, const std::optional<FormerAp>& former) {
  if (!former) return Disable(program, conf);
  const bool back =
      Run<bool>(program.Doing("bringing the former access point back"), [&] { return former->PutBack(); });
  if (back && ReadApStatus(conf).isRunning()) return;
  Disable(program, conf);
  throw Failed("the access point that was on the air could not be brought back, and is disabled");
}

// Puts the access point on the air, or leaves what was there before.
void PutOnAir(const Program& program, const ApConf& conf) {
  const Signals signals;
  const ApStatus before = ReadApStatus(conf);
  std::optional<FormerAp> former;
  if (before.isRunning()) former.emplace(before.interface, conf.hostapConf.szBridge);

  Task task = program.Doing("setting up " + program.output.Name(conf.hostapConf.szSSID));
  task.szMarker = kApMarkerPath;
  task.undo = [&] { TakeBack(program, conf, former); };
  const auto start = Run<Start>(task, [&] { return TryToStart(conf); });
  if (start == Start::kNotSaved) throw ApNotSaved();
  if (start == Start::kFailed && IsAnothers()) throw Anothers();
  const bool isOnAir = start == Start::kDone && IsAccessPoints();
  const bool isInterrupted = signals.HasCome();
  if (isOnAir && !isInterrupted) return;
  Undo(task);
  if (isInterrupted) throw Interrupted{};
  throw EnableFailed(former && ReadApStatus(conf).isRunning());
}

// A process that was killed leaves its marker behind, and the library would refuse the next attempt.
void RequireNobodyAtIt() {
  if (IsBeingSetUp()) throw Anothers();
  (void)PLIBCSysUnlink(kApMarkerPath);  // reported by itself; the library refuses then
}

// The kernel tells what became of it.
void SayEnabled(const Program& program, const ApConf& conf) {
  const ApStatus status = ReadApStatus(conf);
  const std::string name = program.output.Name(status.name);
  const std::string more = status.state == ApState::kOnAir ? "" : ", and " + WhatBecameOf(status);
  program.output.Done<ApStatus>("the access point " + name + " is enabled" + more, "access_point", ApStatusFields(),
                                status);
}

}  // namespace

void ShowAp(const Program& program, bool showSecrets) {
  const auto fields = ApFields(showSecrets);
  program.output.One<ApConf>("access_point", fields, ReadApSettings());
}

void SetAp(const Program& program, const ApChanges& changes) {
  if (changes.settings.empty() && !changes.secret.isGiven() && changes.guestKeyFile.empty()) {
    throw Failure(Exit::kUsage, "there is nothing to change", "`merowireless ap set --help` lists the settings");
  }
  ApConf conf = ReadApSettings();
  SetBridgeDefault(conf);
  ApplySettings(conf, changes);
  ApplySecrets(program, conf, changes);
  RequireComplete(conf);
  const std::string chosen = AsksForQuietest(changes) ? ChooseChannel(program, conf) : "";
  const bool checked = !ConcernsChannel(changes) || CheckChannel(conf) == ChannelCheck::kPassed;
  SaveApKeepingSwitch(conf);
  if (!checked) Remark("merowireless: the channel could not be checked, since no radio is there to tell");
  const auto fields = ApFields(false);
  program.output.Done<ApConf>("saved" + chosen + "; `merowireless ap enable` puts the settings on the air",
                              "access_point", fields, conf);
}

void EnableAp(const Program& program) {
  const JoinLock lock;
  const ApConf conf = SettingsToEnable();
  RequireAdapter();
  RefuseWhileRadioIsOff();
  (void)CheckChannel(conf);  // what nobody can tell beforehand, the attempt shows
  RequireNobodyAtIt();
  FormerConnection(program).Guard([&] { PutOnAir(program, conf); });
  SayEnabled(program, ReadApSettings());
}

// Where nothing was saved, nothing is: a section with the switch alone would be one that does not say whether the radio
// may be used.
void DisableAp(const Program& program) {
  const JoinLock lock;
  const Signals signals;
  ApConf saved{};
  ReadSavedAp(saved) ? Disable(program, saved) : TakeDown(program);
  const ApStatus status = ReadApStatus(ReadApSettings());
  if (status.isRunning()) {
    throw Failed("the access point is disabled, and the kernel has one on the air",
                 "another access-point daemon may run: `ps -C hostapd` shows it");
  }
  program.output.Done<ApStatus>("the access point is disabled", "access_point", ApStatusFields(), status);
}

void ShowApStatus(const Program& program) {
  RequireAdapter();
  program.output.One<ApStatus>("access_point", ApStatusFields(), ReadApStatus(ReadApSettings()));
}
