// The supplicant's settings, which hold the network that the library joined last, with its secret.
#ifndef MERO_TOOLS_SUPPLICANT_SETTINGS_H
#define MERO_TOOLS_SUPPLICANT_SETTINGS_H

#include <optional>
#include <string_view>

#include "model/library.h"

// The network of a text, so that joining it makes the library write that text again. Its address is none. Nothing when
// the text is not of the library's form.
std::optional<KnownNetwork> ConfiguredNetwork(std::string_view text);

#endif  // MERO_TOOLS_SUPPLICANT_SETTINGS_H
