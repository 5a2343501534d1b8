#include "appliance/sbin/elements.h"

#include <algorithm>
#include <iterator>
#include <optional>

namespace iwlist {
namespace {

enum ElementId : std::uint8_t {
  kSsid = 0,
  kSupportedRates = 1,
  kHtCapabilities = 45,
  kRsn = 48,
  kExtendedRates = 50,
  kVendorSpecific = 221,
};

constexpr std::size_t kElementHeaderSize = 2;
constexpr std::size_t kMaxNameSize = 32;
constexpr std::size_t kHtCapabilitiesSize = 26;
constexpr unsigned kCapabilityPrivacy = 0x0010;

// Shows each element to `visit`; false when the bytes do not end where an element does.
template <class Visitor>
bool ForEachElement(Bytes bytes, Visitor visit) {
  while (bytes.size() >= kElementHeaderSize) {
    const std::size_t size = bytes[1];
    if (size > bytes.size() - kElementHeaderSize) return false;
    visit(bytes[0], bytes.subspan(kElementHeaderSize, size));
    bytes = bytes.subspan(kElementHeaderSize + size);
  }
  return bytes.empty();
}

// ---- Name

std::string NameOf(Bytes body) {
  const bool hidden = std::ranges::all_of(body, [](std::uint8_t byte) { return byte == 0; });
  if (hidden || body.size() > kMaxNameSize) return {};
  return {body.begin(), body.end()};
}

// ---- Radio standard

enum Standard : unsigned { kA = 1, kB = 2, kG = 4, kN = 8 };

struct Protocol {
  unsigned standards;
  WIRELESS_PROTOCOL protocol;
};

// Everything that one network can offer: no network is on two bands.
constexpr Protocol kProtocols[] = {
    {kB, WIRELESS_PROTO_LEGACY_11B}, {kG, WIRELESS_PROTO_LEGACY_11G}, {kB | kG, WIRELESS_PROTO_LEGACY_11BG},
    {kB | kN, WIRELESS_PROTO_11BN},  {kG | kN, WIRELESS_PROTO_11GN},  {kB | kG | kN, WIRELESS_PROTO_11BGN},
    {kA, WIRELESS_PROTO_LEGACY_11A}, {kA | kN, WIRELESS_PROTO_11AN},  {kN, WIRELESS_PROTO_11N},
};

WIRELESS_PROTOCOL ProtocolOf(unsigned standards) {
  const auto* found = std::ranges::find(kProtocols, standards, &Protocol::standards);
  return found == std::end(kProtocols) ? WIRELESS_PROTO_UNKNOWN : found->protocol;
}

// The standards that the rates of a band stand for: the same rate is 802.11g in one band and 802.11a in the other.
struct Band {
  unsigned dsss;
  unsigned ofdm;
  unsigned ht;
};

Band BandOf(unsigned megahertz) {
  if (megahertz >= 2400 && megahertz < 2500) return {.dsss = kB, .ofdm = kG, .ht = kN};
  if (megahertz >= 4900 && megahertz < 5925) return {.dsss = 0, .ofdm = kA, .ht = kN};
  return {};
}

// The standards of a rates element: one rate a byte, in units of 500 kb/s. Other values are no rates but conditions
// for joining.
unsigned StandardsOf(Bytes rates, const Band& band) {
  constexpr std::uint8_t kMandatory = 0x80;
  constexpr std::uint8_t kDsssRates[] = {2, 4, 11, 22};
  constexpr std::uint8_t kOfdmRates[] = {12, 18, 24, 36, 48, 72, 96, 108};

  unsigned standards = 0;
  for (const std::uint8_t byte : rates) {
    const int rate = byte & ~kMandatory;
    if (std::ranges::find(kDsssRates, rate) != std::end(kDsssRates)) standards |= band.dsss;
    if (std::ranges::find(kOfdmRates, rate) != std::end(kOfdmRates)) standards |= band.ofdm;
  }
  return standards;
}

// ---- Security

constexpr std::size_t kOuiSize = 3;
constexpr std::size_t kSuiteSize = kOuiSize + 1;

enum CipherType : std::uint8_t { kCipherOfGroup = 0, kCipherTkip = 2, kCipherCcmp = 4 };
enum KeyType : std::uint8_t { kKeyNone = 0, kKeyEap = 1, kKeyPsk = 2 };

// WPA and its successor say the same things in the same form, each in suites of its own. Key types that the client
// would not be configured for (SAE, fast transition, ...) are unknown.
struct Generation {
  std::uint8_t oui[kOuiSize];
  WIRELESS_ENCRYPT defaultCipher;
  WIRELESS_AUTH none, eap, psk;
};

constexpr Generation kWpa = {
    {0x00, 0x50, 0xF2}, WIRELESS_ENCRYPT_TKIP, WIRELESS_AUTH_WPANONE, WIRELESS_AUTH_WPAEAP, WIRELESS_AUTH_WPAPSK};
constexpr Generation kWpa2 = {
    {0x00, 0x0F, 0xAC}, WIRELESS_ENCRYPT_AES, WIRELESS_AUTH_UNKNOWN, WIRELESS_AUTH_WPA2EAP, WIRELESS_AUTH_WPA2PSK};

// The first bytes of a WPA element, which tell it from other vendor-specific elements.
constexpr std::uint8_t kWpaPrefix[] = {0x00, 0x50, 0xF2, 0x01};

bool IsWpa(Bytes body) {
  return body.size() >= std::size(kWpaPrefix) && std::ranges::equal(body.first(std::size(kWpaPrefix)), kWpaPrefix);
}

WIRELESS_ENCRYPT operator|(WIRELESS_ENCRYPT left, WIRELESS_ENCRYPT right) {
  return static_cast<WIRELESS_ENCRYPT>(static_cast<int>(left) | static_cast<int>(right));
}

// Takes the fields of a WPA or RSN element from front to back. A sender may leave fields off the end, which come out
// empty. An element with a field that is cut short is not used at all.
class SuiteReader {
 public:
  explicit SuiteReader(Bytes bytes) : rest_(bytes) {}

