// The texts of the radio standards.
#ifndef MERO_COMMON_PROTOCOL_TEXTS_H
#define MERO_COMMON_PROTOCOL_TEXTS_H

#include "wireless.h"

inline constexpr WIRELESS_LITERAL_MAPPING kProtocolTexts[] = {
    {"unknown", {WIRELESS_PROTO_UNKNOWN}},      {"11b/g", {WIRELESS_PROTO_LEGACY_11BG}},
    {"11b", {WIRELESS_PROTO_LEGACY_11B}},       {"11a", {WIRELESS_PROTO_LEGACY_11A}},
    {"11a/b/g", {WIRELESS_PROTO_LEGACY_11ABG}}, {"11g", {WIRELESS_PROTO_LEGACY_11G}},
    {"11a/b/g/n", {WIRELESS_PROTO_11ABGN}},     {"11n", {WIRELESS_PROTO_11N}},
    {"11g/n", {WIRELESS_PROTO_11GN}},           {"11a/n", {WIRELESS_PROTO_11AN}},
    {"11b/g/n", {WIRELESS_PROTO_11BGN}},        {"11a/g/n", {WIRELESS_PROTO_11AGN}},
    {"11b/n", {WIRELESS_PROTO_11BN}},
};

#endif  // MERO_COMMON_PROTOCOL_TEXTS_H
