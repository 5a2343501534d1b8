// The command that shares a network by a code.
#include "commands/share.h"

#include <iterator>
#include <span>
#include <string_view>

#include "base/text.h"
#include "base/whole_file.h"
#include "common/paths.h"
#include "model/ap_settings.h"
#include "model/ap_state.h"
#include "model/ap_status.h"
#include "model/join_code.h"
#include "model/status.h"
#include "model/supplicant_settings.h"
#include "show/code_picture.h"

namespace {

// ---- Whose code ----

// The connection's own secret may be another than the saved one.
KnownNetwork Joined(const std::string& name, const std::string& shown) {
  const auto configured = ConfiguredNetwork(TextOfFile(kSupplicantConfigPath).value_or(""));
  if (configured && name == configured->network.szEssid) return *configured;
  const auto known = FindCalled(name);
  if (known) return *known;
  throw Failed("the secret of " + shown + ", which is joined, is not known");
}

KnownNetwork KnownAs(const std::string& name, const std::string& shown) {
  const auto known = AllKnown(name);
  if (!known.empty()) return known.front();
  throw Failure(Exit::kOutOfRange, shown + " cannot be shared, since no such network is known",
                "`merowireless known` lists those that are");
}

// Its settings as they are saved. Others may be on the air.
ApConf ApToShare() {
  ApConf conf{};
  if (!ReadSavedAp(conf)) {
    throw Failed("no access point has been set up, and so none can be shared",
                 "`merowireless ap set` gives it a name and a protection");
  }
  if (ReadApStatus(conf).isPending.value_or(false)) {
    Remark("merowireless: the code is of the settings that are saved, and others are on the air");
  }
  return conf;
}

JoinCode CodeOfAccessPoint(const Program& program, const NetworkToShare& wanted) {
  const ApConf conf = ApToShare();
  if (!wanted.guests) return CodeOfAp(conf, program.output.Name(conf.hostapConf.szSSID));
  const MERO_HOSTAP_GUEST_NET& guests = conf.hostapConf.guestNet;
  if (guests.blEnable != FALSE) return CodeOfGuests(conf, program.output.Name(guests.szSSID));
  throw Failed("there is no guest network, and so none can be shared",
               "`merowireless ap set --guest-net-enable yes` sets one up");
}

JoinCode CodeOfConnection(const Program& program, bool isHidden) {
  const Status status = ReadStatus();
  if (!status.isConnected()) {
    throw Failed("no network is joined, and no access point is on the air", "name a known network");
  }
  const std::string shown = program.output.Name(status.name);
  return CodeOf(Joined(status.name, shown), isHidden, shown);
}

JoinCode CodeToShare(const Program& program, const NetworkToShare& wanted) {
  const bool isAp = IsWord(wanted.name, "ap") || (wanted.name.empty() && (wanted.guests || IsAccessPoints()));
  if (isAp) return CodeOfAccessPoint(program, wanted);
  if (wanted.guests) throw Wrong("only the access point has a guest network", "name no other network with --guest");
  if (wanted.name.empty()) return CodeOfConnection(program, wanted.isHidden);
  const std::string shown = program.output.Name(wanted.name);
  return CodeOf(KnownAs(wanted.name, shown), wanted.isHidden, shown);
}

void Draw(const Program& program, const CodePicture& picture) {
  const Terminal& terminal = program.output.terminal();
  const std::size_t width = picture.WidthOn(terminal);
  if (terminal.width != 0 && width > terminal.width) {
    throw Failure(Exit::kFailed, "the code does not fit on the screen, and takes " + std::to_string(width) + " columns",
                  "make the window wider, or add --png FILE");
  }
  program.output.Picture(picture.On(terminal));
}

struct Shared {
  JoinCode code;
  std::string png;
  std::string svg;
};

constexpr Field<Shared> kFields[] = {
    {"name", "network", [](const Shared& of) { return Value(of.code.name); }},
    {"name_hex", "", [](const Shared& of) { return IsUtf8(of.code.name) ? Value(nullptr) : Value(Hex(of.code.name)); }},
    {"protection", "protection", [](const Shared& of) { return Value(of.code.szProtection); }},
    {"hidden", "hidden", [](const Shared& of) { return Value(of.code.isHidden); }},
    {"png", "png", [](const Shared& of) { return Value(of.png); }},
    {"svg", "svg", [](const Shared& of) { return Value(of.svg); }},
    {"text", "text", [](const Shared& of) { return Value(of.code.text); }},
};
constexpr std::span kWithText(kFields);
constexpr std::span kWithoutText = kWithText.first(kWithText.size() - 1);

std::string SentenceOf(const Program& program, const Shared& shared) {
  const std::string name = program.output.Name(shared.code.name);
  std::string files;
  for (const std::string& path : {shared.png, shared.svg}) {
    if (!path.empty()) files += (files.empty() ? "" : " and ") + program.output.Name(path);
  }
  if (files.empty()) return "whoever sees this can join " + name;
  return "the code of " + name + " is in " + files + ": whoever sees it can join";
}

}  // namespace

void Share(const Program& program, const NetworkToShare& wanted) {
  const Shared shared{.code = CodeToShare(program, wanted), .png = wanted.png, .svg = wanted.svg};
  const bool isWritten = !wanted.png.empty() || !wanted.svg.empty();
  const bool isShown = !isWritten && program.output.form() == Form::kHuman;
  if (isWritten || isShown) {
    const CodePicture picture(shared.code.text);
    if (!wanted.png.empty()) WriteForOwner(wanted.png, program.output.Name(wanted.png), picture.Png());
    if (!wanted.svg.empty()) WriteForOwner(wanted.svg, program.output.Name(wanted.svg), picture.Svg());
    if (isShown) Draw(program, picture);
  }
  if (wanted.showSecrets) program.output.Picture(program.output.Name(shared.code.text) + "\n");
  program.output.Done<Shared>(SentenceOf(program, shared), "code", wanted.showSecrets ? kWithText : kWithoutText,
                              shared);
}
