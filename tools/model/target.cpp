// Which network is joined when somebody names one.
#include "model/target.h"

#include "model/access_points.h"
#include "model/addressing.h"
#include "model/join_failures.h"
#include "model/saved_networks.h"
#include "model/security.h"

namespace {

// The network of those known by one name that is in range.
Target TargetAmong(const Program& program, const std::vector<SavedNetwork>& known, const std::vector<Network>& inRange,
                   bool isChanged) {
  for (const SavedNetwork& saved : known) {
    if (const auto config = Through(saved, inRange)) {
      return {.config = *config, .isInRange = true, .trusted = Trusted(saved, inRange)};
    }
  }
  const SavedNetwork& newest = known.front();
  const auto pretender = Pretender(newest, inRange);
  if (!pretender) return {.config = AsSaved(newest), .isInRange = false};
  if (!isChanged) throw NotAsSaved(program, newest, *pretender);
  return {.config = AsChanged(newest, *pretender), .isInRange = true};
}

Target FromWhatIsKnown(const Program& program, const std::vector<SavedNetwork>& known, bool isChanged) {
  if (known.front().isCell()) return {.config = AsSaved(known.front()), .isInRange = true};
  return TargetAmong(program, known, LookFor(program, known.front()), isChanged);
}

// Where nothing was saved, the library is told what the air says.
KnownNetwork AsHeard(const Network& accessPoint, bool isByName) {
  KnownNetwork config{};
  config.network = accessPoint;
  config.network.opmode = WIRELESS_OPMODE_MANAGED;
  SetAddressing(config, Addressing{});
  config.noneBssid = isByName ? 1 : 0;
  return config;
}

// An access point of a known name, but of an address that it was not saved with, may be one of that network.
Target FromTheAir(const Program& program, const std::string& name, bool isChanged) {
  const Network accessPoint = FindInRange(program, name);
  auto known = SavedUnder(accessPoint.szEssid);
  for (SavedNetwork& saved : known) saved.LeaveOnly(accessPoint);
  if (!known.empty()) return TargetAmong(program, known, {accessPoint}, isChanged);
  return {.config = AsHeard(accessPoint, !ParseAddress(name)), .isInRange = true};
}

}  // namespace

Target SavedTarget(const Program& program, const std::string& essid) {
  return FromWhatIsKnown(program, SavedUnder(essid), false);
}

Target FindTarget(const Program& program, const std::string& name, bool isChanged) {
  const auto known = SavedAs(name);
  if (!known.empty() && !isChanged) RequireJoinable(program, known.front().newest.network);
  Target target = known.empty() ? FromTheAir(program, name, isChanged) : FromWhatIsKnown(program, known, isChanged);
  RequireJoinable(program, target.config.network);
  return target;
}

void RequireSavedSecret(const Program& program, const KnownNetwork& config) {
  if (CanBeSecret(config.network.auth, config.szKey)) return;
  throw Failure(Exit::kSecretRefused,
                "the secret that was saved for " + program.output.Name(config.network.szEssid) + " can be none",
                "`merowireless connect --key-stdin` tries another, and saves it once it works");
}

Failure NotInRange(const Program& program, const Target& target) {
  return {Exit::kOutOfRange,
          program.output.Name(target.config.network.szEssid) + " is not in range, and nothing was changed",
          "move closer; `merowireless scan --renew` shows what is"};
}
