// The guest network, as the library configures it and the kernel shows it.
#ifndef MERO_COMMON_GUEST_NETWORK_H
#define MERO_COMMON_GUEST_NETWORK_H

// Its interface, a second one on the adapter's radio, and its bridge.
inline constexpr char kGuestInterface[] = "gwlan";
inline constexpr char kGuestBridge[] = "gbr";

#endif  // MERO_COMMON_GUEST_NETWORK_H
