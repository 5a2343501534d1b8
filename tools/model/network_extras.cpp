// What the program keeps of a known network beside what the library reads.
#include "model/network_extras.h"

#include <memory>

#include "base/failure.h"
#include "base/text.h"
#include "common/paths.h"
#include "model/name_servers.h"

namespace {

using Section = std::unique_ptr<PLIBSZHASH, decltype(&PLIBCSzHashFree)>;

// Nothing without such a section; what cannot be read is reported by the platform.
Section SectionOf(const KnownNetwork& network) {
  constexpr int kSizeHint = 16;
  PPLIBSZHASH hash = PLIBCSzHashAlloc(kSizeHint);
  if (hash == nullptr) return {nullptr, PLIBCSzHashFree};
  const int found = PLIBCFileGetSection(kKnownNetworksPath, AddressText(network.network.bssid).c_str(), &hash);
  Section section(hash, PLIBCSzHashFree);
  if (found <= 0) section.reset();
  return section;
}

std::string ValueOf(const Section& section, const char* szKey) {
  const char* szValue = PLIBCSzHashGetValue(section.get(), szKey);
  return szValue != nullptr ? szValue : "";
}

std::string NameServersIn(const std::string& value) {
  try {
    return value.empty() ? value : CheckedNameServers(value);
  } catch (const Failure&) {
    return "";  // as if it were not there
  }
}

Extras ExtrasIn(const Section& section) {
  const int priority = ParseNumber(ValueOf(section, kKeyPriority)).value_or(0);
  return {.nameServers = NameServersIn(ValueOf(section, kKeyNameServers)),
          .priority = priority >= 0 && priority <= kGreatestPriority ? priority : 0,
          .autojoin = ValueOf(section, kKeyAutojoin) != "no"};
}

}  // namespace

Extras ExtrasOf(const KnownNetwork& network) {
  Section section = SectionOf(network);
  if (!section) {
    const auto known = FindCalled(network.network.szEssid);
    if (known) section = SectionOf(*known);
  }
  return section ? ExtrasIn(section) : Extras{};
}

void ApplyNameServers(const KnownNetwork& network) {
  SetNameServers(MEROWirelessInterfaceGet(), network.szIp[0] == '\0' ? "" : ExtrasOf(network).nameServers);
}

bool HasSection(const KnownNetwork& network) {
  return SectionOf(network) != nullptr;
}

void CopyExtras(const KnownNetwork& from, const KnownNetwork& to) {
  const Section section = SectionOf(from);
  if (!section) return;
  const std::string name = AddressText(to.network.bssid);
  for (const char* szKey : {kKeyNameServers, kKeyPriority, kKeyAutojoin}) {
    const char* szValue = PLIBCSzHashGetValue(section.get(), szKey);
    if (szValue == nullptr) continue;
    if (PLIBCFileSetSectionValue(kKnownNetworksPath, name.c_str(), szKey, szValue, kSectionLineFormat) >= 0) continue;
    throw Failed("the network is saved, but not with its name servers and order",
                 "look at it with `merowireless known --json`");
  }
}
