// The document that holds the known networks and the access point's settings, for `export` and `import`: docs/json.md
// describes it.
#ifndef MERO_TOOLS_SETTINGS_DOCUMENT_H
#define MERO_TOOLS_SETTINGS_DOCUMENT_H

#include <cstddef>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "model/ap_settings.h"
#include "model/library.h"
#include "model/network_extras.h"

enum class Secrets { kLeftOut, kIncluded };

// A document of these settings, in lines that end with one; those of an access point may be missing.
std::string DocumentOf(const std::vector<KnownNetwork>& networks, const std::optional<ApConf>& ap, Secrets secrets);

inline constexpr std::size_t kLongestDocument = 1 << 20;  // bytes

// A network of a document. One that has a secret and is not protected is as it was saved.
struct DocumentedNetwork {
  KnownNetwork network;  // `atime` is 0 where the document does not tell
  Extras extras;
};

// Those of the access point, by key, in the order of ApSettings().
using DocumentedAp = std::vector<std::pair<std::string, Value>>;

struct SettingsDocument {
  std::vector<DocumentedNetwork> networks;
  std::optional<DocumentedAp> ap;
};

// What a text holds. Fails, and names the place, when it is no such document, or holds what cannot be saved.
SettingsDocument DocumentIn(const std::string& text);

// Sets what a document has of the access point; the rest stays. Fails likewise.
void SetAp(ApConf& conf, const DocumentedAp& documented);

// The failure of something at a place of a document.
Failure WrongAt(const std::string& place, const Failure& why);
std::string PlaceOfNetwork(std::size_t index);

#endif  // MERO_TOOLS_SETTINGS_DOCUMENT_H
