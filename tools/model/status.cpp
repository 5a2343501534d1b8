// What is known about the connection at this moment.
#include "model/status.h"

#include <arpa/inet.h>
#include <ifaddrs.h>

#include <algorithm>
#include <cstring>
#include <fstream>
#include <memory>

#include "base/clock.h"
#include "base/failure.h"
#include "base/whole_file.h"
#include "common/paths.h"
#include "model/ap_state.h"
#include "model/library.h"
#include "model/security.h"
#include "model/supplicant_settings.h"
#include "platform.h"

namespace {

struct State {
  const char* szKey;
  const char* szText;
  WIRELESS_STATUS value;
  Tone tone;
};

constexpr State kStates[] = {
    {"unknown", "unknown", WIRELESS_STATUS_UNKNOWN, Tone::kBad},
    {"not-supported", "the adapter's driver cannot tell", WIRELESS_STATUS_NOT_SUPPORTED, Tone::kBad},
    {"no-adapter", "no adapter is plugged in", WIRELESS_STATUS_NO_ADAPTER, Tone::kBad},
    {"down", "not connected (the interface is down)", WIRELESS_STATUS_DOWN, Tone::kFair},
    {"disconnected", "not connected", WIRELESS_STATUS_DISCONNECTED, Tone::kFair},
    {"connected", "connected", WIRELESS_STATUS_CONNECTED_MANAGED, Tone::kGood},
    {"connected-adhoc", "connected to an ad-hoc cell", WIRELESS_STATUS_CONNECTED_ADHOC, Tone::kGood},
    {"monitor", "monitoring", WIRELESS_STATUS_MONITOR, Tone::kFair},
};

// The library gives no state for an adapter that is an access point, since that has no connection.
constexpr State kAccessPoint = {"access-point", "an access point (see `merowireless ap status`)",
                                WIRELESS_STATUS_UNKNOWN, Tone::kGood};

// To the library, and to the driver, it is connected.
constexpr State kJoining = {"joining", "joining (the access point has not let it in yet)",
                            WIRELESS_STATUS_CONNECTED_MANAGED, Tone::kFair};

const State& StateOf(const Status& status) {
  if (status.isAccessPoint) return kAccessPoint;
  if (status.isConnected() && !status.isLetIn) return kJoining;
  const auto* found = std::ranges::find(kStates, status.state, &State::value);
  return found != std::end(kStates) ? *found : kStates[0];
}

Value AuthOf(const Status& status) {
  return status.isConnected() ? Value(MEROWirelessAuthStringGet(status.auth)) : nullptr;
}

Shown ShowAuth(const Status& status, bool) {
  if (!status.isConnected()) return {"-", Tone::kFaint};
  return {SecurityText(status.auth, WIRELESS_ENCRYPT_UNKNOWN)};
}

Value StandardOf(const Status& status) {
  return status.isConnected() ? Value(MEROWirelessProtocolStringGet(status.protocol)) : nullptr;
}

// The standard is unknown when a network was joined as it was saved: only a scan tells it.
Shown ShowStandard(const Status& status, bool) {
  if (!status.isConnected() || status.protocol == WIRELESS_PROTO_UNKNOWN) return {"-", Tone::kFaint};
  return {MEROWirelessProtocolStringGet(status.protocol)};
}

// ---- The link ----

std::string RateText(int kilobits) {
  const std::string tenths = std::to_string(kilobits % 1000 / 100);
  return std::to_string(kilobits / 1000) + (tenths == "0" ? "" : "." + tenths) + " Mbit/s";
}

template <auto Link::* member>
Value OfLink(const Status& status) {
  const auto& held = status.link.*member;
  if constexpr (requires { held.empty(); })
    return held.empty() ? nullptr : Value(held);
  else
    return held ? Value(std::int64_t{*held}) : nullptr;
}

Shown ShowSignal(const Status& status, bool) {
  const auto signal = status.link.signal;
  if (!signal) return {"-", Tone::kFaint};
  return {std::to_string(*signal) + " dBm", *signal >= -70 ? Tone::kGood : *signal >= -85 ? Tone::kFair : Tone::kBad};
}

Shown ShowRate(const Status& status, bool) {
  return status.link.rate ? Shown{RateText(*status.link.rate)} : Shown{"-", Tone::kFaint};
}

Value SinceOf(const Status& status) {
  return status.link.since ? Value(UtcText(*status.link.since)) : nullptr;
}

Shown ShowSince(const Status& status, bool) {
  return status.link.since ? Shown{LocalText(*status.link.since, "%F %T")} : Shown{"-", Tone::kFaint};
}

// ---- All of it ----

constexpr Field<Status> kStatusFields[] = {
    {"state", "status", [](const Status& of) { return Value(StateOf(of).szKey); }, Layout::kLeft,
     [](const Status& of, bool) { return Shown{StateOf(of).szText, StateOf(of).tone}; }},
    {"name", "network", [](const Status& of) { return of.isConnected() ? Value(of.name) : nullptr; }},
    {"auth", "security", AuthOf, Layout::kLeft, ShowAuth},
    {"standard", "standard", StandardOf, Layout::kLeft, ShowStandard},
    {"mode", "",
     [](const Status& of) { return of.isConnected() ? Value(MEROWirelessOpmodeStringGet(of.mode)) : nullptr; }},
    {"interface", "interface", [](const Status& of) { return Value(of.interface); }},
    {"ip", "address", [](const Status& of) { return of.ip.empty() ? nullptr : Value(of.ip); }},
    {"mask", "netmask", [](const Status& of) { return of.mask.empty() ? nullptr : Value(of.mask); }},
    {"radio", "radio", [](const Status& of) { return Value(WordOf(of.radio)); }},
    {"name_hex", "", [](const Status& of) { return IsUtf8(of.name) ? Value(nullptr) : Value(Hex(of.name)); }},
    {"access_point", "access point", OfLink<&Link::accessPoint>},
    {"signal_dbm", "signal", OfLink<&Link::signal>, Layout::kLeft, ShowSignal},
    {"channel", "channel", OfLink<&Link::channel>},
    {"rate_kbps", "rate", OfLink<&Link::rate>, Layout::kLeft, ShowRate},
    {"gateway", "gateway", OfLink<&Link::gateway>},
    {"name_servers", "name servers", OfLink<&Link::nameServers>},
    {"since", "since", SinceOf, Layout::kLeft, ShowSince},
};

std::string DottedText(const sockaddr* address) {
  char szText[INET_ADDRSTRLEN] = "";
  if (address == nullptr) return szText;
  ::inet_ntop(AF_INET, &reinterpret_cast<const sockaddr_in*>(address)->sin_addr, szText, sizeof szText);
  return szText;
}

void ReadAddress(Status& status) {
  ifaddrs* first = nullptr;
  if (::getifaddrs(&first) < 0) return;  // the address stays unknown
  const std::unique_ptr<ifaddrs, void (*)(ifaddrs*)> list(first, ::freeifaddrs);
  for (const ifaddrs* each = first; each != nullptr; each = each->ifa_next) {
    if (each->ifa_addr == nullptr || each->ifa_addr->sa_family != AF_INET || status.interface != each->ifa_name)
      continue;
    status.ip = DottedText(each->ifa_addr);
    status.mask = DottedText(each->ifa_netmask);
    return;
  }
}

// A station that the access point has not let in yet is "dormant", and for a moment before the kernel has followed it
// is still "down".
bool IsLetIn(const std::string& interface) {
  std::ifstream file("/sys/class/net/" + interface + "/operstate");
  std::string state;
  return !(file >> state) || (state != "dormant" && state != "down");
}

// Asks the library one thing about the connection; without an answer `answer` stays as it is.
template <class Answer>
void Ask(WIRELESS_REQUEST request, Answer WIRELESS_INFO::* member, Answer& answer) {
  WIRELESS_INFO info{};
  if (MEROWirelessCurInfoGet(request, &info) == 0) answer = info.*member;
}

// The library has noted it of the access point that it joined. The supplicant, which may be with another one of the
// network by now, has it as it was saved.
WIRELESS_AUTH AuthOfSupplicant(const std::string& name) {
  const auto given = ConfiguredNetwork(TextOfFile(kSupplicantConfigPath).value_or(""));
  if (!given || name != given->network.szEssid) return WIRELESS_AUTH_UNKNOWN;
  try {
    for (const KnownNetwork& known : AllCalled(name)) {
      const bool isSame =
          known.network.encrypt == given->network.encrypt && std::strcmp(known.szKey, given->szKey) == 0;
      if (isSame) return known.network.auth;
    }
  } catch (const Failure&) {  // NOLINT(bugprone-empty-catch)
    // The known networks cannot be read: the supplicant's settings tell all but the kind of WPA.
  }
  return given->network.auth;
}

}  // namespace

