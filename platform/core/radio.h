// One interface's radio, asked and told through the kernel's wireless extensions.
#ifndef MERO_PLATFORM_RADIO_H
#define MERO_PLATFORM_RADIO_H

#include <net/if.h>

#include "common/descriptor.h"
#include "platform.h"
#include "platform/base/result.h"
#include "platform/core/radio_texts.h"

class Radio {
 public:
  Radio() = default;

  // ENODEV when no adapter is there.
  static Result<Radio> OfAdapter(const char* szIfName);

  Result<bool> IsUp() const;
  Result<WIRELESS_OPMODE> Mode() const;
  Status SetMode(WIRELESS_OPMODE mode) const;

  // The name of the current network; empty when there is none.
  Status Essid(char (&szEssid)[33]) const;

  // The address of the current access point, or of the ad-hoc cell; none when there is no connection.
  Result<std::optional<Bssid>> AccessPoint() const;

  // Leaves the current network or cell.
  Status Leave() const;

  // Whether the kernel knows of a network that the radio has heard, while the interface is up and does not scan.
  bool KnowsNetworks() const;

  // Has the radio scan for all networks in range; does not wait for it.
  Status Scan() const;

 private:
  Descriptor control_;
  char szIfName_[IFNAMSIZ] = {};
};

#endif  // MERO_PLATFORM_RADIO_H
