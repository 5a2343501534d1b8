// The commands about the adapter as a whole: radio, mode.
#include "commands/adapter.h"

#include "common/paths.h"
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
  const MERO_WIRELESS_MODE value = mode == "ap" ? WIRELESS_AP_MODE : WIRELESS_CLIENT_MODE;
  if (Run<BOOL>(program.Doing("changing the mode"), [&] { return MEROWirelessModeChange(value); }) == FALSE) {
    if (MEROWirelessAdapterNum() <= 0) throw NoAdapter();
    throw Failed("the mode could not be changed");
  }
  program.output.Done(mode == "ap" ? "the adapter is an access point's now" : "the adapter is a client's now");
}
