// The access points in range through which a known network can be joined.
#include "model/access_points.h"

#include <algorithm>
#include <exception>
#include <iterator>
#include <string_view>

#include "base/terminal.h"
#include "model/addressing.h"
#include "model/join_failures.h"
#include "model/security.h"

namespace {

// Whether an access point is one of the network's, by what it is called.
bool IsOf(const SavedNetwork& saved, const Network& accessPoint) {
  const auto isThis = [&](const Address& address) { return std::ranges::equal(address, accessPoint.bssid); };
  if (saved.isOneAccessPoint) return isThis(saved.addresses.front());
  return std::string_view(saved.newest.network.szEssid) == accessPoint.szEssid &&
         std::ranges::none_of(saved.others, isThis);
}

bool IsAsSaved(const SavedNetwork& saved, const Network& accessPoint) {
  return IsOf(saved, accessPoint) && IsProtectedAlike(saved.newest.network, accessPoint);
}

bool WasSavedWith(const SavedNetwork& saved, const Network& accessPoint) {
  return std::ranges::any_of(saved.addresses,
                             [&](const Address& address) { return std::ranges::equal(address, accessPoint.bssid); });
}

// ---- Trying one after the other ----

// Whether a failure tells more than that a network was not there, or could not have been joined anyway.
bool TellsMore(const Failure& failure) {
  return failure.exit() == Exit::kSecretRefused || failure.exit() == Exit::kFailed;
}

// Whether another network may be tried behind it.
bool IsOfOneNetwork(const Failure& failure) {
  return TellsMore(failure) || failure.exit() == Exit::kOutOfRange || failure.exit() == Exit::kTimedOut ||
         failure.exit() == Exit::kUnsupported;
}

class Walk {
 public:
  Walk(const Program& program, const std::function<void(const KnownNetwork&)>& join) : program_(program), join_(join) {}

  // Tries a network if it is heard. A cell waits for nobody.
  std::optional<KnownNetwork> TryHeard(const SavedNetwork& saved) {
    if (saved.isCell()) return Try(AsSaved(saved));
    if (const auto config = Heard(saved)) return Try(*config, Trusted(saved, inRange_));
    missed_.push_back({saved, Pretender(saved, inRange_)});
    return std::nullopt;
  }

  // Calls those that were not heard, since they may hide, and tries those that answer. It takes a scan for each, and
  // tells everybody in range their names, so it is the last that is done.
  std::optional<KnownNetwork> TryCalled() {
    std::vector<KnownNetwork> uncalled;
    for (Missed& missed : missed_) {
      const SavedNetwork& saved = missed.saved;
      const bool called = Through(saved, inRange_) || Call(saved);
      missed.pretender = Pretender(saved, inRange_);
      if (const auto config = Through(saved, inRange_)) {
        if (const auto joined = Try(*config, Trusted(saved, inRange_))) return joined;
      } else if (!called && !missed.pretender && HasProtection(saved)) {
        uncalled.push_back(AsSaved(saved));
      }
    }
    for (const KnownNetwork& config : uncalled) {
      if (const auto joined = Try(config)) return joined;
    }
    return std::nullopt;
  }

  // A remark for each network that is only pretended to be there.
  void TellOfPretenders() const {
    for (const Failure& failure : Pretenders()) Remark("merowireless: " + std::string(failure.what()));
  }

  // Why no network was joined.
  Failure Why() const {
    if (failure_) return TellOfPretenders(), *failure_;
    const auto pretenders = Pretenders();
    if (pretenders.empty()) {
      return {Exit::kOutOfRange, "none of the known networks could be joined",
              "`merowireless scan --renew` shows what is in range; `merowireless connect NAME` says why one fails"};
    }
    for (std::size_t i = 1; i < pretenders.size(); ++i) Remark("merowireless: " + std::string(pretenders[i].what()));
    return pretenders.front();
  }

 private:
  // A network that is not heard as it was saved.
  struct Missed {
    SavedNetwork saved;
    std::optional<Network> pretender;
  };

  // The adapter's last results serve as long as they hold each network that is looked for; then it scans, once for all.
  std::optional<KnownNetwork> Heard(const SavedNetwork& saved) {
    if (looks_ == 0) Look(WIRELESS_SCAN_LAST);
    const auto config = Through(saved, inRange_);
    if (config || looks_ > 1) return config;
    Look(WIRELESS_SCAN_RENEW);
    return Through(saved, inRange_);
  }

  // Where the adapter gives no results, a network may be in range all the same.
  void Look(WIRELESS_SCAN scan) {
    ++looks_;
    try {
      inRange_ = InRangeToJoin(program_.Doing("looking for known networks"), scan);
    } catch (const Failure& failure) {
      if (!IsOfOneNetwork(failure)) throw;
      inRange_.clear();
    }
  }

  std::vector<Failure> Pretenders() const {
    std::vector<Failure> failures;
    for (const Missed& missed : missed_) {
      if (missed.pretender) failures.push_back(NotAsSaved(program_, missed.saved, *missed.pretender));
    }
    return failures;
  }

  // Whether it would have answered.
  bool Call(const SavedNetwork& saved) {
    try {
      auto answers = InRangeOnCall(program_, saved.newest.network.szEssid);
      if (!answers) return false;
      inRange_ = *std::move(answers);
      return true;
    } catch (const Failure& failure) {
      if (!IsOfOneNetwork(failure)) throw;
      return false;
    }
  }