Status ReadStatus() {
  Status status;
  status.state = MEROWirelessConnStatusGet();
  status.interface = MEROWirelessInterfaceGet();
  status.radio = ReadRadio().state;
  ReadAddress(status);
  status.isAccessPoint = !status.isConnected() && IsAccessPoints();
  if (!status.isConnected()) return status;

  status.isLetIn = IsLetIn(status.interface);
  const bool isCell = status.state == WIRELESS_STATUS_CONNECTED_ADHOC;
  status.link = LinkOf(status.interface, isCell ? LinkTo::kCell : LinkTo::kAccessPoint);
  WIRELESS_INFO info{};
  if (MEROWirelessCurInfoGet(REQUEST_ESSID, &info) == 0) status.name = info.szEssid;
  Ask(REQUEST_AUTH, &WIRELESS_INFO::auth, status.auth);
  if (status.auth == WIRELESS_AUTH_UNKNOWN) status.auth = AuthOfSupplicant(status.name);
  Ask(REQUEST_PROTOCOL, &WIRELESS_INFO::protocol, status.protocol);
  Ask(REQUEST_MODE, &WIRELESS_INFO::opmode, status.mode);
  return status;
}

std::span<const Field<Status>> StatusFields() {
  return kStatusFields;
}

std::string ConnectionText(const Output& output, const Status& status) {
  return "connected to " + output.Name(status.name) + (status.ip.empty() ? " without an address" : " as " + status.ip);
}
