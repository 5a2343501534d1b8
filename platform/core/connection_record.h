// What the record of the last join says of the current connection.
#ifndef MERO_PLATFORM_CONNECTION_RECORD_H
#define MERO_PLATFORM_CONNECTION_RECORD_H

#include "platform.h"
#include "platform/base/result.h"
#include "platform/core/radio_texts.h"

struct ConnectionRecord {
  WIRELESS_PROTOCOL protocol = WIRELESS_PROTO_UNKNOWN;
  WIRELESS_AUTH auth = WIRELESS_AUTH_UNKNOWN;
};

// What was recorded about the connection to an access point; unknown values when the record is of another one, is
// missing or is malformed.
Result<ConnectionRecord> RecordOfConnectionTo(const Bssid& accessPoint);

#endif  // MERO_PLATFORM_CONNECTION_RECORD_H
