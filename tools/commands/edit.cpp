// edit: changes what was saved of a network.
#include "commands/edit.h"

#include <algorithm>
#include <vector>

#include "base/choices.h"
#include "base/signals.h"
#include "commands/networks.h"
#include "common/known_networks_file.h"
#include "common/paths.h"
#include "model/addressing.h"
#include "model/name_servers.h"
#include "model/network_extras.h"
#include "model/saved_networks.h"
#include "model/security.h"
#include "model/settings_change.h"
#include "model/status.h"

namespace {

constexpr Name kYesNo[] = {{"yes", 1}, {"no", 0}};

// A section as it is to be.
struct Edited {
  KnownNetwork network;
  Extras extras;
};

bool IsNothing(const NetworkToEdit& wanted) {
  return !wanted.concernsAddress() && !wanted.concernsSecret() && !wanted.nameServers && !wanted.priority &&
         !wanted.autojoin;
}

std::string NoneAsEmpty(const std::string& text) {
  return IsWord(text, "none") ? "" : text;
}

// A mask and a gateway belong to a static address. They stay with one that stays static, and go with it.
void SetAddress(KnownNetwork& network, const NetworkToEdit& wanted) {
  if (!wanted.concernsAddress()) return;
  const std::string saved = network.szIp;
  Addressing addressing{.ip = wanted.ip.value_or(saved.empty() ? "none" : saved), .mask = "", .gateway = ""};
  if (IsIpAddress(addressing.ip)) {
    addressing.mask = network.szMask;
    addressing.gateway = network.szGateway;
  }
  if (wanted.mask) addressing.mask = *wanted.mask;
  if (wanted.gateway) addressing.gateway = NoneAsEmpty(*wanted.gateway);
  SetAddressing(network, addressing);
}

void SetExtras(Extras& extras, const NetworkToEdit& wanted) {
  if (wanted.nameServers) {
    extras.nameServers = IsWord(*wanted.nameServers, "none") ? "" : CheckedNameServers(*wanted.nameServers);
  }
  if (wanted.priority) extras.priority = NumberOf(*wanted.priority, 0, kGreatestPriority, "priority");
  if (wanted.autojoin) extras.autojoin = ValueOf(kYesNo, *wanted.autojoin, "auto") != 0;
}

// The secret for all access points of the network that need one.
void SetSecrets(const Program& program, std::vector<Edited>& all, const NetworkToEdit& wanted) {
  if (!wanted.concernsSecret()) return;
  const auto needs = [](const Edited& each) { return NeedsSecret(each.network.network.auth); };
  const std::string name = program.output.Name(all.front().network.network.szEssid);
  if (!std::ranges::any_of(all, needs)) throw TakesNoSecret(name);
  const auto secret = ReadSecret(wanted.secret, "secret of " + name);
  if (!secret) throw Wrong("there is no terminal to ask for the secret", "give it with --key-file or --key-stdin");
  for (Edited& each : all) {
    if (!needs(each)) continue;
    RequireSecretFor(each.network.network.auth, *secret);
    SetText(each.network.szKey, *secret, "the secret");
  }
}

// Only the lines of what is named are touched.
void Write(const SettingsChange& change, const Edited& edited, const NetworkToEdit& wanted) {
  const auto& [network, extras] = edited;
  const std::string section = AddressText(network.network.bssid);
  if (wanted.concernsAddress()) {
    change.Set(section, kKeyAddress, network.szIp);
    change.Set(section, kKeyMask, network.szMask);
    change.Set(section, kKeyGateway, network.szGateway);
  }
  if (wanted.nameServers) change.Set(section, kKeyNameServers, extras.nameServers);
  if (wanted.priority) change.Set(section, kKeyPriority, std::to_string(extras.priority));
  if (wanted.autojoin) change.Set(section, kKeyAutojoin, extras.autojoin ? "yes" : "no");
  if (wanted.concernsSecret() && NeedsSecret(network.network.auth)) change.Set(section, kKeySecret, network.szKey);
}

std::vector<KnownNetwork> ToEdit(const Program& program, const std::string& name) {
  std::vector<KnownNetwork> known = AllKnown(name);
  if (known.empty()) throw NotKnown(program, name);
  if (std::ranges::all_of(known, HasSection)) return known;
  throw Failed("the section of " + program.output.Name(name) + " is not named by its BSSID",
               "look at it in " + std::string(kKnownNetworksPath));
}

std::string SentenceOf(const Program& program, const std::vector<Edited>& all) {
  const std::string name = all.front().network.network.szEssid;
  std::string sentence = "changed " + program.output.Name(name);
  if (ReadStatus().name != name) return sentence;
  return sentence + "; the connection stays as it is until the network is joined again";
}

}  // namespace

void Edit(const Program& program, const NetworkToEdit& wanted) {
  if (IsNothing(wanted)) {
    throw Wrong("nothing is named that is to be changed", "`merowireless edit --help` lists what can be");
  }
  std::vector<Edited> all;
  for (const KnownNetwork& network : ToEdit(program, wanted.name)) {
    Edited& edited = all.emplace_back(Edited{network, ExtrasOf(network)});
    SetAddress(edited.network, wanted);
    SetExtras(edited.extras, wanted);
  }
  SetSecrets(program, all, wanted);

  const Signals signals;  // none ends the program while a copy of the secrets lies beside them
  SettingsChange change(kKnownNetworksPath);
  for (const Edited& edited : all) Write(change, edited, wanted);
  change.Commit();
  SayChanged(program, SentenceOf(program, all), SavedAs(wanted.name));
}
