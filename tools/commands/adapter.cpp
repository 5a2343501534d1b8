// The commands about the adapter as a whole: radio, mode.
#include "commands/adapter.h"

#include <cstring>

#include "base/signals.h"
#include "commands/connection.h"
#include "common/paths.h"
#include "model/ap_files.h"
#include "model/ap_settings.h"
#include "model/ap_status.h"
#include "model/former_connection.h"
#include "model/join_lock.h"
#include "model/kernel_switch.h"
#include "model/library.h"
#include "model/radio_state.h"
#include "model/radio_use.h"
#include "model/situation.h"
#include "model/status.h"

namespace {

// ---- The radio ----

Value BlockOf(KernelBlock block) {
  switch (block) {
    case KernelBlock::kUnknown:
      return nullptr;
    case KernelBlock::kNone:
      return "none";
    case KernelBlock::kSet:
      return "set";
    case KernelBlock::kOfHardware:
      return "hardware";
  }
  return nullptr;
}

Shown ShowBlock(KernelBlock block) {
  switch (block) {
    case KernelBlock::kUnknown:
      return {"-", Tone::kFaint};
    case KernelBlock::kNone:
      return {"none"};
    case KernelBlock::kSet:
      return {"set"};
    case KernelBlock::kOfHardware:
      return {"set by a switch of the hardware", Tone::kBad};
  }
  return {""};
}

constexpr Field<Radio> kRadioFields[] = {
    {"radio", "radio", [](const Radio& of) { return Value(WordOf(of.state)); }, Layout::kLeft,
     [](const Radio& of, bool) {
       return Shown{WordOf(of.state), of.state == RadioState::kOn ? Tone::kGood : Tone::kBad};
     }},
    {"adapter", "adapter",
     [](const Radio&) {
       const std::string model = AdapterModelOrNone();
       return model.empty() ? nullptr : Value(model);
     }},
    {"kernel_block", "kernel's block", [](const Radio& of) { return BlockOf(of.block); }, Layout::kLeft,
     [](const Radio& of, bool) { return ShowBlock(of.block); }},
};

// ---- The mode ----

struct Mode {
  const char* szMode;
  bool changed;
};

constexpr Field<Mode> kModeFields[] = {
    {"mode", "mode", [](const Mode& of) { return Value(of.szMode); }},
    {"changed", "changed", [](const Mode& of) { return Value(of.changed); }},
};

void Say(const Program& program, const std::string& sentence, const Mode& mode) {
  program.output.Done<Mode>(sentence, "mode", kModeFields, mode);
}

std::string Described(const Program& program, const ApStatus& status) {
  return program.output.Name(status.nameOnAir.empty() ? status.name : status.nameOnAir) + " " + WhatBecameOf(status);
}

// The kernel tells what a change that failed has left.
Failure NotChanged() {
  if (MEROWirelessAdapterNum() <= 0) return NoAdapter();
  if (IsAccessPoints()) return Failed("the mode could not be changed, and the adapter is an access point's");
  return Failed("the mode could not be changed, and the adapter is a client's");
}

Task Changing(const Program& program) {
  return program.Doing("changing the mode");
}

bool Change(const Task& task, MERO_WIRELESS_MODE mode) {
  return Run<BOOL>(task, [mode] { return MEROWirelessModeChange(mode); }) != FALSE;
}

bool Change(const Program& program, MERO_WIRELESS_MODE mode) {
  return Change(Changing(program), mode);
}

// Switches the access point on that the client has taken the place of, or leaves it switched off. One that was switched
// on before, and did not run, stays so.
void TryToBeAccessPoint(const Program& program, const ApConf& conf, bool wasOn) {
  Task task = Changing(program);
  if (!wasOn) task.undo = [&] { (void)Change(program, WIRELESS_CLIENT_MODE); };
  if (!Change(task, WIRELESS_AP_MODE)) throw NotChanged();
  if (ReadApStatus(conf).isRunning()) return;
  Undo(task);
  throw Failed("the mode was changed, and no access point is on the air");
}

void BecomeAccessPoint(const Program& program) {
  const ApConf conf = ReadApSettings();
  const ApStatus before = ReadApStatus(conf);
  if (before.isRunning()) {
    return Say(program, "the adapter is an access point's already: " + Described(program, before), {"ap", false});
  }
  const ApSwitch apSwitch = ApSwitchOf(before.interface);
  if (apSwitch == ApSwitch::kNone) {
    throw Failure(Exit::kUsage, "no access point is enabled, and the change would only end a connection",
                  "`merowireless ap enable` makes the adapter one");
  }
  RefuseWhileRadioIsOff();
  const bool wasOn = apSwitch == ApSwitch::kOn;
  FormerConnection(program).Guard([&] { TryToBeAccessPoint(program, conf, wasOn); });
  Say(program, "the adapter is an access point's now: " + Described(program, ReadApStatus(conf)), {"ap", true});
}

// One that is switched on and does not run would come back by itself.
void BecomeClient(const Program& program) {
  if (!IsForAccessPoint()) return Say(program, "the adapter is a client's already", {"client", false});
  if (!Change(program, WIRELESS_CLIENT_MODE)) throw NotChanged();
  if (IsAccessPoints()) throw Failed("the mode was changed, and the adapter is an access point's all the same");
  Say(program, "the adapter is a client's now", {"client", true});
}

// ---- The radio's switch ----

// The switch is a key in the access-point settings. The library can save it only along with all the others, and only
// when the access point is enabled, so the key is set in the file.
void SaveSwitch(const std::string& model, bool on) {
  if (PLIBCFileSetSectionValue(kApSettingsPath, model.c_str(), "unblock", on ? "yes" : "no", kSectionLineFormat) >= 0) {
    return;
  }
  throw Failed("the radio could not be switched", "is there room on the disk? -v shows more");
}

void LiftBlock() {
  if (const int error = SetKernelBlock(MEROWirelessAPInterfaceGet(), false); error != 0) {
    throw Failed(std::string("the kernel's block of the radio could not be lifted: ") + std::strerror(error));
  }
}

// An access point that is switched off by the mode can come back with it.
void EndUse(const Program& program, const RadioUse& use) {
  if (use.isAccessPoint) {
    if (Change(program, WIRELESS_CLIENT_MODE) && !IsAccessPoints()) return;
    throw Failed("the radio stays on, since the access point could not be ended");
  }
  if (Run<int>(program.Doing("disconnecting"), [] { return MEROWirelessNetworkDisconnect(); }) >= 0) return;
  throw Failed("the radio stays on, since the connection could not be ended");
}

void SetBlock() {
  if (const int error = SetKernelBlock(MEROWirelessAPInterfaceGet(), true); error != 0) {
    throw Failed(std::string("the radio stays on, since the kernel does not block it: ") + std::strerror(error));
  }
}

// Tells what came back, for a sentence about the radio.
std::string BringBackAccessPoint(const Program& program) {
  const ApConf conf = ReadApSettings();
  const std::string interface = MEROWirelessAPInterfaceGet();
  if (ApSwitchOf(interface) == ApSwitch::kNone) return "";  // it was disabled meanwhile
  if (!ReadApStatus(conf).isRunning()) (void)Change(program, WIRELESS_AP_MODE);
  const ApStatus status = ReadApStatus(conf);
  if (status.isRunning()) return ", and " + Described(program, status);
  throw Failed("the radio is on, and the access point that was there does not come back",
               "`merowireless mode ap` tries again; -v shows what the library reports");
}

std::string BringBackConnection(const Program& program, const std::string& network) {
  const std::string name = program.output.Name(network);
  if (ReadStatus().name == network) return ", and connected to " + name;
  if (!FindCalled(network)) return "; " + name + " is not among the known networks, and was not joined again";
  try {
    JoinAgain(program, network);
  } catch (const Failure& failure) {
    throw Failure(failure.exit(), "the radio is on, and not connected to " + name + " again: " + failure.what(),
                  failure.advice());
  }
  return ", and connected to " + name;
}

std::string BringBack(const Program& program, const RadioUse& use) {
  if (use.isAccessPoint) return BringBackAccessPoint(program);
  return use.network.empty() ? "" : BringBackConnection(program, use.network);
}

// Undoes a part of SwitchOff().
void StayOn(const Program& program, const std::string& model, const RadioUse& use) {
  SaveSwitch(model, true);
  LiftBlock();
  (void)BringBack(program, use);
  ForgetRadioUse();
}

std::string SwitchOff(const Program& program) {
  const std::string model = AdapterModel();
  const RadioUse use = ReadRadioUse();
  const bool wasOff = MEROWirelessCheckBlock() == 0;
  if (!wasOff || use != RadioUse{}) NoteRadioUse(use);
  SaveSwitch(model, false);
  try {
    EndUse(program, use);
    SetBlock();
  } catch (...) {
    Task task = program.Doing("switching the radio back on");
    task.undo = [&] { StayOn(program, model, use); };
    if (!wasOff) Undo(task);
    throw;
  }
  return "the radio is off: no network will be joined";
}

// The kernel's block is as it was when the settings cannot be changed.
void LiftBlockAndSave(const std::string& model) {
  const std::string interface = MEROWirelessAPInterfaceGet();
  const KernelBlock before = KernelBlockOf(interface);
  if (before == KernelBlock::kOfHardware) RequireNoBlock();  // only hands can move that switch
  LiftBlock();
  try {
    RequireNoBlock();
    SaveSwitch(model, true);
  } catch (const Failure&) {
    if (before == KernelBlock::kSet && SetKernelBlock(interface, true) != 0) {
      Remark("merowireless: the kernel's block of the radio could not be set again");
    }
    throw;
  }
}

std::string SwitchOn(const Program& program) {
  const std::string model = AdapterModel();
  const RadioUse use = NotedRadioUse();
  LiftBlockAndSave(model);
  ForgetRadioUse();
  return "the radio is on" + BringBack(program, use);
}

}  // namespace

void ShowRadio(const Program& program) {
  program.output.One<Radio>("radio", kRadioFields, ReadRadio());
}

void SwitchRadio(const Program& program, const std::string& state) {
  if (state != "on" && state != "off") throw Wrong("the radio cannot be this", "switch it on or off");
  const JoinLock lock;
  const Signals signals;  // none comes between two steps: the next one that takes time ends with it
  const std::string sentence = state == "on" ? SwitchOn(program) : SwitchOff(program);
  program.output.Done<Radio>(sentence, "radio", kRadioFields, ReadRadio());
}

void ChangeMode(const Program& program, const std::string& mode) {
  if (mode != "ap" && mode != "client") throw Wrong("there is no such mode", "it is ap or client");
  RequireAdapter();
  const JoinLock lock;
  mode == "ap" ? BecomeAccessPoint(program) : BecomeClient(program);
}
