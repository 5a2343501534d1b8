// The known networks: whatever the file holds, each section is a network whose texts end and whose times are in order;
// a network that is saved is read back and takes nothing from the others, or is refused and nothing is written.
//
// Runs: 6000
// Covers: platform/core/known_network.cpp platform/core/radio_texts.cpp lib/obsolete/known_networks.cpp
// Covers: lib/obsolete/wireless_conf_set.cpp lib/obsolete/wireless_conf_enum.cpp
// Covers: lib/obsolete/wireless_conf_enum_by_atime.cpp
#include <strings.h>

#include <algorithm>
#include <array>
#include <functional>
#include <numeric>
#include <string>
#include <vector>

#include "common/paths.h"
#include "platform.h"
#include "tests/fuzz/support.h"
#include "tests/support/ring.h"

namespace {

using Config = WIRELESS_NETWORK_CONFIG;

// What a section keeps of a network.
bool Same(const Config& a, const Config& b) {
  const auto texts = [](const Config& of) {
    return std::array{EndedText(of.szKey), EndedText(of.szIp), EndedText(of.szMask), EndedText(of.szGateway),
                      EndedText(of.network.szEssid)};
  };
  return texts(a) == texts(b) && std::ranges::equal(a.network.bssid, b.network.bssid) &&
         a.network.opmode == b.network.opmode && a.network.auth == b.network.auth &&
         a.network.encrypt == b.network.encrypt;
}

bool SameWithTime(const Config& a, const Config& b) {
  return Same(a, b) && a.atime == b.atime;
}

std::vector<Config> Known(int (*enumerate)(WIRELESS_LIST*)) {
  Ring<Config> ring;
  Require(enumerate(ring.head()) == 0, "the known networks are listed");
  std::vector<Config> known;
  ring.ForEach([&](const Config& config) { known.push_back(config); });
  return known;
}

std::string SectionOf(const Config& config) {
  char szName[sizeof "00:00:00:00:00:00"];
  return MEROWirelessBssidStringGet(config.network.bssid, szName, sizeof szName);
}

// The order of the file, and among equal times that one too.
std::vector<Config> KnownInOrder(const std::string& text) {
  std::vector<Config> known = Known(MEROWirelessConfEnum);
  std::vector<Config> byTime = known;
  std::ranges::stable_sort(byTime, std::greater{}, &Config::atime);
  Require(std::ranges::equal(Known(MEROWirelessConfEnumByAtime), byTime, SameWithTime),
          "the most recently saved network comes first", {text});
  return known;
}

// A network as a caller gives it.
Config Taken(Fields& fields) {
  Config config{};
  char szBssid[sizeof config.network.bssid] = {};
  fields.Fill(szBssid);
  std::ranges::copy(szBssid, config.network.bssid);
  fields.FillEnded(config.szKey);
  fields.FillEnded(config.szIp);
  fields.FillEnded(config.szMask);
  fields.FillEnded(config.szGateway);
  fields.FillEnded(config.network.szEssid);
  config.network.opmode = static_cast<WIRELESS_OPMODE>(fields.Number());
  config.network.auth = static_cast<WIRELESS_AUTH>(fields.Number());
  config.network.encrypt = static_cast<WIRELESS_ENCRYPT>(fields.Number());
  return config;
}

// What becomes of values that no text stands for.
Config AsKept(Config config) {
  WIRELESS_NETWORK& network = config.network;
  if (network.opmode < WIRELESS_OPMODE_AUTO || network.opmode >= WIRELESS_OPMODE_MAX) {
    network.opmode = WIRELESS_OPMODE_UNKNOWN;
  }
  if (network.auth < WIRELESS_AUTH_UNKNOWN || network.auth > WIRELESS_AUTH_WPA2EAP)
    network.auth = WIRELESS_AUTH_UNKNOWN;
  constexpr int kKept[] = {WIRELESS_ENCRYPT_NONE, WIRELESS_ENCRYPT_WEP, WIRELESS_ENCRYPT_TKIP, WIRELESS_ENCRYPT_AES,
                           WIRELESS_ENCRYPT_TKIP | WIRELESS_ENCRYPT_AES};
  if (std::ranges::find(kKept, network.encrypt) == std::end(kKept)) network.encrypt = WIRELESS_ENCRYPT_UNKNOWN;
  return config;
}

// How many sections have a name. The first one is read for all of them.
std::size_t CountOf(const std::string& name) {
  PPLIBSZLIST names = PLIBCSzListAlloc(64);
  Require(PLIBCFileEnumSection(kKnownNetworksPath, &names) >= 0, "the sections are listed");
  std::size_t count = 0;
  for (int i = 0; i < names->nItem; ++i) count += ::strcasecmp(PLIBCSzListGet(names, i), name.c_str()) == 0 ? 1 : 0;
  PLIBCSzListFree(names);
  return count;
}

void CheckSaved(const Config& config, std::size_t count, const std::vector<Config>& before, const std::string& text) {
  const std::string content = FileAt(kKnownNetworksPath).value_or("");
  Config saved;
  Require(MEROWirelessConfGet(SectionOf(config).c_str(), &saved) == 0 && Same(saved, AsKept(config)),
          "a network that is saved is read back", {text, content});
  const std::vector<Config> after = KnownInOrder(content);
  Require(after.size() == before.size() + (count > 0 ? 0 : 1), "a network is saved once", {text, content});
  const auto others = std::inner_product(before.begin(), before.end(), after.begin(), std::size_t{0}, std::plus{},
                                         [](const Config& a, const Config& b) { return SameWithTime(a, b); });
  Require(before.size() - others <= count, "other networks stay", {text, content});
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Fields fields(data, size);
  const Config config = Taken(fields);
  const std::string text = fields.Rest();
  PutFile(kKnownNetworksPath, text);
  const std::vector<Config> before = KnownInOrder(text);

  const std::size_t count = CountOf(SectionOf(config));
  if (MEROWirelessConfSet(&config) == 0) {
    CheckSaved(config, count, before, text);
  } else {
    Require(FileAt(kKnownNetworksPath) == text, "what is refused leaves the file as it is", {text});
  }
  return 0;
}
