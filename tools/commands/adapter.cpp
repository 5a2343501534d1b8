// The commands about the adapter as a whole: radio, mode.
#include "commands/adapter.h"

#include "common/paths.h"
#include "model/ap_files.h"
#include "model/ap_settings.h"
#include "model/ap_status.h"
#include "model/library.h"

namespace {

struct Radio {
  int answer;
  std::string model;
};

const char* TextOf(const Radio& radio) {
  return radio.answer == 1 ? "on" : radio.answer == 0 ? "off" : "unknown";
}

constexpr Field<Radio> kRadioFields[] = {
    {"radio", "radio", [](const Radio& of) { return Value(TextOf(of)); }, Layout::kLeft,
     [](const Radio& of, bool) {
       return Shown{TextOf(of), of.answer == 1 ? Tone::kGood : Tone::kBad};
     }},
    {"adapter", "adapter", [](const Radio& of) { return of.model.empty() ? nullptr : Value(of.model); }},
};

Radio ReadRadio() {
  return {MEROWirelessCheckBlock(), AdapterModelOrNone()};
}

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
Failure NotChanged(const std::string& interface) {
  if (MEROWirelessAdapterNum() <= 0) return NoAdapter();
  if (IsAccessPoint(interface)) return Failed("the mode could not be changed, and the adapter is an access point's");
  return Failed("the mode could not be changed, and the adapter is a client's");
}

bool Change(const Program& program, MERO_WIRELESS_MODE mode) {
  return Run<BOOL>(program.Doing("changing the mode"), [mode] { return MEROWirelessModeChange(mode); }) != FALSE;
}

void BecomeAccessPoint(const Program& program) {
  const ApConf conf = ReadApSettings();
  const ApStatus before = ReadApStatus(conf);
  if (before.isRunning()) {
    return Say(program, "the adapter is an access point's already: " + Described(program, before), {"ap", false});
  }
  if (ApSwitchOf(before.interface) == ApSwitch::kNone) {
    throw Failure(Exit::kUsage, "no access point is enabled, and the change would only end a connection",
                  "`merowireless ap enable` makes the adapter one");
  }
  if (!Change(program, WIRELESS_AP_MODE)) throw NotChanged(before.interface);
  const ApStatus after = ReadApStatus(conf);
  if (!after.isRunning()) throw Failed("the mode was changed, and no access point is on the air");
  Say(program, "the adapter is an access point's now: " + Described(program, after), {"ap", true});
}

// One that is switched on and does not run would come back by itself.
void BecomeClient(const Program& program) {
  const std::string interface = MEROWirelessAPInterfaceGet();
  if (!IsAccessPoint(interface) && ApSwitchOf(interface) != ApSwitch::kOn) {
    return Say(program, "the adapter is a client's already", {"client", false});
  }
  if (!Change(program, WIRELESS_CLIENT_MODE)) throw NotChanged(interface);
  if (IsAccessPoint(interface)) throw Failed("the mode was changed, and the adapter is an access point's all the same");
  Say(program, "the adapter is a client's now", {"client", true});
}

}  // namespace

void ShowRadio(const Program& program) {
  program.output.One<Radio>("radio", kRadioFields, ReadRadio());
}

// The radio's switch is a key in the access-point settings. The library can save it only along with all the others, and
// only when the access point is enabled, so the key is set in the file.
void SwitchRadio(const Program& program, const std::string& state) {
  if (state != "on" && state != "off") throw Wrong("the radio cannot be this", "switch it on or off");
  const bool on = state == "on";
  const std::string model = AdapterModel();
  if (PLIBCFileSetSectionValue(kApSettingsPath, model.c_str(), "unblock", on ? "yes" : "no", kSectionLineFormat) < 0) {
    throw Failed("the radio could not be switched", "is there room on the disk? -v shows more");
  }
  program.output.Done<Radio>(on ? "the radio is on" : "the radio is off: no network will be joined", "radio",
                             kRadioFields, ReadRadio());
}

void ChangeMode(const Program& program, const std::string& mode) {
  if (mode != "ap" && mode != "client") throw Wrong("there is no such mode", "it is ap or client");
  RequireAdapter();
  mode == "ap" ? BecomeAccessPoint(program) : BecomeClient(program);
}