  static bool HasProtection(const SavedNetwork& saved) {
    return saved.newest.network.auth != WIRELESS_AUTH_UNKNOWN &&
           saved.newest.network.encrypt != WIRELESS_ENCRYPT_UNKNOWN;
  }

  std::optional<KnownNetwork> Try(const KnownNetwork& config, const std::vector<Network>& trusted = {}) {
    try {
      RequireJoinable(program_, config.network);
      RequireAddressing(config);
      JoinTrusting(config, trusted, join_);
      return config;
    } catch (const Failure& failure) {
      if (!IsOfOneNetwork(failure)) throw;
      if (!failure_ && TellsMore(failure)) failure_ = failure;
      return std::nullopt;
    }
  }

  const Program& program_;
  const std::function<void(const KnownNetwork&)>& join_;
  std::vector<Network> inRange_;
  int looks_ = 0;
  std::vector<Missed> missed_;
  std::optional<Failure> failure_;  // the first that tells more than that a network was not there
};

}  // namespace

std::vector<Network> LookFor(const Program& program, const SavedNetwork& saved) {
  return LookFor(program, saved.newest.network.szEssid,
                 [&](const Network& accessPoint) { return IsAsSaved(saved, accessPoint); });
}

std::optional<KnownNetwork> Through(const SavedNetwork& saved, const std::vector<Network>& inRange) {
  const auto found =
      std::ranges::find_if(inRange, [&](const Network& accessPoint) { return IsAsSaved(saved, accessPoint); });
  if (found == inRange.end()) return std::nullopt;
  KnownNetwork config = AsSaved(saved);
  config.network = *found;
  config.network.opmode = WIRELESS_OPMODE_MANAGED;
  return config;
}

std::vector<Network> Trusted(const SavedNetwork& saved, const std::vector<Network>& inRange) {
  std::vector<Network> trusted;
  std::ranges::copy_if(inRange, std::back_inserter(trusted), [&](const Network& accessPoint) {
    return IsAsSaved(saved, accessPoint) && WasSavedWith(saved, accessPoint);
  });
  return trusted;
}

void JoinTrusting(const KnownNetwork& config, const std::vector<Network>& trusted,
                  const std::function<void(const KnownNetwork&)>& join) {
  std::exception_ptr refusal;
  const auto isJoined = [&](const KnownNetwork& way) {
    try {
      join(way);
      return true;
    } catch (const NotLetIn& failure) {
      if (!failure.IsByStranger(trusted)) throw;
      refusal = std::current_exception();
      return false;
    }
  };
  if (isJoined(config)) return;
  for (const Network& accessPoint : trusted) {
    KnownNetwork alone = config;
    alone.network = accessPoint;
    alone.network.opmode = WIRELESS_OPMODE_MANAGED;
    alone.noneBssid = 0;
    if (isJoined(alone)) return;
  }
  std::rethrow_exception(refusal);
}

KnownNetwork AsSaved(const SavedNetwork& saved) {
  KnownNetwork config = saved.newest;
  const bool isRoaming = !saved.isCell() && !saved.isOneAccessPoint && saved.others.empty();
  config.noneBssid = isRoaming ? 1 : 0;
  return config;
}

std::optional<Network> Pretender(const SavedNetwork& saved, const std::vector<Network>& inRange) {
  const auto found =
      std::ranges::find_if(inRange, [&](const Network& accessPoint) { return IsOf(saved, accessPoint); });
  if (found == inRange.end() || Through(saved, inRange)) return std::nullopt;
  return *found;
}

KnownNetwork AsChanged(const SavedNetwork& saved, const Network& accessPoint) {
  KnownNetwork config = AsSaved(saved);
  config.network = accessPoint;
  config.network.opmode = WIRELESS_OPMODE_MANAGED;
  const bool isKept = NeedsSecret(accessPoint.auth) && CanBeSecret(accessPoint.auth, config.szKey);
  if (!isKept) config.szKey[0] = '\0';
  return config;
}

Failure NotAsSaved(const Program& program, const SavedNetwork& saved, const Network& pretender) {
  if (!CanBeJoined(pretender)) return Unsupported(program, pretender);
  const Network& network = saved.newest.network;
  const std::string name = program.output.Name(network.szEssid);
  const std::string was = SecurityText(network.auth, network.encrypt);
  const std::string is = SecurityText(pretender.auth, pretender.encrypt);
  return {Exit::kOutOfRange,
          name + " was saved as " + was + " and is " + is + " now, so it may be another one of that name",
          "it was given no secret; if it is yours, connect with --changed, or save it again"};
}

KnownNetwork JoinFirst(const Program& program, const std::vector<SavedNetwork>& networks,
                       const std::function<void(const KnownNetwork&)>& join) {
  Walk walk(program, join);
  std::optional<KnownNetwork> joined;
  for (const SavedNetwork& saved : networks) {
    joined = walk.TryHeard(saved);
    if (joined) break;
  }
  if (!joined) joined = walk.TryCalled();
  if (!joined) throw walk.Why();
  walk.TellOfPretenders();
  return *joined;
}
