// The stations of the access point, by the kernel, and what they have leased.
#include "model/stations.h"

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <system_error>

#include "base/clock.h"
#include "common/paths.h"
#include "model/attributes.h"
#include "model/leases.h"
#include "model/wireless_stack.h"
#include "wireless.h"

namespace {

// ---- By the kernel ----

std::chrono::nanoseconds Now(clockid_t clock) {
  timespec now{};
  ::clock_gettime(clock, &now);
  return std::chrono::seconds(now.tv_sec) + std::chrono::nanoseconds(now.tv_nsec);
}

// When it has come, by the clock on the wall. The kernel tells how long ago that is in whole seconds, or by the
// machine's own clock, so that each look gives the same.
std::time_t SinceOf(const Station& station, std::optional<std::uint32_t> seconds) {
  if (station.associatedAt != 0) {
    const auto ago = Now(CLOCK_BOOTTIME) - std::chrono::nanoseconds(station.associatedAt);
    return std::chrono::system_clock::to_time_t(std::chrono::system_clock::time_point(
        std::chrono::duration_cast<std::chrono::seconds>(Now(CLOCK_REALTIME) - ago)));
  }
  return seconds ? std::time(nullptr) - static_cast<std::time_t>(*seconds) : 0;
}

// A driver that does not tell has let it in.
bool IsLetIn(std::optional<nl80211_sta_flag_update> flags) {
  constexpr auto kLetIn = 1U << NL80211_STA_FLAG_AUTHORIZED;
  return !flags || (flags->mask & kLetIn) == 0 || (flags->set & kLetIn) != 0;
}

// A driver may count in 32 bits, or not at all.
std::optional<std::int64_t> BytesIn(const Nest<NL80211_STA_INFO_MAX>& facts, int all, int low) {
  if (const auto bytes = facts.As<std::int64_t>(all)) return bytes;
  return facts.As<std::uint32_t>(low);
}

std::optional<Station> StationIn(std::string& message) {
  const auto address = ValueIn<Address>(AttributeOf(message, NL80211_ATTR_MAC));
  if (!address) return std::nullopt;
  const Nest<NL80211_STA_INFO_MAX> facts(AttributeOf(message, NL80211_ATTR_STA_INFO));
  Station station;
  station.address = *address;
  station.isLetIn = IsLetIn(facts.As<nl80211_sta_flag_update>(NL80211_STA_INFO_STA_FLAGS));
  station.signal = facts.As<std::int8_t>(NL80211_STA_INFO_SIGNAL);
  station.received = BytesIn(facts, NL80211_STA_INFO_RX_BYTES64, NL80211_STA_INFO_RX_BYTES);
  station.sent = BytesIn(facts, NL80211_STA_INFO_TX_BYTES64, NL80211_STA_INFO_TX_BYTES);
  station.associatedAt = facts.As<std::uint64_t>(NL80211_STA_INFO_ASSOC_AT_BOOTTIME).value_or(0);
  station.since = SinceOf(station, facts.As<std::uint32_t>(NL80211_STA_INFO_CONNECTED_TIME));
  return station;
}

std::optional<std::vector<Station>> StationsOn(const std::string& interface) {
  auto messages = AskForStations(interface);
  if (!messages) return std::nullopt;
  std::vector<Station> stations;
  for (std::string& message : *messages) {
    auto station = StationIn(message);
    if (!station) continue;
    station->interface = interface;
    stations.push_back(*std::move(station));
  }
  std::ranges::sort(stations, {}, &Station::address);
  return stations;
}

// ---- By their leases ----

// The bridge that an interface is in; empty when it is in none.
std::string BridgeOf(const std::string& interface) {
  std::error_code error;
  return std::filesystem::read_symlink("/sys/class/net/" + interface + "/master", error).filename();
}

void AddLeases(std::vector<Station>& stations, const std::string& interface) {
  const auto leases = LeasesOf(BridgeOf(interface));
  for (Station& station : stations) {
    const auto lease = std::ranges::find(leases, station.address, &Lease::address);
    if (lease == leases.end()) continue;
    station.ip = lease->ip;
    station.name = lease->name;
  }
}

// ---- As they are shown ----

// A size in four characters at most, such as "340k".
std::string ShortText(std::int64_t bytes) {
  constexpr std::string_view kUnits = "kMGTPE";
  constexpr std::int64_t kThousand = 1000;
  if (bytes < kThousand) return std::to_string(bytes);
  std::size_t unit = 0;
  while (bytes >= kThousand * kThousand) {
    bytes /= kThousand;
    ++unit;
  }
  std::string text = std::to_string(bytes / kThousand);
  if (bytes < 10 * kThousand) text.append(1, '.').append(std::to_string(bytes % kThousand / 100));
  return text + kUnits[unit];
}

Shown ShowSize(std::optional<std::int64_t> bytes) {
  return bytes ? Shown{ShortText(*bytes)} : Shown{"-", Tone::kFaint};
}

Value ValueOf(std::optional<std::int64_t> number) {
  return number ? Value(*number) : nullptr;
}

// A duration in its greatest unit, such as "5 min".
std::string ShortDuration(std::time_t seconds) {
  constexpr std::time_t kMinute = 60, kHour = 60 * kMinute, kDay = 24 * kHour;
  if (seconds < kMinute) return std::to_string(seconds) + " s";
  if (seconds < kHour) return std::to_string(seconds / kMinute) + " min";
  return seconds < kDay ? std::to_string(seconds / kHour) + " h" : std::to_string(seconds / kDay) + " d";
}

Shown ShowSince(const Station& station, bool) {
  if (!station.isLetIn) return {"joining", Tone::kFair};
  if (station.since == 0) return {"-", Tone::kFaint};
  return {ShortDuration(std::time(nullptr) - station.since)};
}

constexpr Field<Station> kFields[] = {
    {"name", "NAME", [](const Station& of) { return Value(of.name); }, Layout::kElastic},
    {"address", "ADDRESS", [](const Station& of) { return Value(AddressText(of.address)); }},
    {"ip", "IP", [](const Station& of) { return Value(of.ip); }},
    {"signal", "SIGNAL", [](const Station& of) { return of.signal ? Value(std::int64_t{*of.signal}) : nullptr; },
     Layout::kRight},
    {"rx_bytes", "FROM", [](const Station& of) { return ValueOf(of.received); }, Layout::kRight,
     [](const Station& of, bool) { return ShowSize(of.received); }},
    {"tx_bytes", "TO", [](const Station& of) { return ValueOf(of.sent); }, Layout::kRight,
     [](const Station& of, bool) { return ShowSize(of.sent); }},
    {"since", "FOR", [](const Station& of) { return of.since != 0 ? Value(UtcText(of.since)) : nullptr; },
     Layout::kLeft, ShowSince},
    {"guest", "GUEST", [](const Station& of) { return Value(of.isGuest()); }, Layout::kLeft,
     [](const Station& of, bool) { return of.isGuest() ? Shown{"yes"} : Shown{"-", Tone::kFaint}; }},
    {"state", "", [](const Station& of) { return Value(of.isLetIn ? "joined" : "joining"); }},
};

}  // namespace

bool Station::isGuest() const {
  return interface == kGuestInterface;
}

std::optional<std::vector<Station>> Stations() {
  std::vector<Station> all;
  for (const std::string& interface : {std::string(MEROWirelessAPInterfaceGet()), std::string(kGuestInterface)}) {
    auto stations = StationsOn(interface);
    if (!stations) return std::nullopt;
    AddLeases(*stations, interface);
    all.insert(all.end(), stations->begin(), stations->end());
  }
  return all;
}

std::optional<int> CountStations() {
  const auto stations = Stations();
  if (!stations) return std::nullopt;
  return static_cast<int>(std::ranges::count_if(*stations, &Station::isLetIn));
}

std::span<const Field<Station>> StationFields() {
  return kFields;
}
