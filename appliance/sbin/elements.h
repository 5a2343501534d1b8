// Reads the beacons of access points and ad-hoc cells. No byte of them can be trusted: anyone may send them.
#ifndef MERO_APPLIANCE_ELEMENTS_H
#define MERO_APPLIANCE_ELEMENTS_H

#include "appliance/sbin/network.h"

namespace iwlist {

// The network of a beacon or probe response, from its information elements, its capability field and its frequency.
// The elements before a malformed one are used. WPA that cannot be read is unknown, never none or WEP.
Description Describe(Bytes elements, unsigned capability, unsigned megahertz);

}  // namespace iwlist

#endif  // MERO_APPLIANCE_ELEMENTS_H
