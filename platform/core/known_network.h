// Reading one known network.
#ifndef MERO_PLATFORM_KNOWN_NETWORK_H
#define MERO_PLATFORM_KNOWN_NETWORK_H

#include <cerrno>
#include <optional>
#include <string_view>

#include "platform.h"
#include "platform/base/result.h"
#include "platform/core/section_text.h"

inline constexpr int kNoSection = ENODATA;

// Fills the record with the network that a section of a text describes. kNoSection when there is no such section; the
// record stays as it was.
Status ReadKnownNetwork(std::string_view text, const std::optional<SectionPlace>& place,
                        WIRELESS_NETWORK_CONFIG& config);

#endif  // MERO_PLATFORM_KNOWN_NETWORK_H
