// The commands about the stations of the access point.
#include "commands/stations.h"

#include <algorithm>
#include <chrono>
#include <optional>
#include <vector>

#include "base/await.h"
#include "common/paths.h"
#include "model/ap_state.h"
#include "model/library.h"
#include "model/stations.h"
#include "work/control_socket.h"

namespace {

void RequireAccessPoint() {
  if (IsAccessPoints()) return;
  throw Failed("there is no access point, and so no station", "`merowireless ap enable` puts one on the air");
}

std::vector<Station> ListedStations() {
  auto stations = Stations();
  if (stations) return *std::move(stations);
  throw Failure(Exit::kFailed, "the adapter's driver cannot list the stations",
                "`merowireless ap status` tells whether the access point is on the air");
}

std::optional<Station> Find(const Address& address) {
  const auto stations = ListedStations();
  const auto found = std::ranges::find(stations, address, &Station::address);
  return found != stations.end() ? std::optional(*found) : std::nullopt;
}

// The daemon's own socket for each interface takes addresses in small letters too.
void TellToLeave(const Station& station, const std::string& address) {
  constexpr std::chrono::seconds kPatience{5};
  const std::string socket = std::string(kHostapdControlDirectory) + "/" + station.interface;
  const auto answer = AskDaemon(socket, "DEAUTHENTICATE " + address, kPatience);
  if (!answer) throw Failed("the access-point daemon does not answer on " + socket);
  if (*answer != "OK") throw Failed("the access-point daemon does not send the station away");
}

// It may have come back already: then the kernel tells of another stay.
bool IsGone(const Station& station) {
  const auto now = Find(station.address);
  return !now || !now->isLetIn || now->associatedAt != station.associatedAt || now->since > station.since + 1;
}

bool IsGoneSoon(const Station& station) {
  constexpr std::chrono::milliseconds kPause{50};
  constexpr std::chrono::seconds kPatience{5};
  return Await(kPatience, kPause, [&] { return IsGone(station); });
}

}  // namespace

void ShowStations(const Program& program) {
  RequireAccessPoint();
  program.output.List("stations", StationFields(), ListedStations(), "no station is on the access point");
}

void KickStation(const Program& program, const std::string& address) {
  const auto wanted = ParseAddress(address);
  if (!wanted) throw Wrong("this is no station's address", "write it as `merowireless ap stations` shows it");
  RequireAccessPoint();
  const auto station = Find(*wanted);
  if (!station) {
    throw Failed("no station of this address is on the access point",
                 "`merowireless ap stations` lists those that are");
  }
  TellToLeave(*station, address);
  if (!IsGoneSoon(*station)) throw Failed("the station was told to leave, and is on the access point still");
  const std::string name = station->name.empty() ? address : program.output.Name(station->name) + " (" + address + ")";
  program.output.Done(name + " has left the access point; it may come back by itself", "station", StationFields(),
                      *station);
}