  unsigned Number() {
    const Bytes bytes = Take(2);
    return bytes.empty() ? 0U : bytes[0] | static_cast<unsigned>(bytes[1]) << 8;
  }
  Bytes Suite() { return rest_.empty() ? Bytes() : Take(kSuiteSize); }
  Bytes SuiteList() { return rest_.empty() ? Bytes() : Take(Number() * kSuiteSize); }
  [[nodiscard]] bool Whole() const { return whole_; }

 private:
  Bytes Take(std::size_t size) {
    whole_ = whole_ && size <= rest_.size();
    if (!whole_) return {};
    const Bytes taken = rest_.first(size);
    rest_ = rest_.subspan(size);
    return taken;
  }

  Bytes rest_;
  bool whole_ = true;
};

bool Lists(Bytes suites, const Generation& generation, std::uint8_t type) {
  for (; suites.size() >= kSuiteSize; suites = suites.subspan(kSuiteSize)) {
    if (std::ranges::equal(suites.first(kOuiSize), generation.oui) && suites[kOuiSize] == type) return true;
  }
  return false;
}

WIRELESS_ENCRYPT CiphersOf(Bytes pairwise, Bytes group, const Generation& generation) {
  if (pairwise.empty()) return generation.defaultCipher;
  const bool asGroup = Lists(pairwise, generation, kCipherOfGroup);
  const auto offers = [&](CipherType type) {
    return Lists(pairwise, generation, type) || (asGroup && Lists(group, generation, type));
  };
  const WIRELESS_ENCRYPT tkip = offers(kCipherTkip) ? WIRELESS_ENCRYPT_TKIP : WIRELESS_ENCRYPT_UNKNOWN;
  const WIRELESS_ENCRYPT aes = offers(kCipherCcmp) ? WIRELESS_ENCRYPT_AES : WIRELESS_ENCRYPT_UNKNOWN;
  return tkip | aes;
}

// The authentication of a network that offers several: the one that asks least of the user.
WIRELESS_AUTH AuthOf(Bytes keys, const Generation& generation) {
  if (Lists(keys, generation, kKeyPsk)) return generation.psk;
  if (keys.empty() || Lists(keys, generation, kKeyEap)) return generation.eap;
  if (Lists(keys, generation, kKeyNone)) return generation.none;
  return WIRELESS_AUTH_UNKNOWN;
}

// What a WPA or RSN element announces.
struct Announced {
  Security security;
  Bytes keys;
  bool protectsFrames = false;  // those of management; whoever does not is kept out

