// The document that holds the known networks and the access point's settings, for `export` and `import`: docs/json.md
// describes it.
#ifndef MERO_TOOLS_SETTINGS_DOCUMENT_H
#define MERO_TOOLS_SETTINGS_DOCUMENT_H

#include <optional>
#include <string>
#include <vector>

#include "model/ap_settings.h"
#include "model/library.h"

enum class Secrets { kLeftOut, kIncluded };

// A document of these settings, in lines that end with one; those of an access point may be missing.
std::string DocumentOf(const std::vector<KnownNetwork>& networks, const std::optional<ApConf>& ap, Secrets secrets);

#endif  // MERO_TOOLS_SETTINGS_DOCUMENT_H
