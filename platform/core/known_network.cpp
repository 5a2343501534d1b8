// Reading one known network.
#include <algorithm>
#include <cstring>

#include "common/clock.h"
#include "common/known_networks_file.h"
#include "common/paths.h"
#include "common/text.h"
#include "platform/base/failure.h"
#include "platform/core/radio_texts.h"
#include "platform/core/section_text.h"
#include "platform/core/settings_file.h"
#include "platform/core/text_list.h"

namespace {

// The seconds that a text gives: the nearest time of 32 bits, and 0 when the text is no number.
int32_t ParseTime(std::string_view text) {
  constexpr int64_t kMany = int64_t{1} << 40;
  const bool negative = text.starts_with('-');
  if (negative) text.remove_prefix(1);
  if (text.empty()) return 0;
  int64_t seconds = 0;
  for (const char c : text) {
    if (c < '0' || c > '9') return 0;
    seconds = std::min(10 * seconds + (c - '0'), kMany);
  }
  return SaturatedTime(negative ? -seconds : seconds);
}

void TakeBssid(std::string_view text, WIRELESS_NETWORK& network) {
  const Bssid bssid = ParseBssid(text).value_or(Bssid{});
  std::memcpy(network.bssid, bssid.octets, sizeof network.bssid);
}

// The value that a word stands for in one of the enumerations.
template <class Value>
Value ParseWord(Value (*parse)(const char*), std::string_view text) {
  char szWord[32];  // longer than any word of an enumeration
  CopyText(szWord, text);
  return parse(szWord);
}

// Takes one pair of the section into the record. Pairs with other keys belong to other programs, and are passed over.
void Take(const Pair& pair, WIRELESS_NETWORK_CONFIG& config) {
  const auto [key, value] = pair;
  WIRELESS_NETWORK& network = config.network;
  if (key == kKeySecret) return CopyText(config.szKey, value);
  if (key == kKeyAddress) return CopyText(config.szIp, value);
  if (key == kKeyMask) return CopyText(config.szMask, value);
  if (key == kKeyGateway) return CopyText(config.szGateway, value);
  if (key == kKeyEssid) return CopyText(network.szEssid, value);
  if (key == kKeyBssid) return TakeBssid(value, network);
  if (key == kKeyMode) network.opmode = ParseWord(ParseOpmode, value);
  if (key == kKeyAccessTime) config.atime = ParseTime(value);
  if (key == kKeyAuth) network.auth = ParseWord(MEROWirelessAuthParse, value);
  if (key == kKeyEncrypt) network.encrypt = ParseWord(MEROWirelessEncryptParse, value);
}

// Fills the record with the network that a section describes.
void Read(std::string_view text, const SectionPlace& place, WIRELESS_NETWORK_CONFIG& config) {
  config = {};
  config.network.opmode = WIRELESS_OPMODE_UNKNOWN;
  for (Lines lines = LinesOf(text, place); lines.Next();) {
    const std::optional<Pair> pair = PairOfLine(lines.text(), ValueForm::kPlain);
    if (pair) Take(*pair, config);
  }
}

}  // namespace

int MEROWirelessConfGet(const char* szSection, WIRELESS_NETWORK_CONFIG* pNetCfg) {
  if (szSection == nullptr || pNetCfg == nullptr) return REFUSE_NULL(), -1;
  if (const std::optional<std::string_view> section = SectionOfItem(szSection)) {
    Read(*section, {0, LineEnd(*section, 0), section->size()}, *pNetCfg);
    return 0;
  }

  Bytes text;
  if (ReadSettings(kKnownNetworksPath, text) <= 0) return -1;
  const std::optional<SectionPlace> place = FindSection(text.view(), szSection);
  if (!place) return PLIBCErrSet(ERR_SECTION_NOT_FOUND), -1;
  Read(text.view(), *place, *pNetCfg);
  return 0;
}