  // Whether the client can be configured for it.
  bool IsUsable() const {
    return security.auth != WIRELESS_AUTH_UNKNOWN && security.auth != WIRELESS_AUTH_WPANONE &&
           security.encrypt != WIRELESS_ENCRYPT_UNKNOWN && !protectsFrames;
  }
};

// From its version on. WPA has no word for the protection of frames.
Announced AnnouncedBy(Bytes body, const Generation& generation) {
  constexpr unsigned kFramesAreProtected = 0x0040;
  SuiteReader reader(body);
  const unsigned version = reader.Number();
  const Bytes group = reader.Suite();
  const Bytes pairwise = reader.SuiteList();
  const Bytes keys = reader.SuiteList();
  if (!reader.Whole() || version != 1) return {};
  const bool protectsFrames = &generation == &kWpa2 && (reader.Number() & kFramesAreProtected) != 0;
  return {{AuthOf(keys, generation), CiphersOf(pairwise, group, generation)}, keys, protectsFrames};
}

// The key types that tell what a network is that cannot be joined, those that tell most first.
struct KeyOfObstacle {
  std::uint8_t type;
  Obstacle obstacle;
};

constexpr KeyOfObstacle kKeysOfObstacles[] = {
    {8, Obstacle::kWpa3},           {9, Obstacle::kWpa3},    {24, Obstacle::kWpa3},
    {25, Obstacle::kWpa3},          {18, Obstacle::kOwe},    {12, Obstacle::kWpa3Eap192},
    {13, Obstacle::kWpa3Eap192},    {5, Obstacle::kWpa3Eap}, {3, Obstacle::kFastTransition},
    {4, Obstacle::kFastTransition}, {6, Obstacle::kSha256},
};

Obstacle ObstacleOf(const Announced& rsn) {
  if (rsn.IsUsable()) return Obstacle::kNone;
  for (const auto& [type, obstacle] : kKeysOfObstacles) {
    if (Lists(rsn.keys, kWpa2, type)) return obstacle;
  }
  if (rsn.security.auth == WIRELESS_AUTH_UNKNOWN) return Obstacle::kUnknown;
  return rsn.protectsFrames ? Obstacle::kProtectedFrames : Obstacle::kCiphers;
}

// A network that offers both generations is joined by the newer one with the ciphers of either.
Security Combine(const Security& wpa, const Security& wpa2) {
  if (wpa.auth == WIRELESS_AUTH_UNKNOWN) return wpa2;
  if (wpa2.auth == WIRELESS_AUTH_UNKNOWN) return wpa;
  return {wpa2.auth, wpa.encrypt | wpa2.encrypt};
}

// The security that the elements of one network announce.
struct SecurityElements {
  std::optional<Announced> wpa;
  std::optional<Announced> wpa2;
  bool allRead = false;
};

Security SecurityOf(const SecurityElements& elements, unsigned capability) {
  if (elements.wpa && elements.wpa2) return Combine(elements.wpa->security, elements.wpa2->security);
  if (elements.wpa2) return elements.wpa2->security;
  if (elements.wpa) return elements.wpa->security;
  if ((capability & kCapabilityPrivacy) == 0) return {WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE};
  // The element that says WPA may be among those that could not be read.
  if (!elements.allRead) return {};
  return {WIRELESS_AUTH_SHARED, WIRELESS_ENCRYPT_WEP};
}

// A network with WPA beside what cannot be joined is joined by WPA. What only WPA or a cell announces is as it has
// always been.
Obstacle ObstacleOf(const SecurityElements& elements) {
  const bool byWpa = elements.wpa && elements.wpa->IsUsable();
  return elements.wpa2 && !byWpa ? ObstacleOf(*elements.wpa2) : Obstacle::kNone;
}

}  // namespace

Description Describe(Bytes elements, unsigned capability, unsigned megahertz) {
  const Band band = BandOf(megahertz);
  std::optional<std::string> name;
  unsigned standards = 0;
  SecurityElements security;

  security.allRead = ForEachElement(elements, [&](std::uint8_t id, Bytes body) {
    switch (id) {
      case kSsid:
        if (!name) name = NameOf(body);
        break;
      case kSupportedRates:
      case kExtendedRates:
        standards |= StandardsOf(body, band);
        break;
      case kHtCapabilities:
        if (body.size() >= kHtCapabilitiesSize) standards |= band.ht;
        break;
      case kRsn:
        if (!security.wpa2) security.wpa2 = AnnouncedBy(body, kWpa2);
        break;
      case kVendorSpecific:
        if (IsWpa(body) && !security.wpa) security.wpa = AnnouncedBy(body.subspan(std::size(kWpaPrefix)), kWpa);
        break;
      default:  // tells nothing that is listed
        break;
    }
  });
  return {name.value_or(""), ProtocolOf(standards), SecurityOf(security, capability), ObstacleOf(security)};
}

}  // namespace iwlist
