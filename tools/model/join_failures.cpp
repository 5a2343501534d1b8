// Why networks are not joined.
#include "model/join_failures.h"

#include <optional>
#include <string_view>

#include "model/library.h"
#include "model/library_lines.h"
#include "model/obstacles.h"
#include "model/security.h"

namespace {

// Why the library gave an attempt up before it asked an access point, if it did.
std::optional<Failure> AttemptFailed(const std::string& name) {
  if (MEROWirelessAdapterNum() <= 0) return NoAdapter();
  if (WasReported(Report::kAnotherJoin)) {
    return Failure(Exit::kBusy, "a network is being joined already, or an attempt was cut off",
                   "wait a moment and try again");
  }
  if (WasReported(Report::kUnknownSecurity)) return Unsupported(name);
  if (WasReported(Report::kSupplicantNotConfigured) || WasReported(Report::kJoinNotRecorded)) {
    return Failed("the join could not be written down", "is there room on the disk? -v shows which file it is");
  }
  return std::nullopt;
}

// Why an access point let nobody in, by what the supplicant said.
std::optional<Failure> Refused(const std::string& name, Verdict verdict) {
  switch (verdict) {
    case Verdict::kSecretRefused:
      return Failure(Exit::kSecretRefused, name + " does not accept the secret",
                     "`merowireless connect --key-stdin` tries another, and saves it once it works");
    case Verdict::kRefused:
      return Failed(name + " refuses this appliance",
                    "look for address filters and station limits at the access point");
    case Verdict::kNotFound:
      return Failure(Exit::kOutOfRange, name + " is not in range",
                     "move closer; `merowireless scan --renew` shows what is");
    case Verdict::kNone:
      break;
  }
  return std::nullopt;
}

// Whether the supplicant takes the end of a text, which stands between quotation marks, for a comment.
bool IsCutShort(std::string_view text) {
  bool isQuoted = true;
  for (const char c : text) {
    if (c == '"') isQuoted = !isQuoted;
    if (c == '#' && !isQuoted) return true;
  }
  return false;
}

Failure NotTellable(const std::string& what) {
  return {Exit::kUnsupported, "the supplicant would take the end of " + what + " for a comment",
          "it can be told of no \" that stands alone before a #; the access point needs another one"};
}

}  // namespace

Failure Unsupported(const std::string& name) {
  return {Exit::kUnsupported, name + " is protected in a way that cannot be joined", "`merowireless scan` shows how"};
}

Failure Unsupported(const Program& program, const Network& accessPoint) {
  const std::string name = program.output.Name(accessPoint.szEssid);
  const std::string how = Obstacles::Read().Of(accessPoint);
  if (how.empty() || how == "unknown") return Unsupported(name);
  return {Exit::kUnsupported, name + " is protected by " + how + ", and cannot be joined",
          "it can when its access point takes plain WPA2 as well"};
}

void RequireJoinable(const Program& program, const Network& network) {
  if (!CanBeJoined(network)) throw Unsupported(program, network);
}

void RequireTellable(const Program& program, const KnownNetwork& config) {
  if (config.network.opmode == WIRELESS_OPMODE_ADHOC) return;  // the supplicant is not told
  const std::string name = program.output.Name(config.network.szEssid);
  if (IsCutShort(config.network.szEssid)) throw NotTellable("the name " + name);
  if (IsCutShort(config.szKey)) throw NotTellable("the secret of " + name);
  if (IsCutShort(config.szUser)) throw NotTellable("the user of " + name);
}

Failure JoinFailed(const std::string& name, Verdict verdict) {
  if (const auto failure = AttemptFailed(name)) return *failure;
  if (const auto failure = Refused(name, verdict)) return *failure;
  return {Exit::kTimedOut, name + " could not be joined in time",
          "try again closer to it; -v shows what the library reports"};
}

Failure NotEnded() {
  return Failed("the connection could not be ended whole");
}
