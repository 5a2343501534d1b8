// What is known about the connection at this moment.
#ifndef MERO_TOOLS_STATUS_H
#define MERO_TOOLS_STATUS_H

#include <span>
#include <string>

#include "model/link.h"
#include "model/radio_state.h"
#include "show/output.h"
#include "wireless.h"

struct Status {
  WIRELESS_STATUS state = WIRELESS_STATUS_UNKNOWN;
  std::string interface;
  std::string name;  // name, auth and protocol are those of the connection, if there is one
  WIRELESS_AUTH auth = WIRELESS_AUTH_UNKNOWN;
  WIRELESS_PROTOCOL protocol = WIRELESS_PROTO_UNKNOWN;
  WIRELESS_OPMODE mode = WIRELESS_OPMODE_UNKNOWN;
  std::string ip;  // also without a connection
  std::string mask;
  RadioState radio = RadioState::kUnknown;
  bool isAccessPoint = false;

  // Whether the network that it is connected to lets it in. The driver counts a station as connected that has not
  // passed the access point's protection yet, and with a wrong secret is so again and again.
  bool isLetIn = false;
  Link link;

  bool operator==(const Status&) const = default;
  bool isConnected() const {
    return state == WIRELESS_STATUS_CONNECTED_MANAGED || state == WIRELESS_STATUS_CONNECTED_ADHOC;
  }
};

Status ReadStatus();

std::span<const Field<Status>> StatusFields();

// A connection in a sentence: the network, and the address there.
std::string ConnectionText(const Output& output, const Status& status);

#endif  // MERO_TOOLS_STATUS_H
