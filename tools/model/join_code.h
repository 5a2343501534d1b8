// The text by which a phone joins a network.
#ifndef MERO_TOOLS_JOIN_CODE_H
#define MERO_TOOLS_JOIN_CODE_H

#include <string>

#include "model/ap_settings.h"
#include "model/library.h"

struct JoinCode {
  std::string name;          // of the network
  const char* szProtection;  // open, wep or wpa
  bool isHidden;
  std::string text;  // with the secret
};

// Fail when a phone cannot join such a network by a code; `shown` names it then.
JoinCode CodeOf(const KnownNetwork& network, bool isHidden, const std::string& shown);
JoinCode CodeOfAp(const ApConf& conf, const std::string& shown);
JoinCode CodeOfGuests(const ApConf& conf, const std::string& shown);

#endif  // MERO_TOOLS_JOIN_CODE_H
