// The text of a radio standard.
#include "common/protocol_texts.h"
#include "common/value_texts.h"
#include "wireless.h"

const char* MEROWirelessProtocolStringGet(const WIRELESS_PROTOCOL proto) {
  return TextOf(kProtocolTexts, proto);
}
